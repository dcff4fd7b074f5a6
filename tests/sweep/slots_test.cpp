// SIM queries with SIMs that do not answer, slots that do not exist, and values that no profile contains.
#include "sweep/Sweep.h"

#include <DASimManager.h>
#include <DASystem.h>

namespace
{

using namespace kiv::test;
namespace platform = kiv::platform;

const std::string kManager = "E DASimManager.cpp ";

struct Slots : Sweep
{
    /// Returns the outcome of the operation with that name on the device.
    Story Ask(const std::string& operation) { return Try(Find(operation)); }

    DASystem& facade = *DASystem::GetInstance();
};

TEST_F(Slots, ThatDoNotAnswerAreSkipped)
{
    // The first and the fourth are locked, the second is without IMSI and number.
    const std::vector<platform::SimSlot> slots = {{"modem0", {4}, {}, "449", "04", "0123456789", "0000", {}},
        {"modem1", {3}, {}, {}, "05", "0123456780", {}, {}}, {"modem2", {3}, {}, "451", "012", "0123456781", "", {}},
        {"modem3", {4}, {}, "452", "99", "0123456782", "0003", {}}, {"modem4", {3}, {}, "453", "98", "0123456783", "0004", {}}};
    const std::tuple<std::string, std::string, std::string, std::string> texts[] = {{"MCC", "451", "453", "4"},
        {"MNC", "012", "98", "4"}, {"IMSI", "4510120123456781", "453980123456783", "4"}, {"PhoneNumber", "", "0004", "-39841791"}};
    for (const auto& [member, text2, text4, failed] : texts)
    {
        const std::string first = "DASystem::Get" + member + "FromSim(char**)";
        const std::string every = "DASystem::Get" + member + "FromSim(std::vector<char*, std::allocator<char*> >*, int*)";
        device.slots = slots;
        EXPECT_EQ("0 " + text2, Ask(first)[0]);
        EXPECT_EQ("before " + text2 + ' ' + text4 + " 2", Ask(every)[0]);
        device.slots.resize(2);
        const Story unanswered = Ask(first);
        EXPECT_EQ(failed + " before", unanswered[0]);
        EXPECT_THAT(unanswered, testing::SizeIs(4)) << "with two lines of the locked one, and one of the other";
        EXPECT_EQ("before 0", Ask(every)[0]);
    }
}

TEST_F(Slots, WithANegativeNumberOrANullPointerAreRefused)
{
    const Session session;
    bool isRoaming = true;
    EXPECT_FALSE(DASimManager::GetInstance()->IsSimAvailable(session.given, -1));
    EXPECT_FALSE(facade.GetRoamingStatus(-1, &isRoaming));
    EXPECT_TRUE(isRoaming);
    EXPECT_TRUE(facade.GetRoamingStatus(0, &isRoaming)) << "the first slot is";
    EXPECT_FALSE(isRoaming);
    EXPECT_FALSE(facade.GetRoamingStatus(0, nullptr));
    EXPECT_THAT(platform::TakeMisuses(), testing::IsEmpty());
}

TEST_F(Slots, AreJudgedByTheModemsAnswers)
{
    using Of = std::vector<platform::SimSlot>;
    const char kExist[] = "DASystem::IsSimExist()", kAny[] = "DASystem::IsSimAvailable()",
               kBoth[] = "DASystem::IsDualSimAvailable()", kRoaming[] = "DASystem::GetRoamingStatus(int, bool*)",
               kSms[] = "DASystem::IsAvaliableSendSMS(int, TelSimCardStatus_t*, int*)";
    const std::string state = kManager + "IsSimExist > SIM STATE[1] : ", service = kManager + "IsAvaliableSendSMS > NetworkSvc",
                      notAvailable = kManager + "IsSimAvailable > Sim is not available",
                      notOpened = kManager + "SuccessToInitTelephonyHandle > telephony_init Failed.";
    const std::tuple<const char*, void (*)(Of&), Story> cases[] = {
        {kExist, [](Of& slots) { slots[1].simState = 0; }, {"true", state + "TELEPHONY_SIM_STATE_UNAVAILABLE"}},
        {kExist, [](Of& slots) { slots[1].simState = 1; }, {"true", state + "TELEPHONY_SIM_STATE_LOCKED"}},
        {kExist, [](Of& slots) { slots[1].simState = 3; }, {"true", state + "TELEPHONY_SIM_STATE_UNKNOWN"}},
        {kExist, [](Of& slots) { slots[1].simState = 4; }, {"true", state + "-"}},
        {kAny, [](Of& slots) { slots[0].simState = 3; }, {"true", notAvailable}},
        {kAny, [](Of& slots) { slots[0].simState = slots[1].simState = 1; }, {"false", notAvailable, notAvailable}},
        {kBoth, [](Of& slots) { slots[1].simState = 1; }, {"false", notAvailable}},
        {kBoth, [](Of& slots) { slots.clear(); }, {"false", notOpened}},
        {kBoth, [](Of& slots) { slots.resize(1); },
            {"false", "E DASystem.cpp IsDualSimAvailable > [Single Sim Device] Not support Dual Sim."}},
        {kRoaming, [](Of& slots) { slots[1].serviceState = 2; }, {"false true"}},
        {kRoaming, [](Of& slots) { slots[1].roaming = true; }, {"true true"}},
        {kSms, [](Of& slots) { slots[1].serviceType = 3; }, {"false", service + "[3]"}},
        {kSms, [](Of& slots) { slots[1].serviceType = 4; }, {"true 3 4", service + "[4]"}},
        {kSms, [](Of& slots) { slots[1].cardStatus = {99}; }, {"true 99 6", service + "[6]"}},
    };
    for (const auto& [name, change, story] : cases)
    {
        Use("dual");
        change(device.slots);
        EXPECT_EQ(story, Ask(name)) << name;
    }
}

// The meaning of the card statuses 0 to 14: yes, no, wait. 255 is like 2; any other is like 0.
// status                     0    5    10  14
constexpr char kUsable[] = "nnnynnnnnnnnnnn";
constexpr char kPolled[] = "nnwywwnwwwwnwnw";
constexpr char kWaiting[] = "nnynyynyyyynynn";

TEST_F(Slots, AreUsableWaitedForOrSkippedByCardStatus)
{
    for (int value = -1; value <= 256; ++value)
    {
        const int column = value == 255 ? 2 : value >= 0 && value <= 14 ? value : 0;
        EXPECT_EQ(kWaiting[column] == 'y', facade.IsWaittingSimCheck(static_cast<TelSimCardStatus_t>(value))) << value;

        device.slots[0].cardStatus = {value};
        device.slots[1].cardStatus = {value, 11};
        platform::SetDevice(device);
        TelSimCardStatus_t now{}, last{};
        EXPECT_EQ(kUsable[column] == 'y', facade.IsAvaliableState(0, &now)) << value;
        EXPECT_EQ(value, now);
        EXPECT_EQ(kPolled[column] == 'y', facade.IsAvaliableSimStateOnPolling(1, 0, &last)) << value;
        EXPECT_EQ(kPolled[column] == 'w' ? 11 : value, last);
    }
}

TEST_F(Slots, ArePolledOncePerSecondUntilTheCardStatusIsFinal)
{
    const std::string place = " DASimManager.cpp IsAvaliableSimStateOnPolling > ", current = 'I' + place + "current SIM Status",
                      end = 'I' + place + "slotNum[1], result";
    const std::string attempt = 'E' + place + "wait tel_init[100]", failed = 'E' + place + "TapiHandle is null. fail.";
    // The statuses of the card, what fails; the pauses, and the result with the last two lines.
    const std::tuple<std::vector<int>, Call, platform::CallNumbers, int, Story> cases[] = {
        {{2, 2, 4, 3}, Call::tel_init, {0, 0}, 3, {"true 3", current + "[3]", end + "[1], status[3], time[3]"}},
        {{3}, Call::tel_get_cp_name_list, {1, 1}, 100, {"false", attempt, failed}},
        {{3}, Call::tel_init, {1, 99}, 99, {"true 3", current + "[3]", end + "[1], status[3], time[0]"}},
        {{2, 6}, Call::tel_get_sim_init_info, {1, 400}, 401, {"false", current + "[6]", end + "[0], status[6], time[401]"}},
    };
    for (const auto& [card, failing, which, waits, expected] : cases)
    {
        device.slots[1].cardStatus = card;
        platform::FailCall(failing, -17, which);
        Story story = Ask("DASystem::IsAvaliableSimStateOnPolling(int, int, TelSimCardStatus_t*)");
        ASSERT_LE(expected.size(), story.size());
        story.erase(story.begin() + 1, story.end() - 2);
        EXPECT_EQ(expected, story);
        EXPECT_EQ(waits, pauses);
    }
}

} // namespace
