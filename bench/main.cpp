#include "Items.h"
#include "PrivateSystemBus.h"

#include <gio/gio.h>

#include <cstdio>
#include <exception>

namespace
{

using namespace kiv::bench;

/// @return whether no goal was missed
bool MeasureAll(const std::string& only, const std::string& json)
{
    Table table(only);
    MeasureLookups(table);
    MeasureSimQueries(table);
    MeasureDeviceQueries(table);
    MeasureStore(table);
    {
        const PrivateSystemBus bus;
        MeasureNotifications(table, bus);
        MeasurePushes(table, bus);
        MeasureMemory(table);
    }
    if (!json.empty() && !table.WriteJson(json))
        throw std::runtime_error(json + ": can not be written");
    return table.IsMet();
}

int Run(int argc, char** argv)
{
    g_autofree char *only = nullptr, *json = nullptr;
    gboolean isService = FALSE, isGrowth = FALSE;
    const GOptionEntry entries[] = {
        {"only", 0, 0, G_OPTION_ARG_STRING, &only, "Only the items whose text holds this", "TEXT"},
        {"json", 0, 0, G_OPTION_ARG_FILENAME, &json, "Writes the table to a file, too", "FILE"},
        {kServe + 2, 0, G_OPTION_FLAG_HIDDEN, G_OPTION_ARG_NONE, &isService, nullptr, nullptr},
        {kGrowth + 2, 0, G_OPTION_FLAG_HIDDEN, G_OPTION_ARG_NONE, &isGrowth, nullptr, nullptr},
        {},
    };
    g_autoptr(GOptionContext) options = g_option_context_new(nullptr);
    g_option_context_set_summary(
        options, "Measures what the library costs, as ratios to the same done without it, and against its goals.");
    g_option_context_set_description(options, "Exit codes: 0 every goal met, 1 one missed, 2 trouble.");
    g_option_context_add_main_entries(options, entries, nullptr);
    g_autoptr(GError) error = nullptr;
    if (!g_option_context_parse(options, &argc, &argv, &error))
        throw std::runtime_error(error->message);
    if (argc > 1)
        throw std::runtime_error(std::string(argv[1]) + ": one word too many");
    if (isService)
        return Serve();
    if (isGrowth)
        return PrintGrowth();
    return MeasureAll(only == nullptr ? "" : only, json == nullptr ? "" : json) ? 0 : 1;
}

} // namespace

int main(int argc, char** argv)
{
    try
    {
        return Run(argc, argv);
    }
    catch (const std::exception& trouble)
    {
        std::fprintf(stderr, "kiv_bench: %s\n", trouble.what());
        return 2;
    }
}
