// A language setting, compared with codes written independently of the library's.
#include "Fuzz.h"
#include "support/Texts.h"

#include <DASystem.h>
#include <DeviceControl.h>

using namespace kiv::fuzz;
using namespace kiv::test;

void Try(std::string_view input)
{
    static const Column isoCodes = Find(Read("language.tsv"), 1, 0);
    const std::string setting = std::string(input).c_str(); // the platform's texts end at a null
    kiv::platform::ChangeDevice([&](auto& device) { device.language = setting; });

    g_autofree char* language = g_ascii_strup(setting.c_str(), static_cast<gssize>(setting.find('_')));
    const auto listed = isoCodes.find(language);
    DASystem& facade = *DASystem::GetInstance();
    const std::string plain = Out([&](char** out) { facade.GetDeviceLanguageCode(out, false); });
    const std::string iso = Out([&](char** out) { facade.GetDeviceLanguageCode(out, true); });
    Require(plain == language, "the code is the part before the underscore");
    Require(iso == (listed == isoCodes.end() ? "untouched" : listed->second), "the ISO code is the listed one");
    Feed(1);
}
