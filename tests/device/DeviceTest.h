#ifndef KIV_TESTS_DEVICETEST_H
#define KIV_TESTS_DEVICETEST_H

#include "support/LogCapture.h"

#include <DASystem.h>
#include <SimulatedDevice.h>

namespace kiv::test
{

using sim::Call;
using sim::Device;
using sim::Leavings;
using Lines = std::vector<std::string>;

constexpr sim::CallNumbers kEvery = sim::kEveryCall;

/// Takes over a text that was handed out: what it says, or "null".
inline std::string Taken(char* text)
{
    const std::unique_ptr<char, decltype(&std::free)> owner(text, std::free);
    return text == nullptr ? "null" : text;
}

/// A result, and what became of the out-parameter: the text, "null" or "untouched".
using Answer = std::pair<int, std::string>;

template <class Operation>
Answer Ask(Operation operation)
{
    static char before[] = "before";
    char* out = before;
    const int code = operation(&out);
    return {code, out == before ? "untouched" : Taken(out)};
}

/// The facade over a device with two SIMs; nothing may be left open or used wrongly.
struct DeviceTest : testing::Test
{
    DeviceTest()
    {
        sim::ResetDevice();
        EXPECT_EQ("", sim::UseProfile("dual"));
        sim::StartJournal();
    }
    ~DeviceTest() override
    {
        EXPECT_THAT(sim::OpenHandles(), testing::IsEmpty());
        EXPECT_THAT(sim::TakeMisuses(), testing::IsEmpty());
        sim::ResetDevice();
    }

    /// Changes one value of the device.
    template <class Value, class Given>
    static void Set(Value Device::*fact, Given value)
    {
        sim::ChangeDevice([&](Device& device) { device.*fact = value; });
    }

    /// Makes every call of a function fail until the next one is named.
    static void Fail(Call call, int code, Leavings leavings = Leavings::kNothing)
    {
        sim::ClearFaults();
        sim::FailCall(call, code, kEvery, sim::kNoSlot, leavings);
    }

    /// What was called since the last time.
    static std::vector<Call> TakeCalls()
    {
        std::vector<Call> calls;
        for (const auto& entry : sim::TakeJournal())
            calls.push_back(entry.call);
        return calls;
    }

    DASystem& facade = *DASystem::GetInstance();
    LogCapture log;
};

} // namespace kiv::test

#endif
