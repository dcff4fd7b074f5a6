// The device's language as a code, compared with rows written independently of the library's.
#include "device/DeviceTest.h"

#include <climits>
#include <stdexcept>

namespace
{

using namespace kiv::test;

struct Language : DeviceTest
{
    /// Reads the plain code and the ISO 639-2 code.
    void Expect(const std::string& plain, const std::string& iso)
    {
        EXPECT_EQ(plain, Out([&](char** out) { EXPECT_EQ(0, facade.GetDeviceLanguageCode(out, false)); }));
        EXPECT_EQ(iso, Out([&](char** out) { EXPECT_EQ(0, facade.GetDeviceLanguageCode(out, true)); }));
    }
};

TEST_F(Language, HasItsListedIsoCode)
{
    const Column listed = Find(Read("language.tsv"), 1, 0);
    ASSERT_EQ(160U, listed.size());
    for (const auto& [language, iso] : listed)
    {
        Set(&Device::language, language + "_XX_yy");
        Expect(language, iso);
    }
}

TEST_F(Language, IsThePartOfTheSettingBeforeTheFirstUnderscore)
{
    const std::tuple<const char*, const char*, const char*> cases[] = {
        {"en_us", "EN", "eng"},
        {"de_DE", "DE", "untouched"},
        {"fil_PH", "FIL", "untouched"},
        {"en-US", "EN-US", "untouched"},
        {"__", "", "untouched"},
        {"\xC3\xA9\xFFn\x80_US", "\xC3\xA9\xFFN\x80", "untouched"},
    };
    for (const auto& [setting, plain, iso] : cases)
    {
        Set(&Device::language, setting);
        Expect(plain, iso);
    }
    kiv::platform::FailCall(Call::system_settings_get_value_string, 0);
    Expect("EN", "eng"); // success without a text
}

TEST_F(Language, HelpersStayWithinTheBoundsOfTheText)
{
    EXPECT_EQ(5, facade.GetTagStartPosition("en_US_x", "_x"));
    EXPECT_EQ(-1, facade.GetTagStartPosition("en", "_"));

    const std::tuple<int, int, const char*> parts[] = {
        {1, 1, "b"}, {1, 0, ""}, {0, -2, "abc"}, {3, 5, ""}, {1, INT_MAX, "bc"}, {1, INT_MIN, "bc"}};
    for (const auto& [start, end, part] : parts)
        EXPECT_EQ(part, facade.GetValueFromPosition("abc", start, end)) << start << ' ' << end;
    for (const int start : {4, -1})
        EXPECT_THROW(facade.GetValueFromPosition("abc", start, 5), std::out_of_range) << start;
    for (int byte = 0; byte < 256; ++byte)
        EXPECT_EQ(g_ascii_toupper(static_cast<char>(byte)), facade.To_Capital(static_cast<char>(byte)));
}

} // namespace
