#include "Items.h"
#include "PrivateSystemBus.h"
#include "Ratios.h"

#include <cstring>

int main(int argc, char** argv)
{
    using namespace kiv::bench;
    if (argc == 2 && std::strcmp(argv[1], kServe) == 0)
        return Serve();

    const PrivateSystemBus bus("/proc/self/exe");
    AddLookups();
    AddSimQueries();
    AddDeviceQueries();
    AddNotifications();
    AddPushes();
    return RunAll(argc, argv) ? 0 : 1;
}
