#include "RunService.h"

#include "StandardOutput.h"
#include "StopSignals.h"

#include <cstdio>
#include <exception>

namespace kiv
{
namespace
{

int Fail(const char* text)
{
    std::fprintf(stderr, "%s: %s\n", g_get_prgname(), text);
    return 1;
}

} // namespace

int RunService(int argc, char** argv, const char* summary, const GOptionEntry* options,
    const std::function<std::unique_ptr<BusParty>()>& start) noexcept
try
{
    g_autoptr(GOptionContext) context = g_option_context_new(nullptr);
    g_option_context_set_summary(context, summary);
    if (options)
        g_option_context_add_main_entries(context, options, nullptr);
    g_autoptr(GError) error = nullptr;
    if (!g_option_context_parse(context, &argc, &argv, &error))
        return Fail(error->message);
    if (argc > 1)
        return Fail("unexpected argument; --help lists the options");

    const std::unique_ptr<BusParty> service = start(); // until then a signal ends the process: a bus may never answer
    StopSignals signals;
    StandardOutput::Write("ready bus_names=" + service->Name() + '\n'); // the same line as kivctl services prints
    const bool wasStopped = signals.IterateWhile([&service] { return service->IsConnected() && service->GoOn(); });
    StandardOutput::EndStream();
    if (StandardOutput::Error() != 0)
        return Fail((std::string("cannot write to standard output: ") + g_strerror(StandardOutput::Error())).c_str());
    if (!wasStopped && !service->IsConnected())
        return Fail("the connection to the bus was lost");
    return 0;
}
catch (const std::exception& failure)
{
    return Fail(failure.what());
}

} // namespace kiv
