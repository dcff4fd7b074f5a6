#include "Items.h"
#include "PrivateSystemBus.h"

#include <CLI/CLI.hpp>

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
    CLI::App options("Measures what the library costs, as ratios to the same done without it, and against its goals.");
    options.footer("Exit codes: 0 every goal met, 1 one missed, 2 trouble.");
    std::string only, json;
    bool isService = false, isGrowth = false;
    options.add_option("--only", only, "Only the items whose text holds this")->type_name("TEXT");
    options.add_option("--json", json, "Writes the table to a file, too")->type_name("FILE");
    options.add_flag(kServe, isService)->group("");
    options.add_flag(kGrowth, isGrowth)->group("");
    CLI11_PARSE(options, argc, argv);
    if (isService)
        return Serve();
    if (isGrowth)
        return PrintGrowth();
    return MeasureAll(only, json) ? 0 : 1;
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
