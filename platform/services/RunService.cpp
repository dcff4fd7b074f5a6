#include "RunService.h"

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
        return Fail("takes no arguments but its options; --help lists them");

    StopSignals signals;
    const std::unique_ptr<BusParty> service = start();
    std::printf("ready bus_names=%s\n", service->Name().c_str()); // the same line as kivctl services prints
    std::fflush(stdout);
    if (signals.IterateWhile([&service] { return service->IsConnected() && service->GoOn(); }) || service->IsConnected())
        return 0;
    return Fail("the bus went away");
}
catch (const std::exception& failure)
{
    return Fail(failure.what());
}

} // namespace kiv
