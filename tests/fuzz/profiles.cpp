// Device files. What can be read is then the device and answers, and its text is changed by the assignments behind a line "%%".
#include "DeviceFile.h"
#include "Fuzz.h"

#include <DASystem.h>

#include <cstdlib>

using namespace kiv::fuzz;

namespace
{

void AskDevice(const kiv::platform::Device& device)
{
    DASystem& facade = *DASystem::GetInstance();
    std::vector<char*> texts(1);
    facade.GetDeviceName(&texts[0]);
    Require(texts[0] == nullptr ? !device.deviceName : texts[0] == device.deviceName, "a text is that of the file");
    Require(facade.IsFlightMode() == device.flightMode, "a switch is that of the file");
    int count = 0;
    facade.GetIMSIFromSim(&texts, &count);
    Require(texts.size() == 1U + static_cast<unsigned>(count) && texts.size() <= 1U + device.slots.size(),
        "a SIM has one IMSI at most");
    for (char* const text : texts)
        std::free(text);
    Require(kiv::platform::OpenHandles().empty() && kiv::platform::TakeMisuses().empty(), "each handle is closed once");
}

} // namespace

void Try(std::string_view input)
try
{
    Feed(1);
    const std::size_t mark = input.find("\n%%\n");
    const std::string text(input.substr(0, mark));
    const kiv::platform::Device device = kiv::platform::ReadDevice(text, "input");
    kiv::platform::SetDevice(device);
    AskDevice(device);
    if (mark != std::string_view::npos)
        kiv::platform::ReadDevice(kiv::platform::ChangeText(text, "input", Split(input.substr(mark + 4), '\n')), "input");
}
catch (const kiv::platform::DeviceFileError& trouble)
{
    Require(std::string_view(trouble.what()).rfind("input: ", 0) == 0, "trouble names the file");
}
