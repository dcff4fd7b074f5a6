#include "Report.h"

#include "Visible.h"

#include <cerrno>
#include <cstdio>

namespace kiv::platform
{

void Report(const std::string& text)
{
    const std::string line = std::string(program_invocation_short_name) + ": " + Visible(text) + "\n";
    std::fputs(line.c_str(), stderr);
}

} // namespace kiv::platform
