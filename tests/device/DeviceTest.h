#ifndef KIV_TESTS_DEVICETEST_H
#define KIV_TESTS_DEVICETEST_H

#include "support/LogCapture.h"
#include "support/Texts.h"

#include <DASystem.h>
#include <SimulatedDevice.h>

namespace kiv::test
{

using sim::Call;
using sim::Device;
using sim::kEveryCall;
using sim::kNoSlot;
using sim::Leavings;

/// The facade over a device with two SIMs.
struct DeviceTest : testing::Test
{
    DeviceTest()
    {
        sim::ResetDevice();
        EXPECT_EQ("", sim::UseProfile("dual"));
        sim::StartJournal();
    }
    ~DeviceTest() override { sim::ResetDevice(); }

    /// Changes one value of the device.
    template <class Value, class Given>
    static void Set(Value Device::*fact, Given value)
    {
        sim::ChangeDevice([&](Device& device) { device.*fact = value; });
    }

    /// How many calls were made since the last time.
    static std::size_t TakeCalls() { return sim::TakeJournal().size(); }

    DASystem& facade = *DASystem::GetInstance();
    LogCapture log;
};

} // namespace kiv::test

#endif
