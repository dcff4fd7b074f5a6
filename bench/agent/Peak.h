#ifndef KIV_BENCH_PEAK_H
#define KIV_BENCH_PEAK_H

#include <cstdio>
#include <cstring>
#include <fstream>
#include <string>

namespace kiv::bench
{

/// Prints the peak resident memory of this process in KiB. The kernel records it per address space, so unlike in getrusage(), the
/// parent's memory does not count.
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
