#include "BoardDaemon.h"
#include "RunService.h"

int main(int argc, char** argv)
{
    g_autofree char* serial = nullptr;
    const GOptionEntry options[] = {
        {"serial", 's', 0, G_OPTION_ARG_STRING, &serial, "The board's serial number; that of the device in use without it", "TEXT"},
        {}};
    return kiv::RunService(argc, argv, "Tells the board's serial number on the system bus.", options,
        [&serial] { return std::make_unique<kiv::BoardDaemon>(serial ? serial : kiv::BoardDaemon::DeviceSerial()); });
}
