#include "Bus.h"
#include "CallRecord.h"
#include "Verbs.h"

#include <BoardDaemon.h>
#include <ServiceManager.h>
#include <StandardOutput.h>
#include <StopSignals.h>

Exit RunServices(const ServicesOptions& options, const Command& command)
{
    RequireBus();
    kiv::StopSignals signals;
    const kiv::BoardDaemon board(options.serial.empty() ? kiv::BoardDaemon::DeviceSerial() : options.serial);
    const kiv::ServiceManager manager([form = command.form](const kiv::BusCall& call) { PrintLine(CallRecord(call), form); });
    PrintLine({{"event", "ready"}, {"bus_names", std::vector{board.Name(), manager.Name()}}}, command.form);
    const bool wasStopped = signals.IterateWhile([&] { return board.IsConnected() && manager.IsConnected(); });
    kiv::StandardOutput::EndStream();
    if (wasStopped)
        return Exit::Done;
    throw Failure(Exit::NoBus, "the connection to the bus was lost");
}
