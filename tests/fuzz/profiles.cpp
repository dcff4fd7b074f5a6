// Device files. A valid file becomes the device and answers calls. Assignments after a line "%%" change its text.
#include "DeviceFile.h"
#include "Fuzz.h"

#include <DASystem.h>
#include <SourceControl.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>

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

/// Calls a device with faults, except for faults of functions that release something, which nothing else could release.
void AskBrokenDevice(kiv::platform::Device device)
{
    const auto isRelease = [](const kiv::platform::BrokenCall& fault)
    { return std::strstr(kiv::platform::NameOf(fault.call), "de") != nullptr; };
    device.faults.erase(std::remove_if(device.faults.begin(), device.faults.end(), isRelease), device.faults.end());
    kiv::platform::SetDevice(device);
    DASystem& facade = *DASystem::GetInstance();
    char* text = nullptr;
    facade.GetIMSIFromSim(&text);
    std::free(text);
    facade.IsNetworkConnected(true, true);
    Require(kiv::platform::OpenHandles().empty() && kiv::platform::TakeMisuses().empty(), "what fails is not left open");
    for (const kiv::platform::BrokenCall& fault : kiv::platform::GetDevice().faults)
        Require(fault.code != 0, "a fault has a code");
}

/// The device's own listing makes the same device.
void AskForValues(const kiv::platform::Device& device)
{
    std::vector<std::string> assignments;
    for (const kiv::platform::FieldValue& value : kiv::platform::ListValues())
    {
        if (value.value)
            assignments.push_back(value.key + "=" + *value.value);
    }
    const std::string text = kiv::platform::ChangeText("", "input", assignments);
    const kiv::platform::Device again = kiv::platform::ReadDevice(text, "input");
    Require(again.slots.size() == device.slots.size() && again.packages == device.packages, "every slot and package is shown");
    Require(again.cellularState == device.cellularState && again.defaultData == device.defaultData, "a word is its number");
    for (std::size_t slot = 0; slot < again.slots.size(); ++slot)
        Require(again.slots[slot].cardStatus == device.slots[slot].cardStatus, "a card is shown read by read");
}

} // namespace

void Try(std::string_view input)
try
{
    Feed(1);
    const std::size_t mark = input.find("\n%%\n");
    const std::string text(input.substr(0, mark));
    kiv::platform::Device device = kiv::platform::ReadDevice(text, "input");
    AskBrokenDevice(device);
    device.faults.clear();
    kiv::platform::SetDevice(device);
    AskDevice(device);
    AskForValues(device);
    if (mark != std::string_view::npos)
        kiv::platform::ReadDevice(kiv::platform::ChangeText(text, "input", Split(input.substr(mark + 4), '\n')), "input");
}
catch (const kiv::platform::DeviceFileError& trouble)
{
    Require(std::string_view(trouble.what()).rfind("input: ", 0) == 0, "trouble names the file");
}
