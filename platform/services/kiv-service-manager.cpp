#include "RunService.h"
#include "ServiceManager.h"

#include <cstdio>

int main(int argc, char** argv)
{
    return kiv::RunService(argc, argv, "Takes the agent's events on the system bus and prints them, one a line.", nullptr,
        []
        {
            return std::make_unique<kiv::ServiceManager>(
                [](const kiv::BusCall& call)
                {
                    std::puts(call.Line().c_str());
                    std::fflush(stdout);
                });
        });
}
