#include "BareBus.h"
#include "Items.h"
#include "PrivateSystemBus.h"
#include "Ratios.h"

#include <DADBusManager.h>
#include <DASystem.h>

#include <dlfcn.h>
#include <link.h>
#include <malloc.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <sstream>

namespace kiv::bench
{

namespace
{

/// Runs a program to its end, pinned like this one.
/// @return its output
std::string OutputOf(const std::vector<const char*>& command)
{
    std::vector<const char*> arguments = command;
    arguments.push_back(nullptr);
    const std::unique_ptr<GSubprocessLauncher, Unref> launcher(g_subprocess_launcher_new(G_SUBPROCESS_FLAGS_STDOUT_PIPE));
    // The allocator's per-thread cache would look like growth. It can only be switched off from outside the process.
    g_subprocess_launcher_setenv(launcher.get(), "GLIBC_TUNABLES", "glibc.malloc.tcache_count=0", TRUE);
    g_autoptr(GError) error = nullptr;
    const std::unique_ptr<GSubprocess, Unref> program(g_subprocess_launcher_spawnv(launcher.get(), arguments.data(), &error));
    g_autofree char* output = nullptr;
    if (program == nullptr || g_subprocess_communicate_utf8(program.get(), nullptr, nullptr, &output, nullptr, &error) == FALSE)
        throw std::runtime_error(error->message);
    if (g_subprocess_get_successful(program.get()) == FALSE)
        throw std::runtime_error(std::string(command[0]) + " fails");
    return output;
}

// Growth -----------------------------------------------------------------------------------------------------------------------

struct Operation
{
    const char* name;
    void (*call)(DASystem& system);
};

constexpr Operation kOperations[] = {
    {"GetIMSIFromSim",
        [](DASystem& system)
        {
            std::vector<char*> imsis;
            int count = 0;
            system.GetIMSIFromSim(&imsis, &count);
            std::for_each(imsis.begin(), imsis.end(), std::free);
        }},
    {"GetCountryNameFromMcc",
        [](DASystem& system)
        {
            char* name = nullptr;
            system.GetCountryNameFromMcc("450", &name);
            std::free(name);
        }},
    {"GetDeviceLanguageCode",
        [](DASystem& system)
        {
            char* code = nullptr;
            system.GetDeviceLanguageCode(&code, true);
            std::free(code);
        }},
    {"IsNetworkConnected", [](DASystem& system) { system.IsNetworkConnected(true, true); }},
    {"GetDeviceUniqueID",
        [](DASystem& system)
        {
            const char* id = nullptr;
            system.GetDeviceUniqueID(&id);
            g_free(const_cast<char*>(id));
        }},
    {"SendNotiToServiceManager", [](DASystem& system)
        { system.SendNotiToServiceManager(KIV_NOTI_TYPE_STATUS_ON, kImsi, 1, nullptr, nullptr, nullptr, nullptr); }},
    {"DeliverPushMessage", [](DASystem&) { PushByLibrary("1", 1); }}, // needs the main context
};

double GrowthOf(const Operation& operation)
{
    constexpr int kFirst = 200, kCalls = 5000; // the first calls make what stays: the connection, GLib's types
    std::size_t before = 0;
    for (int i = -kFirst; i < kCalls; ++i)
    {
        if (i == 0)
            before = mallinfo2().uordblks;
        operation.call(*DASystem::GetInstance());
    }
    return (static_cast<double>(mallinfo2().uordblks) - static_cast<double>(before)) / kCalls;
}

void MeasureGrowth(Table& table)
{
    const std::string item = "memory growth per call, without a main loop";
    if (!table.Wants(item))
        return;
    std::istringstream output(OutputOf({"/proc/self/exe", kGrowth}));
    double bytes = 0;
    std::string worst;
    output >> bytes >> worst;
    table.Add({item, "< 64 B", bytes < 64 ? Outcome::Met : Outcome::Missed, bytes, bytes, bytes, " B", "highest: " + worst});
}

// Size, pages and peak ---------------------------------------------------------------------------------------------------------

struct Limit
{
    const char* item;
    double most;
    const char* unit;
};

void AddMeasured(Table& table, const Limit& limit, double measured)
{
    std::ostringstream goal;
    goal << "<= " << limit.most << limit.unit;
    const Outcome outcome = measured <= limit.most ? Outcome::Met : Outcome::Missed;
    table.Add({limit.item, goal.str(), outcome, measured, measured, measured, limit.unit});
}

double StrippedKib(const char* library)
{
    const TemporaryFolder folder;
    const std::string stripped = folder.File("stripped.so");
    OutputOf({"strip", "-o", stripped.c_str(), library});
    return static_cast<double>(std::filesystem::file_size(stripped)) / 1024;
}

/// Returns the number of relative relocations from the dynamic section: words that the loader has to fill in with an address.
double RelativeRelocations(const link_map& library)
{
    double count = 0;
    for (const ElfW(Dyn)* entry = library.l_ld; entry->d_tag != DT_NULL; ++entry)
    {
        if (entry->d_tag == DT_RELACOUNT || entry->d_tag == DT_RELCOUNT)
            count += static_cast<double>(entry->d_un.d_val);
    }
    return count;
}

/// Returns the kernel's count of a file's memory that this process wrote to, in KiB.
double PrivateDirtyKib(const std::string& file)
{
    std::ifstream maps("/proc/self/smaps");
    double sum = 0;
    bool isOfFile = false;
    for (std::string line; std::getline(maps, line);)
    {
        std::istringstream fields(line);
        std::string name;
        double kib = 0;
        fields >> name >> kib;
        if (name.back() != ':') // the first line of a mapping, which ends with its file
            isOfFile = line.size() > file.size() && line.compare(line.size() - file.size(), file.size(), file) == 0;
        else if (isOfFile && name == "Private_Dirty:")
            sum += kib;
    }
    return sum;
}

void MeasureLibrary(Table& table)
{
    constexpr Limit kSize{"libkiv_system.so, stripped", 130, " KiB"};
    constexpr Limit kRelocations{"libkiv_system.so, relative relocations", 300, ""};
    constexpr Limit kPages{"libkiv_system.so, private memory after a lookup", 12, " KiB"};

    Dl_info library{};
    void* map = nullptr;
    dladdr1(reinterpret_cast<void*>(&DASystem::GetInstance), &library, &map, RTLD_DL_LINKMAP);
    if (table.Wants(kSize.item))
        AddMeasured(table, kSize, StrippedKib(library.dli_fname));
    if (table.Wants(kRelocations.item))
        AddMeasured(table, kRelocations, RelativeRelocations(*static_cast<const link_map*>(map)));
    if (table.Wants(kPages.item))
    {
        DASystem::GetInstance()->IsMoSupportMcc("450");
        AddMeasured(table, kPages, PrivateDirtyKib(std::filesystem::canonical(library.dli_fname)));
    }
}

double PeakOf(const char* program)
{
    const std::filesystem::path folder = std::filesystem::read_symlink("/proc/self/exe").parent_path();
    return std::stod(OutputOf({(folder / program).c_str()}));
}

void MeasurePeak(Table& table, const std::string& item, const char* bareProgram)
{
    if (!table.Wants(item))
        return;
    std::vector<double> agents, bares, ratios;
    for (int i = 0; i < kRounds; ++i)
    {
        agents.push_back(PeakOf("kiv_bench_agent"));
        bares.push_back(PeakOf(bareProgram));
        ratios.push_back(agents.back() / bares.back());
    }
    const double ratio = Quantile(ratios, 2);
    std::ostringstream remark;
    remark << Quantile(agents, 2) << " KiB to " << Quantile(bares, 2) << " KiB";
    table.Add({item, "<= 1.05", ratio <= 1.05 ? Outcome::Met : Outcome::Missed, ratio, Quantile(ratios, 1), Quantile(ratios, 3), {},
        remark.str()});
}

} // namespace

int PrintGrowth()
{
    std::pair<double, const char*> worst{-1, "none"};
    for (const Operation& operation : kOperations)
        worst = std::max(worst, {GrowthOf(operation), operation.name});
    std::printf("%.1f %s\n", worst.first, worst.second);
    return 0;
}

void MeasureMemory(Table& table)
{
    Subscribe("status", 1);
    Subscribe("push", 1);
    MeasureGrowth(table);
    MeasureLibrary(table);
    MeasurePeak(table, "peak memory, agent against the bare GDBus program", "kiv_bench_bare");
    MeasurePeak(table, "peak memory, against GDBus, store and platform", "kiv_bench_bare_store");
}

} // namespace kiv::bench
