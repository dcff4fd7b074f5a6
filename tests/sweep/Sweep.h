#ifndef KIV_TESTS_SWEEP_H
#define KIV_TESTS_SWEEP_H

#include "support/LogCapture.h"
#include "sweep/Doubles.h"
#include "sweep/Operations.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace kiv::test
{

/// How many calls or allocations are to fail in a row: one, two, three, all; more in the long form.
std::vector<unsigned> Lengths();

/// Tries operations one by one in one world, each on a device that nobody used before.
struct Sweep : testing::Test
{
    Sweep();
    ~Sweep() override;

    /// The profiles, and one device with many slots.
    static std::vector<std::string> Devices();
    void Use(const std::string& name);

    /// Runs an operation between two actions; nothing may be open and no lock held in the end.
    Story Try(const Operation& operation, const std::function<void()>& arm, const std::function<void()>& disarm);

    /// Whether an operation that goes on after a failure may come to this: to one of its failures, or to an answer made of nothing
    /// but what it says untouched and what the SIMs hold, in lines that are all its own.
    testing::AssertionResult MayBe(const Operation& operation, const Story& story, const Story& untouched) const;

    sim::Device device;
    LogCapture log;
};

} // namespace kiv::test

#endif
