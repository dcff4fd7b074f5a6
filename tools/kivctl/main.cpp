#include "CommandLine.h"

#include <BusParty.h>

#include <exception>

namespace
{

Exit Run(int argc, char** argv)
{
    Command command;
    ReadCommandLine(argc, argv, command);
    if (!command.verb) // --help and --version did it all
        return Exit::Done;
    if (command.deviceUse == DeviceUse::Asks)
        RequireDevice(command);
    return command.verb();
}

Exit Report(Exit exit, const char* text)
{
    Note(text);
    return exit;
}

} // namespace

int main(int argc, char** argv)
{
    Exit exit = Exit::No;
    try
    {
        exit = Run(argc, argv);
    }
    catch (const Failure& failure)
    {
        exit = Report(failure.exit, failure.what());
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
