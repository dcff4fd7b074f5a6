#include "Fuzz.h"

#include <SimulatedLog.h>

#include <glib.h>

#include <cstdio>
#include <cstdlib>

namespace
{

std::size_t fed = 0;

} // namespace

void kiv::fuzz::Require(bool isTrue, const char* what)
{
    if (isTrue)
        return;
    std::fprintf(stderr, "does not hold: %s\n", what);
    std::abort();
}

void kiv::fuzz::Feed(std::size_t records)
{
    fed += records;
}

std::vector<std::string> kiv::fuzz::Split(std::string_view text, char separator)
{
    std::vector<std::string> pieces;
    for (std::size_t end = 0; end != std::string_view::npos; text.remove_prefix(end == std::string_view::npos ? 0 : end + 1))
    {
        end = text.find(separator);
        pieces.emplace_back(text.substr(0, end));
    }
    return pieces;
}

void kiv::fuzz::FormatLog()
{
    sim::SetLogSink([](const sim::LogLine&) {});
}

extern "C" int LLVMFuzzerInitialize(int*, char***)
{
    g_log_set_always_fatal(static_cast<GLogLevelFlags>(G_LOG_LEVEL_ERROR | G_LOG_LEVEL_CRITICAL | G_LOG_LEVEL_WARNING));
    return std::atexit([] { std::fprintf(stderr, "fed %zu\n", fed); });
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    Try({reinterpret_cast<const char*>(data), size});
    return 0;
}
