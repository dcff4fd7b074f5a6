// What the facade tells of device and platform.
#include "device/DeviceTest.h"

#include <cmath>

namespace
{

using namespace kiv::test;
using testing::ElementsAre;
using testing::IsEmpty;

struct DeviceFacts : DeviceTest
{
    static std::string Line(const std::string& text) { return "E DASystem.cpp " + text; }
};

TEST_F(DeviceFacts, ThatAreTextsAreNullWhereThePlatformSucceedsWithoutOne)
{
    for (const Call call : {Call::system_settings_get_value_string, Call::system_info_get_platform_string,
             Call::package_info_get_version, Call::telephony_modem_get_imei})
        kiv::sim::FailCall(call, 0);
    for (const auto read : {&DASystem::GetDeviceName, &DASystem::GetPlatformName, &DASystem::GetSWVersion, &DASystem::GetModelName,
             &DASystem::GetTizenIdN, &DASystem::GetIMEI})
        EXPECT_EQ(Answer(0, "null"), Ask([&](char** out) { return std::invoke(read, facade, out); }));
    EXPECT_EQ(Answer(0, "null"), Ask([&](char** out) { return facade.GetPackageVersion("org.example.mail", out); }));
    EXPECT_THAT(log.Take(), IsEmpty());
}

TEST_F(DeviceFacts, ThatAreSwitchesAreReadEachForItself)
{
    constexpr bool Device::*kSwitches[] = {&Device::flightMode, &Device::dataRoaming, &Device::mobileData, &Device::packetData};
    for (const auto& on : kSwitches)
    {
        for (const auto& other : kSwitches)
            Set(other, other == on);
        EXPECT_EQ(on == kSwitches[0], facade.IsFlightMode());
        EXPECT_EQ(on == kSwitches[1], facade.IsDataRoamingEnabled());
        EXPECT_EQ(on == kSwitches[2], facade.IsMobileData());
    }
}

TEST_F(DeviceFacts, OfAPackageAreThoseOfOneThatIsInstalledUnderThatVeryName)
{
    const std::pair<const char*, std::string> cases[] = {{nullptr, "PackageName is empty. IsPackageInstalled finish."},
        {"", "PackageName is empty. IsPackageInstalled finish."}, {"org.example.mai", "No Such Package [org.example.mai]"}};
    for (const auto& [package, line] : cases)
    {
        EXPECT_FALSE(facade.IsPackageInstalled(const_cast<char*>(package)));
        EXPECT_THAT(log.Take(), ElementsAre(Line("IsPackageInstalled > " + line)));
    }
    EXPECT_EQ(1U, TakeCalls().size()) << "an empty name is not asked for";
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
            setenv("TZ", zone, 1);
            tzset();
            EXPECT_EQ(Answer(0, imei), Ask([&](char** out) { return facade.GetIMEI(out); })) << zone;
            EXPECT_EQ(failed, log.Take());
            EXPECT_THAT(TakeCalls(), ElementsAre(Call::telephony_init));
        }
    }
    setenv("TZ", "UTC", 1);
    tzset();
}

} // namespace
