#include "RunService.h"
#include "ServiceManager.h"
#include "StandardOutput.h"

int main(int argc, char** argv)
{
    return kiv::RunService(argc, argv, "Receive the agent's events on the system bus and print one per line.", nullptr,
        []
        {
            return std::make_unique<kiv::ServiceManager>(
                [](const kiv::BusCall& call) { kiv::StandardOutput::Write(call.Line() + '\n'); });
        });
}
