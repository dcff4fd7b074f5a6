#include "BoardDaemon.h"
#include "RunService.h"

int main(int argc, char** argv)
{
    g_autofree char* serial = nullptr;
    const GOptionEntry options[] = {
        {"serial", 's', 0, G_OPTION_ARG_STRING, &serial, "Serial number to return (default: that of the device in use)", "TEXT"},
        {}};
    return kiv::RunService(argc, argv, "Return the board's serial number on the system bus.", options,
        [&serial] { return std::make_unique<kiv::BoardDaemon>(serial ? serial : kiv::BoardDaemon::DeviceSerial()); });
}
