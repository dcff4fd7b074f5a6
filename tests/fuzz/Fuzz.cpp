#include "Fuzz.h"

#include <LogControl.h>

#include <glib.h>

#include <algorithm>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <sstream>

void kiv::fuzz::Require(bool isTrue, const char* what)
{
    if (isTrue)
        return;
    std::fprintf(stderr, "not true: %s\n", what);
    std::abort();
}

std::vector<std::string> kiv::fuzz::Split(std::string_view text, char separator, std::size_t least)
{
    std::vector<std::string> pieces;
    std::istringstream in{std::string(text)};
    for (std::string piece; std::getline(in, piece, separator);)
        pieces.push_back(piece);
    pieces.resize(std::max(pieces.size(), least));
    return pieces;
}

extern "C" int LLVMFuzzerInitialize(int*, char***)
{
    g_log_set_always_fatal(static_cast<GLogLevelFlags>(G_LOG_LEVEL_ERROR | G_LOG_LEVEL_CRITICAL | G_LOG_LEVEL_WARNING));
    std::signal(SIGTRAP, [](int) { std::abort(); }); // GLib ends the process with SIGTRAP; libFuzzer keeps the input after SIGABRT
    kiv::platform::SetLogSink([](const auto&) {});   // every line is formatted
    return std::atexit([] { std::fprintf(stderr, "fed %zu\n", kiv::fuzz::fed); });
}

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size)
{
    Try({reinterpret_cast<const char*>(data), size});
    return 0;
}
