// The facade's questions about all SIMs, on devices where some do not answer; slots that are not there; and values that
// no profile holds.
#include "sweep/Sweep.h"

#include <DASimManager.h>
#include <DASystem.h>

#include <climits>
#include <numeric>

namespace
{

using namespace kiv::test;
namespace sim = kiv::sim;

std::string Line(const std::string& function, const std::string& text)
{
    return "E DASimManager.cpp " + function + " > " + text;
}
const std::string kNotAvailable = Line("IsSimAvailable", "Sim is not available");

struct Slots : Sweep
{
    Story Ask(const Operation& operation)
    {
        return Try(
            operation, [] {}, [] {});
    }
};

TEST_F(Slots, ThatDoNotAnswerArePassedOver)
{
    // The first and the fourth are locked, the second is without IMSI and number.
    const std::vector<sim::SimSlot> slots = {{"modem0", {4}, {}, "449", "04", "0123456789", "0000", {}},
        {"modem1", {3}, {}, {}, "05", "0123456780", {}, {}}, {"modem2", {3}, {}, "451", "012", "0123456781", "", {}},
        {"modem3", {4}, {}, "452", "99", "0123456782", "0003", {}}, {"modem4", {3}, {}, "453", "98", "0123456783", "0004", {}}};
    const std::tuple<std::string, std::string, std::string, std::string, std::string> texts[] = {{"MCC", "MCC", "4", "451", "453"},
        {"MNC", "MNC", "4", "012", "98"}, {"IMSI", "imsi", "4", "4510120123456781", "453980123456783"},
        {"PhoneNumber", "phoneNumber", "-39841791", "", "0004"}};
    for (const auto& [member, what, failed, text2, text4] : texts)
    {
        const Operation& first = Find("DASystem::Get" + member + "FromSim(char**)");
        const Operation& every = Find("DASystem::Get" + member + "FromSim(std::vector<char*, std::allocator<char*> >*, int*)");
        const std::string line = Line("Get" + member + "FromSim", "fail to get " + what);
        device.slots = slots;
        EXPECT_EQ((Story{"0 " + text2, kNotAvailable, line, line}), Ask(first));
        EXPECT_EQ((Story{"before " + text2 + ' ' + text4 + " 2", kNotAvailable, line, line, kNotAvailable, line}), Ask(every));
        device.slots.resize(2);
        EXPECT_EQ((Story{failed + " before", kNotAvailable, line, line}), Ask(first));
        EXPECT_EQ((Story{"before 0", kNotAvailable, line, line}), Ask(every));
    }
    const auto locked = [](const char* slot)
    { return Line("IsSimExist", std::string("SIM STATE[") + slot + "] : TELEPHONY_SIM_STATE_LOCKED"); };
    device.slots = slots;
    EXPECT_EQ((Story{"true", kNotAvailable}), Ask(Find("DASystem::IsSimAvailable()")));
    EXPECT_EQ((Story{"true", locked("0"), locked("3")}), Ask(Find("DASystem::IsSimExist()")));
    EXPECT_EQ((Story{"false", kNotAvailable}), Ask(Find("DASystem::IsDualSimAvailable()")));
    device.slots.resize(1);
    EXPECT_EQ((Story{"false", kNotAvailable}), Ask(Find("DASystem::IsSimAvailable()")));
    EXPECT_EQ((Story{"false", locked("0")}), Ask(Find("DASystem::IsSimExist()")));
    EXPECT_EQ((Story{"false", "E DASystem.cpp IsDualSimAvailable > [Single Sim Device] Not support Dual Sim."}),
        Ask(Find("DASystem::IsDualSimAvailable()")));
}

TEST_F(Slots, ThatAreNotThereFailWithoutACallToAModem)
{
    auto& manager = *DASimManager::GetInstance();
    const Session session;
    sim::SetCallHook(
        [](Call call, int)
        {
            EXPECT_THAT((Calls{Call::telephony_init, Call::telephony_deinit, Call::tel_get_cp_name_list}), testing::Contains(call));
            return "";
        });
    for (const int slot : {-1, 2, INT_MAX, INT_MIN})
    {
        char* text = nullptr;
        const char* mcc = nullptr;
        bool isRoaming = true;
        auto status = TAPI_SIM_STATUS_UNKNOWN;
        int serviceType = 0;
        pauses = 0;
        EXPECT_FALSE(manager.IsSimAvailable(session.given, slot) || manager.IsAvaliableState(slot, &status) ||
                     manager.IsAvaliableSendSMS(slot, &status, &serviceType) || manager.GetRoamingStatus(slot, &isRoaming) ||
                     manager.GetMCCFromSim(session.given, slot, &mcc) == 0 ||
                     manager.GetIMSIFromSim(session.given, slot, &text) == 0 ||
                     manager.GetPhoneNumberFromSim(session.given, slot, &text) == 0 ||
                     manager.IsAvaliableSimStateOnPolling(slot, 0, &status) || !isRoaming);
        EXPECT_EQ(100, pauses) << "of the one that waits for a modem";
    }
    sim::SetCallHook(nullptr);
}

TEST_F(Slots, AreJudgedByWhatTheModemSays)
{
    const auto state = [](const char* name) { return Story{"true", Line("IsSimExist", "SIM STATE[1] : " + std::string(name))}; };
    const auto service = [](const char* told, const char* type) {
        return Story{told, Line("IsAvaliableSendSMS", "NetworkSvc[" + std::string(type) + ']')};
    };
    const char kExist[] = "DASystem::IsSimExist()", kRoaming[] = "DASystem::GetRoamingStatus(int, bool*)",
               kSms[] = "DASystem::IsAvaliableSendSMS(int, TelSimCardStatus_t*, int*)";
    const std::tuple<const char*, void (*)(sim::SimSlot&), Story> cases[] = {
        {kExist, [](sim::SimSlot& slot) { slot.simState = 0; }, state("TELEPHONY_SIM_STATE_UNAVAILABLE")},
        {kExist, [](sim::SimSlot& slot) { slot.simState = 3; }, state("TELEPHONY_SIM_STATE_UNKNOWN")},
        {kExist, [](sim::SimSlot& slot) { slot.simState = 4; }, state("-")},
        {"DASimManager::IsSimAvailable(telephony_handle_list_s, int)", [](sim::SimSlot& slot) { slot.simState = 3; },
            {"false", kNotAvailable}},
        {kRoaming, [](sim::SimSlot& slot) { slot.serviceState = 2; }, {"false true"}},
        {kRoaming, [](sim::SimSlot& slot) { slot.roaming = true; }, {"true true"}},
        {"DASystem::IsDualSimAvailable()", [](sim::SimSlot& slot) { slot.cardStatus = {4}; }, {"false", kNotAvailable}},
        {kSms, [](sim::SimSlot& slot) { slot.serviceType = 3; }, service("false", "3")},
        {kSms, [](sim::SimSlot& slot) { slot.serviceType = 4; }, service("true 3 4", "4")},
        {kSms, [](sim::SimSlot& slot) { slot.cardStatus = {99}; }, service("true 99 6", "6")},
    };
    for (const auto& [name, change, story] : cases)
    {
        Use("dual");
        change(device.slots[1]);
        EXPECT_EQ(story, Ask(Find(name))) << name;
    }
}

// How the card statuses 0 to 14 are judged: yes, no, wait. 255 is judged as 2; any other, as 0.
// status                     0    5    10  14
constexpr char kUsable[] = "nnnynnnnnnnnnnn";
constexpr char kPolled[] = "nnwywwnwwwwnwnw";
constexpr char kWaiting[] = "nnynyynyyyynynn";

struct CardStatus : Slots
{
    /// @param script  the statuses of the card
    /// @param read    those that are read; none when no modem opens
    /// @param waits   between the reads
    void ExpectPolling(const std::vector<int>& script, const std::vector<int>& read, int waits, int failedOpenings = 0,
        Call failing = Call::tel_init, sim::CallNumbers which = {0, 0})
    {
        const std::string place = " DASimManager.cpp IsAvaliableSimStateOnPolling > ", waited = std::to_string(waits);
        const bool isUsable = !read.empty() && read.back() == TAPI_SIM_STATUS_SIM_INIT_COMPLETED;
        Story story{isUsable ? "true 3" : "false"};
        for (int attempt = 1; attempt <= failedOpenings; ++attempt)
            story.push_back('E' + place + "wait tel_init[" + std::to_string(attempt) + ']');
        for (const int status : read)
            story.push_back('I' + place + "current SIM Status[" + std::to_string(status) + ']');
        story.push_back(read.empty() ? 'E' + place + "TapiHandle is null. fail."
                                     : 'I' + place + "slotNum[1], result[" + (isUsable ? '1' : '0') + "], status[" +
                                           std::to_string(read.back()) + "], time[" + waited + ']');
        device.slots[1].cardStatus = script;
        const Operation& polling = Find("DASystem::IsAvaliableSimStateOnPolling(int, int, TelSimCardStatus_t*)");
        EXPECT_EQ(story, Try(
                             polling, [&] { sim::FailCall(failing, -17, which); }, sim::ClearFaults));
        EXPECT_EQ(failedOpenings + waits, pauses);
    }
};

TEST_F(CardStatus, IsJudgedThreeWays)
{
    std::vector<int> values(21);
    std::iota(values.begin(), values.end(), 0);
    values.insert(values.end(), {254, 255, 256, -1, -3, -255, INT_MIN, INT_MAX});
    for (const int value : values)
    {
        const auto column = static_cast<std::size_t>(value == 255 ? 2 : value >= 0 && value <= 14 ? value : 0);
        auto status = static_cast<TelSimCardStatus_t>(value);
        EXPECT_EQ(kWaiting[column] == 'y', DASystem::GetInstance()->IsWaittingSimCheck(status)) << value;
        const int waits = kPolled[column] == 'w' ? 1 : 0;
        ExpectPolling({value, 3}, waits > 0 ? std::vector{value, 3} : std::vector{value}, waits);

        sim::ChangeDevice([&](sim::Device& changed) { changed.slots[0].cardStatus = {value}; });
        EXPECT_EQ(kUsable[column] == 'y', DASystem::GetInstance()->IsAvaliableState(0, &status)) << value;
        EXPECT_EQ(value, status);
    }
}

TEST_F(CardStatus, IsPolledOnceASecondUntilItIsDecidedWhicheverCallFails)
{
    ExpectPolling({2, 2, 4, 3}, {2, 2, 4, 3}, 3);
    ExpectPolling({255, 14, 14, 11}, {255, 14, 14, 11}, 3);
    ExpectPolling({3}, {}, 0, 100, Call::tel_get_cp_name_list, sim::Only(1));
    ExpectPolling({3}, {}, 0, 100, Call::tel_init, sim::kEveryCall);
    ExpectPolling({3}, {3}, 0, 99, Call::tel_init, {1, 99});
    ExpectPolling({2, 3}, {2, 3}, 3, 0, Call::tel_get_sim_init_info, {2, 3});
    ExpectPolling({2, 6}, {2, 6}, 401, 0, Call::tel_get_sim_init_info, {1, 400});
}

} // namespace
