#ifndef KIV_TESTS_DEVICETEST_H
#define KIV_TESTS_DEVICETEST_H

#include "support/LogCapture.h"
#include "support/Texts.h"

#include <DASystem.h>
#include <DeviceControl.h>
#include <SourceControl.h>

namespace kiv::test
{

using platform::Call;
using platform::Device;
using platform::kEveryCall;
using platform::kNoSlot;
using platform::Leavings;

/// The facade on a device with two SIMs.
struct DeviceTest : testing::Test
{
    DeviceTest()
    {
        platform::ResetDevice();
        EXPECT_EQ("", platform::UseProfile("dual"));
        platform::StartJournal();
    }
    ~DeviceTest() override { platform::ResetDevice(); }

    /// Changes one value of the device.
    template <class Value, class Given>
    static void Set(Value Device::*fact, Given value)
    {
        platform::ChangeDevice([&](Device& device) { device.*fact = value; });
    }

    /// Returns the number of platform calls since the last time.
    static std::size_t TakeCalls() { return platform::TakeJournal().size(); }

    DASystem& facade = *DASystem::GetInstance();
    LogCapture log;
};

} // namespace kiv::test

#endif
