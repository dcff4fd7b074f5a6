// How card statuses are judged, and the wait for a usable card.
#include "sim/SimTest.h"

#include <climits>
#include <numeric>

namespace
{

using namespace kiv::test;
namespace sim = kiv::sim;

// How the statuses 0 to 14 are judged: yes, no, wait. 255 is judged as 2; any other, as 0.
// status                     0    5    10  14
constexpr char kUsable[] = "nnnynnnnnnnnnnn";
constexpr char kPolled[] = "nnwywwnwwwwnwnw";
constexpr char kWaiting[] = "nnynyynyyyynynn";

struct CardStatus : SimTest
{
    /// @param script  the statuses of the card
    /// @param read    those that are read; none when no modem opens
    /// @param waits   between the reads
    void ExpectPolling(const std::vector<int>& script, const std::vector<int>& read, int waits, int failedOpenings = 0,
        Call failing = kNoCall, sim::CallNumbers which = sim::kEveryCall, int slot = 1)
    {
        const bool isUsable = !read.empty() && read.back() == TAPI_SIM_STATUS_SIM_INIT_COMPLETED;
        const std::string place = " DASimManager.cpp IsAvaliableSimStateOnPolling > ";
        Story story{Tell(isUsable)};
        for (int attempt = 1; attempt <= failedOpenings; ++attempt)
            story.push_back('E' + place + "wait tel_init[" + Tell(attempt) + ']');
        for (const int status : read)
            story.push_back('I' + place + "current SIM Status[" + Tell(status) + ']');
        const std::string end = "], time[" + Tell(waits) + ']';
        story.push_back(read.empty()
                            ? 'E' + place + "TapiHandle is null. fail."
                            : 'I' + place + "slotNum[1], result[" + Tell(int{isUsable}) + "], status[" + Tell(read.back()) + end);

        const auto run = [](const Slots&, int polled)
        {
            auto status = static_cast<TelSimCardStatus_t>(77);
            return Tell(DASystem::GetInstance()->IsAvaliableSimStateOnPolling(polled, INT_MIN, &status));
        };
        const auto arm = [&]
        {
            sim::ChangeDevice([&](sim::Device& device) { device.slots[1].cardStatus = script; });
            sim::FailCall(failing, -17, which);
        };
        pauses = 0;
        EXPECT_EQ(story, Try({"polling", {}, run}, arm, slot));
        EXPECT_EQ(failedOpenings + waits, pauses);
    }
};

TEST_F(CardStatus, JudgesEveryCardStatusThreeWays)
{
    std::vector<int> values(21);
    std::iota(values.begin(), values.end(), 0);
    values.insert(values.end(), {254, 255, 256, -1, -3, -255, INT_MIN, INT_MAX});
    for (const int value : values)
    {
        const auto column = static_cast<std::size_t>(value == 255 ? 2 : value >= 0 && value <= 14 ? value : 0);
        const auto status = static_cast<TelSimCardStatus_t>(value);
        EXPECT_EQ(kWaiting[column] == 'y', DASystem::GetInstance()->IsWaittingSimCheck(status)) << value;
        const int waits = kPolled[column] == 'w' ? 1 : 0;
        ExpectPolling({value, 3}, waits > 0 ? std::vector{value, 3} : std::vector{value}, waits);

        sim::ChangeDevice([&](sim::Device& device) { device.slots[0].cardStatus = {value}; });
        auto read = static_cast<TelSimCardStatus_t>(77);
        EXPECT_EQ(kUsable[column] == 'y', DASystem::GetInstance()->IsAvaliableState(0, &read)) << value;
        EXPECT_EQ(status, read);
    }
}

TEST_F(CardStatus, IsPolledOnceASecondUntilItIsDecidedWhicheverCallFails)
{
    ExpectPolling({2, 2, 4, 3}, {2, 2, 4, 3}, 3);
    ExpectPolling({255, 14, 14, 11}, {255, 14, 14, 11}, 3);
    ExpectPolling({3}, {}, 0, 100, Call::tel_get_cp_name_list, sim::Only(1));
    ExpectPolling({3}, {}, 0, 100, Call::tel_init);
    ExpectPolling({3}, {3}, 0, 99, Call::tel_init, {1, 99});
    ExpectPolling({2, 3}, {2, 3}, 3, 0, Call::tel_get_sim_init_info, {2, 3});
    ExpectPolling({2, 6}, {2, 6}, 401, 0, Call::tel_get_sim_init_info, {1, 400});
    for (const int slot : {-1, 2, INT_MAX})
        ExpectPolling({3}, {}, 0, 100, kNoCall, sim::kEveryCall, slot);
}

} // namespace
