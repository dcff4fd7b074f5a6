// What the facade tells of device and platform, with each call of the platform failing in its turn.
#include "device/DeviceTest.h"

#include <package_manager.h>

#include <cmath>
#include <functional>
#include <iostream>
#include <tuple>

namespace
{

using namespace kiv::test;
using testing::ElementsAre;
using testing::IsEmpty;

struct DeviceFacts : DeviceTest
{
    static std::string Line(const std::string& text) { return "E DASystem.cpp " + text; }
};

TEST_F(DeviceFacts, ThatAreTextsGoThroughWithThePlatformsCode)
{
    const struct
    {
        int (DASystem::*read)(char**);
        Call call;
        kiv::sim::Text Device::*fact;
        Lines whenItFails; ///< of what is copied
    } reads[] = {
        {&DASystem::GetDeviceName, Call::system_settings_get_value_string, &Device::deviceName, {}},
        {&DASystem::GetPlatformName, Call::system_info_get_platform_string, &Device::platformName, {}},
        {&DASystem::GetSWVersion, Call::system_info_get_platform_string, &Device::platformVersion, {}},
        {&DASystem::GetModelName, Call::system_info_get_platform_string, &Device::modelName, {}},
        {&DASystem::GetTizenIdN, Call::system_info_get_platform_string, &Device::tizenId,
            {Line("GetTizenIdN > system_info_get_platform_string failed [77]")}},
    };
    for (const auto& row : reads)
    {
        const auto expect = [&](int code, const std::string& text)
        {
            EXPECT_EQ(Answer(code, text), Ask([&](char** out) { return std::invoke(row.read, facade, out); }));
            EXPECT_EQ(code == 0 ? Lines{} : row.whenItFails, log.Take());
        };
        kiv::sim::ClearFaults();
        Set(row.fact, "its own");
        expect(0, "its own");
        Fail(row.call, 0);
        expect(0, "null");
        Fail(row.call, 77);
        expect(77, row.whenItFails.empty() ? "null" : "untouched");
        Fail(row.call, 77, Leavings::kItsResults);
        expect(77, row.whenItFails.empty() ? "its own" : "untouched");
    }
}

TEST_F(DeviceFacts, ThatAreSwitchesAreOffWhenTheyCanNotBeRead)
{
    const std::tuple<bool (DASystem::*)(), Call, bool Device::*> switches[] = {
        {&DASystem::IsFlightMode, Call::runtime_info_get_value_bool, &Device::flightMode},
        {&DASystem::IsDataRoamingEnabled, Call::runtime_info_get_value_bool, &Device::dataRoaming},
        {&DASystem::IsMobileData, Call::system_settings_get_value_bool, &Device::mobileData},
    };
    for (const auto& [read, call, fact] : switches)
    {
        kiv::sim::ClearFaults();
        for (const bool isOn : {false, true})
        {
            for (const auto other : {&Device::flightMode, &Device::packetData, &Device::dataRoaming, &Device::mobileData})
                Set(other, !isOn);
            Set(fact, isOn);
            EXPECT_EQ(isOn, std::invoke(read, facade));
        }
        Fail(call, -77);
        EXPECT_FALSE(std::invoke(read, facade));
    }
    EXPECT_THAT(log.Take(), IsEmpty());
}

TEST_F(DeviceFacts, OfFontTimeAndSalesCodeAreStoredInEveryCase)
{
    const time_t seconds = 1'700'000'000;
    Set(&Device::currentTime, seconds);
    Set(&Device::fontSize, 4);
    const auto expect = [&](int code, bool isWritten)
    {
        int size = 99;
        tm set = {}, now = {9, 9, 9, 9, 9, 9, 9, 9, 9, 9, "stale"};
        EXPECT_EQ(code, facade.GetFontSize(&size));
        EXPECT_EQ(code, facade.GetCurrentTime(&now));
        EXPECT_EQ(isWritten ? 4 : 0, size);
        if (isWritten)
            localtime_r(&seconds, &set);
        char texts[2][64];
        strftime(texts[0], sizeof texts[0], "%F %T %j %w %Z %z", &set);
        strftime(texts[1], sizeof texts[1], "%F %T %j %w %Z %z", &now);
        EXPECT_STREQ(texts[0], texts[1]);
        EXPECT_EQ(code == 0 ? "KIV" : "null", Taken(facade.GetCSC()));
    };
    expect(0, true);
    for (const auto leavings : {Leavings::kNothing, Leavings::kItsResults})
    {
        kiv::sim::ClearFaults();
        for (const Call call : {Call::system_settings_get_value_int, Call::alarm_get_current_time, Call::vconf_get_str})
            kiv::sim::FailCall(call, 77, kEvery, kiv::sim::kNoSlot, leavings);
        expect(77, leavings == Leavings::kItsResults);
    }
    EXPECT_THAT(log.Take(), IsEmpty());
}

TEST_F(DeviceFacts, OfAPackageAreReadOverAHandleThatIsClosedInEveryCase)
{
    constexpr Call kCreate = Call::package_info_create, kRead = Call::package_info_get_version,
                   kDestroy = Call::package_info_destroy;
    const std::tuple<const char*, Call, Leavings, Answer, bool> cases[] = {
        {"org.example.none", kDestroy, Leavings::kItsResults, {PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE, "untouched"}, false},
        {"org.example.mail", kCreate, Leavings::kNothing, {-5, "untouched"}, false},
        {"org.example.mail", kRead, Leavings::kNothing, {-5, "untouched"}, true},
        {"org.example.mail", kRead, Leavings::kItsResults, {5, "untouched"}, true},
        {"org.example.mail", kRead, Leavings::kNothing, {0, "null"}, true},
        {"org.example.mail", kDestroy, Leavings::kItsResults, {0, "3.0.17"}, true},
    };
    for (const auto& [package, failing, leavings, answer, isOpened] : cases)
    {
        const int code = answer.first;
        Fail(failing, failing == kDestroy ? -7 : code, leavings);
        EXPECT_EQ(answer, Ask([&, package = package](char** out) { return facade.GetPackageVersion(package, out); }));
        EXPECT_EQ(isOpened ? std::vector({kCreate, kRead, kDestroy}) : std::vector({kCreate}), TakeCalls());
        const Lines failed = {Line("GetPackageVersion > package_info_create failed [" + std::to_string(code) + "]")};
        EXPECT_EQ(isOpened ? Lines{} : failed, log.Take());
    }
}

TEST_F(DeviceFacts, TellWhetherAPackageIsInstalledByThePlatformsCodeAlone)
{
    const std::string empty = "PackageName is empty. IsPackageInstalled finish.",
                      other = "Other Error Case.. [package_manager_error_e] code is ";
    const std::tuple<const char*, int, std::string> cases[] = {
        // the number is the code to fail with
        {nullptr, 0, empty},
        {"", 0, empty},
        {"org.example.mail", 0, ""},
        {"org.example.mai", 0, "No Such Package [org.example.mai]"},
        {"org.example.mail", -1, other + "-1"},
        {"org.example.mail", 1, other + "1"},
    };
    for (const auto& [package, code, line] : cases)
    {
        if (code != 0)
            Fail(Call::package_manager_get_package_size_info, code);
        EXPECT_EQ(line.empty(), facade.IsPackageInstalled(const_cast<char*>(package)));
        EXPECT_EQ(line.empty() ? Lines{} : Lines{Line("IsPackageInstalled > " + line)}, log.Take());
        EXPECT_EQ(line == empty ? 0U : 1U, TakeCalls().size());
    }
}

TEST_F(DeviceFacts, CompareFreeStorageStrictlyInMebibytes)
{
    constexpr std::uint32_t kLargestBlock = 0xFFFFFFFF;
    const std::tuple<std::uint32_t, std::uint64_t, double> sizes[] = {
        {4096, 256, 1.0},
        {1, 1, 0x1p-20},
        {512, 3, 0x3p-11},
        {kLargestBlock, 1, 0x1p12 - 0x1p-20},
        {1, (std::uint64_t{1} << 53) + 1, 0x1p33},
        {kLargestBlock, ~std::uint64_t{0}, 0x1.fffffffep75},
        {4096, 0, 0.0},
    };
    const auto expect = [&](bool isAvailable, double required)
    {
        const Lines refused = {Line("IsSystemMemoryAvailable > Total mem under " + std::to_string(required))};
        EXPECT_EQ(isAvailable, facade.IsSystemMemoryAvailable(required)) << required;
        EXPECT_EQ(isAvailable ? Lines{} : refused, log.Take());
    };
    for (const auto& [blockSize, blocks, free] : sizes)
    {
        Set(&Device::blockSize, blockSize);
        Set(&Device::blocksAvailable, blocks);
        expect(false, free);
        expect(false, std::nextafter(free, HUGE_VAL));
        expect(true, std::nextafter(free, -1.0));
        expect(false, std::nan(""));
    }
    Fail(Call::storage_get_internal_memory_size64, 1, Leavings::kItsResults);
    expect(true, -1.0); // what is not negative is a success
    Fail(Call::storage_get_internal_memory_size64, -1, Leavings::kItsResults);
    EXPECT_FALSE(facade.IsSystemMemoryAvailable(-1.0));
    EXPECT_THAT(log.Take(), ElementsAre(Line("IsSystemMemoryAvailable > Fail to get internal memory size")));
}

TEST_F(DeviceFacts, HaveTheImeiOfTheFirstModemThatAnswers)
{
    constexpr Call kOpen = Call::telephony_init, kAsk = Call::telephony_modem_get_imei, kClose = Call::telephony_deinit;
    const auto expect = [&](const std::string& imei, const std::vector<Call>& calls)
    {
        EXPECT_THAT(Ask([&](char** out) { return facade.GetIMEI(out); }), testing::Pair(0, testing::EndsWith(imei)));
        EXPECT_EQ(calls, TakeCalls());
    };
    expect("356938035643809", {kOpen, kAsk, kClose});
    kiv::sim::FailCall(kAsk, -1, kEvery, 0);
    expect("490154203237518", {kOpen, kAsk, kAsk, kClose});
    kiv::sim::FailCall(kAsk, -1, kEvery, 1);
    expect("00000000", {kOpen, kAsk, kAsk, kClose}); // what stands in for it
    Fail(kAsk, 0);
    expect("null", {kOpen, kAsk, kClose}); // success without a text
    EXPECT_THAT(log.Take(), IsEmpty());
}

TEST_F(DeviceFacts, HaveTheOffsetFromUtcFilledUpWithZerosForAnImeiWithoutTelephony)
{
    const std::pair<const char*, std::string> zones[] = {
        {"EAST-9", "324000000000000"}, {"ZERO0", "000000000000000"}, {"WEST5", "-18000000000000"}, {"HALF-5:30", "198000000000000"},
        {"ODD-1:02:03", "372300000000000"}, {"STD0DST-2,0/0,J365/25", "720000000000000"}, // summer all the year
    };
    const Lines failed = {"E DASimManager.cpp SuccessToInitTelephonyHandle > telephony_init Failed.",
        Line("GetIMEI > telephony_init Failed. Start to get IMEI from current time")};
    for (const int code : {-1, 0}) // no telephony, and a list of no handles
    {
        Fail(Call::telephony_init, code);
        for (const auto& [zone, imei] : zones)
        {
            const auto inZone = [&, zone = zone]
            {
                setenv("TZ", zone, 1);
                tzset();
                std::cerr << Ask([&](char** out) { return facade.GetIMEI(out); }).second;
                std::_Exit(failed == log.Take() && TakeCalls() == std::vector{Call::telephony_init} ? 0 : 1);
            };
            EXPECT_EXIT(inZone(), testing::ExitedWithCode(0), "^" + imei + "$") << zone;
        }
    }
}

} // namespace
