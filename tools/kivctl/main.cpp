#include "CommandLine.h"

#include <BusParty.h>
#include <StandardOutput.h>
#include <glib.h>

#include <cerrno>
#include <csignal>
#include <exception>

namespace
{

Exit Run(int argc, char** argv)
{
    Command command;
    ReadCommandLine(argc, argv, command);
    if (!command.verb) // after --help and --version
        return Exit::Done;
    if (command.deviceUse == DeviceUse::Asks)
        RequireDevice(command);
    return command.verb();
}

/// The exit code, once all output is written. A closed pipe ends the process as it does without GLib, which ignores the signal.
/// @param onClosedPipe  the handler of that signal when the process began
Exit Finish(Exit exit, void (*onClosedPipe)(int))
{
    const int error = kiv::StandardOutput::Error();
    if (error == 0)
        return exit;
    std::signal(SIGPIPE, onClosedPipe);
    if (error == EPIPE)
        std::raise(SIGPIPE);
    throw Failure(Exit::NotWritten, std::string("cannot write to standard output: ") + g_strerror(error));
}

Exit Report(Exit exit, const char* text, const std::vector<std::string>& details = {})
{
    Note(text, details);
    return exit;
}

} // namespace

int main(int argc, char** argv)
{
    Exit exit = Exit::No;
    const auto onClosedPipe = std::signal(SIGPIPE, SIG_DFL);
    std::signal(SIGPIPE, onClosedPipe);
    try
    {
        exit = Finish(Run(argc, argv), onClosedPipe);
    }
    catch (const Failure& failure)
    {
        exit = Report(failure.exit, failure.what(), failure.details);
    }
    catch (const kiv::BusError& error)
    {
        exit = Report(error.reason == kiv::BusError::Reason::NoBus ? Exit::NoBus : Exit::No, error.what());
    }
    catch (const std::exception& error)
    {
        exit = Report(Exit::No, error.what());
    }
    return static_cast<int>(exit);
}
