// Device files. What can be read is then the device and answers, and its text is changed by the assignments behind a line "%%".
#include "DeviceFile.h"
#include "Fuzz.h"

#include <DASystem.h>

#include <cstdlib>

using namespace kiv::fuzz;

namespace
{

DASystem& facade = *DASystem::GetInstance();

void ExpectText(const kiv::sim::Text& expected, int (DASystem::*ask)(char**))
{
    char* text = nullptr;
    const int code = (facade.*ask)(&text);
    Require(expected ? code == 0 && *expected == text : code != 0 && text == nullptr, "a text is that of the file");
    std::free(text);
}

void AskDevice(const kiv::sim::Device& device)
{
    ExpectText(device.tizenId, &DASystem::GetTizenIdN);
    ExpectText(device.modelName, &DASystem::GetModelName);
    ExpectText(device.deviceName, &DASystem::GetDeviceName);
    Require(facade.IsFlightMode() == device.flightMode, "a switch is that of the file");
    for (const auto& [id, version] : device.packages)
        Require(facade.IsPackageInstalled(const_cast<char*>(id.c_str())) != id.empty(), "a package is installed");
    tm now{};
    facade.GetCurrentTime(&now);
    facade.IsSystemMemoryAvailable(1);

    char* text = nullptr;
    Require(facade.GetIMEI(&text) == 0 && text != nullptr, "there is an IMEI always");
    std::free(text);
    std::vector<char*> texts;
    int count = 0;
    facade.GetIMSIFromSim(&texts, &count);
    Require(texts.size() == static_cast<unsigned>(count) && texts.size() <= device.slots.size(), "a SIM has one IMSI at most");
    for (char* const imsi : texts)
        std::free(imsi);
    facade.IsDualSimAvailable();
    for (int slot = -1; slot <= static_cast<int>(device.slots.size()); ++slot)
    {
        TelSimCardStatus_t status{};
        int serviceType = 0;
        bool isRoaming = false;
        facade.IsAvaliableSendSMS(slot, &status, &serviceType);
        facade.GetRoamingStatus(slot, &isRoaming);
    }
    Require(kiv::sim::OpenHandles().empty() && kiv::sim::TakeMisuses().empty(), "each handle is closed once");
}

} // namespace

void Try(std::string_view input)
try
{
    Feed(1);
    const std::size_t mark = input.find("\n%%\n");
    const std::string text(input.substr(0, mark));
    const kiv::sim::Device device = kiv::sim::ReadDevice(text, "input");
    kiv::sim::SetDevice(device);
    AskDevice(device);
    if (mark != std::string_view::npos)
        kiv::sim::ReadDevice(kiv::sim::ChangeText(text, "input", Split(input.substr(mark + 4), '\n')), "input");
}
catch (const kiv::sim::DeviceFileError& trouble)
{
    Require(std::string_view(trouble.what()).rfind("input: ", 0) == 0, "trouble names the file");
}
