// Every operation on every profile. Each of its platform calls fails in turn: only that one, and with all later ones.
#include "sweep/Sweep.h"

#include <iostream>

namespace
{

using namespace kiv::test;
using kiv::platform::Leavings;
namespace platform = kiv::platform;

constexpr int kCode = -77;

bool Contains(const Calls& calls, Call call)
{
    return std::find(calls.begin(), calls.end(), call) != calls.end();
}

/// The effect of a failed call. A failed call that opens must not open anything, since the caller could not close it. A failed call
/// that closes must close, since the caller does not try again.
Leavings Possible(Call call, Leavings wanted)
{
    const Calls opening{Call::telephony_init, Call::tel_init, Call::package_info_create, Call::connection_create};
    const Calls closing{Call::telephony_deinit, Call::tel_deinit, Call::package_info_destroy, Call::connection_destroy};
    if (Contains(opening, call))
        return Leavings::Nothing;
    return Contains(closing, call) ? Leavings::ItsResults : wanted;
}

/// The outcome of an operation that ends with the first failed call.
Story Expected(const Operation& operation, const Calls& failed, Leavings leavings, const Story& untouched)
{
    for (const Call call : failed)
    {
        for (const Failing& each : operation.failing)
        {
            if (!Contains(each.calls, call))
                continue;
            Story story = each.story;
            std::string& text = story[0];
            if (text.back() != '*')
                return story;
            text.pop_back();
            const std::size_t rest = text.find(' ');
            if (leavings == Leavings::ItsResults)
                text =
                    rest == std::string::npos ? untouched[0] : text.substr(0, rest) + untouched[0].substr(untouched[0].find(' '));
            return story;
        }
    }
    return untouched;
}

struct PlatformSweep : Sweep
{
    /// Fails the calls from `first` to `last`, counted from 1.
    Story TryFailing(const Operation& operation, std::size_t first, std::size_t last, Leavings leavings)
    {
        made.clear();
        failed.clear();
        const auto onCall = [&](Call call, int)
        {
            EXPECT_STREQ(operation.IsLockedAt(call) ? kSimAccess : "", heldLock)
                << operation.name << ": " << platform::NameOf(call);
            made.push_back(call);
            platform::ClearFaults();
            constexpr int kPatience = 120; // waiting for a SIM has no time limit
            if (pauses >= kPatience)
                return "";
            if (made.size() >= first && made.size() <= last)
            {
                failed.push_back(call);
                platform::FailCall(call, kCode, platform::kEveryCall, platform::kNoSlot, Possible(call, leavings));
            }
            return "";
        };
        const auto disarm = []
        {
            platform::SetCallHook(nullptr);
            platform::ClearFaults();
        };
        return Try(
            operation, [&] { platform::SetCallHook(onCall); }, disarm);
    }

    Calls made, failed;
};

TEST_F(PlatformSweep, HasEveryPublicMemberInItsTable)
{
    std::set<std::string> exported, listed;
    std::ifstream in(KIV_EXPORTED_SYMBOLS);
    for (std::string symbol; std::getline(in, symbol);)
    {
        // Skips constructors, destructors and variables.
        if (g_regex_match_simple(R"(^(\w+)::(?!~|\1\().*\)$)", symbol.c_str(), GRegexCompileFlags(0), GRegexMatchFlags(0)))
            exported.insert(symbol);
    }
    for (const Operation& operation : Operations())
        listed.insert(operation.symbols.begin(), operation.symbols.end());
    EXPECT_GT(exported.size(), 100U);
    EXPECT_THAT(listed, testing::ContainerEq(exported));
}

TEST_F(PlatformSweep, ReturnsTheRightResultsWhenNothingFails)
{
    for (const Operation& operation : Operations())
        EXPECT_EQ(operation.good, TryFailing(operation, 0, 0, Leavings::Nothing)) << operation.name;
}

TEST_F(PlatformSweep, ReturnsFailureResultsWhicheverCallFails)
{
    const std::size_t kMostCalls = IsLong() ? 200 : 20; // per operation: polling makes more, which are all alike
    int pairs = 0;
    for (const std::string& name : Devices())
    {
        SCOPED_TRACE(name);
        Use(name);
        for (const Operation& operation : Operations())
        {
            if (operation.needsHandle && device.slots.empty())
                continue;
            const Story untouched = TryFailing(operation, 0, 0, Leavings::Nothing);
            const std::size_t count = std::min(made.size(), kMostCalls);
            for (std::size_t i = 0; i < count * 2; ++i)
            {
                const Leavings leavings = i % 2 == 0 ? Leavings::Nothing : Leavings::ItsResults;
                for (const unsigned length : Lengths())
                {
                    const Story story = TryFailing(operation, i / 2 + 1, i / 2 + length, leavings);
                    ++pairs;
                    if (operation.kind == Kind::Single)
                        EXPECT_EQ(Expected(operation, failed, leavings, untouched), story)
                            << operation.name << " with " << failed.size() << " failing from " << platform::NameOf(failed.at(0));
                    else
                        EXPECT_TRUE(MayBe(operation, story, untouched)) << "call " << i / 2 + 1;
                    if (failed.size() < length)
                        break;
                }
            }
        }
    }
    std::cout << pairs << " pairs of an operation and a failure\n";
    EXPECT_GT(pairs, 2000);
}

} // namespace
