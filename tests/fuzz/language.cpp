// A setting of the device's language, a tag, and two positions, a line each, against what the standard library makes of them.
#include "Fuzz.h"

#include <DASystem.h>
#include <SimulatedDevice.h>

#include <cstdlib>
#include <memory>
#include <optional>
#include <stdexcept>

namespace
{

using kiv::fuzz::Require;

DASystem& facade = *DASystem::GetInstance();

std::optional<std::string> Code(bool isISO639)
{
    char* out = nullptr;
    Require(facade.GetDeviceLanguageCode(&out, isISO639) == 0, "the setting can be read");
    const std::unique_ptr<char, decltype(&std::free)> owner(out, std::free);
    return out == nullptr ? std::nullopt : std::optional<std::string>(out);
}

void TryLanguage(const std::string& setting)
{
    kiv::sim::ChangeDevice([&](kiv::sim::Device& device) { device.language = setting; });
    std::string expected = setting.substr(0, setting.find('_'));
    for (char& ch : expected)
        ch = facade.To_Capital(ch);
    Require(Code(false) == expected, "the language is the capital text before the underscore");

    const std::optional<std::string> iso = Code(true);
    char* row = nullptr;
    facade.GetISO639LangCodeFromDeviceLang(expected, &row);
    Require(iso.has_value() == (row != nullptr) && (!iso || (iso == row && iso->size() == 3)), "the ISO code is that of the row");
}

std::optional<std::string> Part(const std::string& source, int start, int end)
try
{
    return facade.GetValueFromPosition(source, start, end);
}
catch (const std::out_of_range&)
{
    return std::nullopt;
}

void TryPositions(const std::string& source, const std::string& tag, int start, int end)
{
    Require(facade.GetTagStartPosition(source, tag) == static_cast<int>(source.find(tag)), "the tag stands where it is found");

    const std::optional<std::string> part = Part(source, start, end);
    const bool isInside = start >= 0 && static_cast<std::size_t>(start) <= source.size();
    Require(part.has_value() == isInside, "only a start outside is refused");
    if (isInside)
    {
        const std::int64_t size = std::int64_t{end} - start + 1;
        Require(
            *part == source.substr(static_cast<std::size_t>(start), size < 0 ? std::string::npos : static_cast<std::size_t>(size)),
            "the part is that between the positions");
    }
}

} // namespace

void Try(std::string_view input)
{
    std::vector<std::string> lines = kiv::fuzz::Split(input, '\n');
    lines.resize(4);
    const auto number = [&](std::size_t line) { return static_cast<int>(std::strtoll(lines[line].c_str(), nullptr, 10)); };
    TryLanguage(lines[0].c_str()); // the platform's texts end at a null
    TryPositions(lines[0], lines[1], number(2), number(3));
    kiv::fuzz::Feed(1);
}
