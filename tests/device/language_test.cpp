// The device's language as a code, against rows that were listed apart from the library's own.
#include "device/DeviceTest.h"

#include <cctype>
#include <limits>
#include <stdexcept>

namespace
{

using namespace kiv::test;

struct Language : DeviceTest
{
    /// Asks for the plain code and the ISO 639-2 one; nothing of it is ever logged.
    void Expect(const std::string& plain, const std::string& iso)
    {
        EXPECT_EQ(Answer(0, plain), Ask([&](char** out) { return facade.GetDeviceLanguageCode(out, false); }));
        EXPECT_EQ(Answer(0, iso), Ask([&](char** out) { return facade.GetDeviceLanguageCode(out, true); }));
        EXPECT_EQ(Lines{}, log.Take());
    }
    const char* Row(const std::string& deviceLang)
    {
        static char other[] = "other";
        char* row = other;
        facade.GetISO639LangCodeFromDeviceLang(deviceLang, &row);
        return row;
    }
};

TEST_F(Language, HasAnIsoCodeForTheListedOnesAndNoOther)
{
    std::map<std::string, std::string> listed; // ISO 639-2 by ISO 639-1
    std::ifstream in(KIV_TEST_DATA "/language.tsv");
    for (std::string three, two; in >> three >> two;)
        listed[two] = three;
    ASSERT_EQ(160U, listed.size());
    for (std::string two = "AA"; two <= "ZZ"; two[1] == 'Z' ? (++two[0], two[1] = 'A') : ++two[1])
    {
        const auto found = listed.find(two);
        const bool isListed = found != listed.end();
        Set(&Device::language, std::string{static_cast<char>(std::tolower(two[0])), two[1]} + "_XX_yy");
        Expect(two, isListed ? found->second : "untouched");
        EXPECT_STREQ(isListed ? found->second.c_str() : nullptr, Row(two));
        EXPECT_EQ(Row(two), Row(two)) << "constant text";
    }
    for (const char* const outside : {"", "E", "ENG", "en", "eN", " EN", "EN_"})
        EXPECT_EQ(nullptr, Row(outside)) << outside;
}

TEST_F(Language, IsThePartOfTheSettingBeforeTheFirstUnderscore)
{
    const std::string far(10'000, 'z'), farCapital(10'000, 'Z');
    const std::tuple<std::string, std::string, std::string> cases[] = {
        {"ko_KR", "KO", "kor"},
        {"En_us", "EN", "eng"},
        {"de_DE", "DE", "untouched"},
        {"fil_PH", "FIL", "untouched"},
        {"en", "EN", "eng"},
        {"en-US", "EN-US", "untouched"},
        {"", "", "untouched"},
        {"__", "", "untouched"},
        {far + "_en", farCapital, "untouched"},
        {"\xC3\xA9\xFFn\x80_US", "\xC3\xA9\xFFN\x80", "untouched"},
    };
    for (const auto& [setting, plain, iso] : cases)
    {
        Set(&Device::language, setting);
        Expect(plain, iso);
    }
    Fail(Call::system_settings_get_value_string, 0);
    Expect("EN", "eng"); // success without a text
}

TEST_F(Language, IsCutOutWithHelpersThatKnowTheirBounds)
{
    EXPECT_EQ(5, facade.GetTagStartPosition("en_US_x", "_x"));
    EXPECT_EQ(-1, facade.GetTagStartPosition("en", "_"));
    EXPECT_EQ(0, facade.GetTagStartPosition("en", ""));

    constexpr int kLargest = std::numeric_limits<int>::max(), kSmallest = std::numeric_limits<int>::min();
    const std::tuple<int, int, const char*> parts[] = {
        {1, 1, "b"}, {1, 0, ""}, {0, -2, "abc"}, {3, 5, ""}, {1, kLargest, "bc"}, {1, kSmallest, "bc"}};
    for (const auto& [start, end, part] : parts)
        EXPECT_EQ(part, facade.GetValueFromPosition("abc", start, end)) << start << ' ' << end;
    for (const int start : {4, -1, kLargest, kSmallest})
        EXPECT_THROW(facade.GetValueFromPosition("abc", start, 5), std::out_of_range) << start;
    for (int byte = 0; byte < 256; ++byte)
        EXPECT_EQ(static_cast<char>(byte >= 0x61 && byte <= 0x7A ? byte - 32 : byte), facade.To_Capital(static_cast<char>(byte)));
}

} // namespace
