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
        throw std::runtime_error(json + ": cannot be written");
    return table.IsMet();
}

int Run(int argc, char** argv)
{
    g_autofree char *only = nullptr, *json = nullptr;
    gboolean isService = FALSE, isGrowth = FALSE;
    const GOptionEntry entries[] = {
        {"only", 0, 0, G_OPTION_ARG_STRING, &only, "Measure only the items whose text contains this", "TEXT"},
        {"json", 0, 0, G_OPTION_ARG_FILENAME, &json, "Also write the table to a file", "FILE"},
        {kServe + 2, 0, G_OPTION_FLAG_HIDDEN, G_OPTION_ARG_NONE, &isService, nullptr, nullptr},
        {kGrowth + 2, 0, G_OPTION_FLAG_HIDDEN, G_OPTION_ARG_NONE, &isGrowth, nullptr, nullptr},
        {},
    };
    g_autoptr(GOptionContext) options = g_option_context_new(nullptr);
    g_option_context_set_summary(
        options, "Measure the cost of the library as ratios to the same work without it, and compare them with the goals.");
    g_option_context_set_description(options, "Exit codes: 0 all goals met, 1 a goal missed, 2 failure.");
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
