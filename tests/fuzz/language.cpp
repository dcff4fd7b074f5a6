// A language setting, a tag, and two positions, a line each, against what the standard library makes of them.
#include "Fuzz.h"

#include <DASystem.h>
#include <SimulatedDevice.h>

#include <cstdlib>
#include <stdexcept>

using namespace kiv::fuzz;

namespace
{

DASystem& facade = *DASystem::GetInstance();

std::string Code(bool isISO639)
{
    char* out = nullptr;
    Require(facade.GetDeviceLanguageCode(&out, isISO639) == 0, "the setting can be read");
    const std::string code = out == nullptr ? "(none)" : out;
    std::free(out);
    return code;
}

void TryPart(const std::string& source, int start, int end)
try
{
    const std::string part = facade.GetValueFromPosition(source, start, end);
    Require(
        part == source.substr(static_cast<unsigned>(start), static_cast<std::size_t>(end - std::int64_t{start} + 1)), "the part");
}
catch (const std::out_of_range&)
{
    Require(start < 0 || static_cast<unsigned>(start) > source.size(), "only a start outside is refused");
}

} // namespace

void Try(std::string_view input)
{
    const auto lines = Split(input, '\n', 4);
    const std::string setting = lines[0].c_str(); // the platform's texts end at a null
    kiv::sim::ChangeDevice([&](auto& device) { device.language = setting; });
    std::string language = setting.substr(0, setting.find('_'));
    for (char& ch : language)
        ch = facade.To_Capital(ch);
    char* row = nullptr;
    facade.GetISO639LangCodeFromDeviceLang(language, &row);
    Require(Code(false) == language, "the code is the part before the underscore");
    Require(Code(true) == (row == nullptr ? "(none)" : row), "the ISO code is that of the row");

    Require(facade.GetTagStartPosition(lines[0], lines[1]) == static_cast<int>(lines[0].find(lines[1])), "the tag's place");
    TryPart(lines[0], Number(lines[2]), Number(lines[3]));
    Feed(1);
}
