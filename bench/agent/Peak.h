#ifndef KIV_BENCH_PEAK_H
#define KIV_BENCH_PEAK_H

#include <cstdio>
#include <cstring>
#include <fstream>
#include <string>

namespace kiv::bench
{

/// Prints the most memory that this process ever had resident, in KiB. The kernel keeps it by address space, so it is that of the
/// program alone, unlike getrusage(), where the parent's counts as well.
inline void PrintPeak()
{
    std::ifstream status("/proc/self/status");
    for (std::string line; std::getline(status, line);)
    {
        if (line.rfind("VmHWM:", 0) == 0)
            std::puts(line.c_str() + std::strlen("VmHWM:"));
    }
}

} // namespace kiv::bench

#endif
