#include "Progress.h"

#include "Layout.h"

#include <Visible.h>

#include <unistd.h>

#include <cstdio>

void Progress::Show(const std::string& text) const
{
    static const bool isTerminal = isatty(STDERR_FILENO) == 1;
    if (isTerminal)
        std::fprintf(stderr, "\r\033[K%s", Wrapped(kiv::platform::Visible(text), TerminalWidth(STDERR_FILENO)).front().c_str());
}
