// The facade's members for device and platform.
#include "device/DeviceTest.h"

#include <cmath>

namespace
{

using namespace kiv::test;
using testing::ElementsAre;
using testing::IsEmpty;

using DeviceFacts = DeviceTest;

TEST_F(DeviceFacts, ThatAreTextsAreNullWhenThePlatformReturnsNone)
{
    for (const Call call : {Call::system_settings_get_value_string, Call::system_info_get_platform_string,
             Call::package_info_get_version, Call::telephony_modem_get_imei})
        kiv::platform::FailCall(call, 0);
    for (const auto read : {&DASystem::GetDeviceName, &DASystem::GetPlatformName, &DASystem::GetSWVersion, &DASystem::GetModelName,
             &DASystem::GetTizenIdN, &DASystem::GetIMEI})
        EXPECT_EQ("null", Out([&](char** out) { EXPECT_EQ(0, std::invoke(read, facade, out)); }));
    EXPECT_EQ("null", Out([&](char** out) { EXPECT_EQ(0, facade.GetPackageVersion("org.example.mail", out)); }));
    kiv::platform::FailCall(Call::package_info_create, 0); // succeeds without a handle
    EXPECT_EQ("null", Out([&](char** out) { EXPECT_EQ(0, facade.GetPackageVersion("org.example.mail", out)); }));
    EXPECT_THAT(kiv::platform::TakeMisuses(), IsEmpty());
    EXPECT_THAT(log.Take(), IsEmpty());
}

TEST_F(DeviceFacts, ThatAreSwitchesAreReadSeparately)
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

TEST_F(DeviceFacts, OfAPackageNeedItsExactName)
{
    const std::string place = "E DASystem.cpp IsPackageInstalled > ", empty = "PackageName is empty. IsPackageInstalled finish.";
    for (const char* const package : {static_cast<const char*>(nullptr), "", "org.example.mai"})
        EXPECT_FALSE(facade.IsPackageInstalled(const_cast<char*>(package)));
    EXPECT_THAT(log.Take(), ElementsAre(place + empty, place + empty, place + "No Such Package [org.example.mai]"));
    EXPECT_EQ(1U, TakeCalls()) << "an empty name is not looked up";
}

TEST_F(DeviceFacts, CompareFreeStorageStrictlyInMebibytes)
{
    const std::tuple<std::uint32_t, std::uint64_t, double> sizes[] = {
        {4096, 256, 1.0}, {1, 1, 0x1p-20}, {0xFFFFFFFF, ~std::uint64_t{0}, 0x1.fffffffep75}, {4096, 0, 0.0}};
    for (const auto& [blockSize, blocks, free] : sizes)
    {
        Set(&Device::blockSize, blockSize);
        Set(&Device::blocksAvailable, blocks);
        EXPECT_TRUE(facade.IsSystemMemoryAvailable(std::nextafter(free, -1.0))) << free;
        for (const double required : {free, std::nan("")})
        {
            EXPECT_FALSE(facade.IsSystemMemoryAvailable(required)) << required;
            EXPECT_THAT(
                log.Take(), ElementsAre("E DASystem.cpp IsSystemMemoryAvailable > Total mem under " + std::to_string(required)));
        }
    }
    kiv::platform::FailCall(Call::storage_get_internal_memory_size64, 1, kEveryCall, kNoSlot, Leavings::ItsResults);
    EXPECT_TRUE(facade.IsSystemMemoryAvailable(-1.0)) << "what is not negative is a success";
}

TEST_F(DeviceFacts, HaveAnImeiWithOrWithoutAnAnsweringModem)
{
    const auto imei = [&] { return Out([&](char** out) { EXPECT_EQ(0, facade.GetIMEI(out)); }); };
    kiv::platform::FailCall(Call::telephony_modem_get_imei, -1, kEveryCall, 0);
    EXPECT_EQ("490154203237518", imei());

    kiv::platform::FailCall(Call::telephony_modem_get_imei, -1);
    const std::pair<const char*, const char*> zones[] = {{"EAST-9", "324000000000000"}, {"WEST5", "-18000000000000"},
        {"STD0DST-2,0/0,J365/25", "720000000000000"}, // daylight saving time all year
        {"UTC", "000000000000000"}};
    for (const auto& [zone, digits] : zones)
    {
        setenv("TZ", zone, 1);
        tzset();
        EXPECT_EQ(digits, imei()) << zone;
    }
    EXPECT_THAT(log.Take(), IsEmpty());

    kiv::platform::FailCall(Call::telephony_init, 0); // a list of no handles
    EXPECT_EQ("000000000000000", imei());
    EXPECT_THAT(log.Take(), ElementsAre("E DASimManager.cpp SuccessToInitTelephonyHandle > telephony_init Failed.",
                                "E DASystem.cpp GetIMEI > telephony_init Failed. Start to get IMEI from current time"));
}

} // namespace
