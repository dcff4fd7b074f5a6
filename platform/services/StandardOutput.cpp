#include "StandardOutput.h"

#include <atomic>
#include <cerrno>
#include <cstdio>

namespace kiv::StandardOutput
{
namespace
{

std::atomic<int> firstError{0};

} // namespace

void Write(const std::string& text)
{
    int none = 0;
    if (std::fputs(text.c_str(), stdout) < 0 || std::fflush(stdout) != 0)
        firstError.compare_exchange_strong(none, errno);
}

int Error()
{
    return firstError;
}

void EndStream()
{
    int readerGone = EPIPE;
    firstError.compare_exchange_strong(readerGone, 0);
}

} // namespace kiv::StandardOutput
