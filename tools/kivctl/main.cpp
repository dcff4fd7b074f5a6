#include "CommandLine.h"

#include <BusParty.h>
#include <SimulatedDevice.h>

#include <exception>

namespace
{

/// The profile of the command line takes the place of the environment's; either has to be in order.
void PrepareDevice(const Command& command)
{
    const std::string trouble = command.profile.empty() ? kiv::sim::DeviceTrouble() : kiv::sim::UseProfile(command.profile);
    if (!trouble.empty())
        throw Failure(Exit::BadDevice, trouble);
}

Exit Run(int argc, char** argv)
{
    Command command;
    const Exit read = ReadCommandLine(argc, argv, command);
    if (!command.verb || read != Exit::Done)
        return read;
    if (command.deviceUse == DeviceUse::Asks)
        PrepareDevice(command);
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
