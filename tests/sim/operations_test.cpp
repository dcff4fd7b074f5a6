// The operations on one SIM: what each gives, writes and logs when all goes well and when one of its platform calls fails, and
// under which lock each call is made.
#include "sim/SimTest.h"

#include <algorithm>
#include <climits>
#include <glib.h>
#include <map>
#include <tuple>
#include <utility>

namespace
{

using namespace kiv::test;
namespace sim = kiv::sim;

const Calls kState{Call::telephony_sim_get_state};
const Calls kNumber{Call::telephony_sim_get_subscriber_number};
const Calls kImsi{Call::tel_get_cp_name_list, Call::tel_init, Call::tel_get_sim_imsi};
const std::string kNotAvailable = ErrorLine("IsSimAvailable", "Sim is not available");

const Story& StoryOf(const Operation& operation, Call failing)
{
    for (const auto& [calls, story] : operation.failures)
    {
        if (testing::Value(calls, testing::Contains(failing)))
            return story;
    }
    return operation.good;
}

/// Runs a member that lets the platform write values, which are told when they were read.
template <class Class, class Key, class... Values>
decltype(Operation::run) Reading(bool (Class::*read)(Key, Values*...))
{
    return [read](const Slots& slots, int slot)
    {
        char modem[] = "modem1";
        const auto key = std::get<Key>(std::tuple<int, char*, telephony_data**>(slot, modem, &slots.handle[1]));
        std::tuple<Values...> values;
        const auto ask = [&](auto&... each)
        { return (Class::GetInstance()->*read)(key, &each...) ? Tell(true, each...) : "false"; };
        return std::apply(ask, values);
    };
}

template <class Char>
Operation TextRow(const char* name, int (DASimManager::*read)(Slots, int, Char**), const Calls& reads, const char* good,
    const char* bad, const char* failure)
{
    const auto run = [read](const Slots& slots, int slot)
    {
        Char* text = before;
        const int code = (DASimManager::GetInstance()->*read)(slots, slot, &text);
        return Tell(code, Take(text));
    };
    return {name, {kState[0], reads.back()}, run, {good},
        {{kState, {bad, kNotAvailable, ErrorLine(name, failure)}}, {reads, {bad, ErrorLine(name, failure)}}}, kState[0]};
}

std::string InitAndDeinit(const Slots&, int)
{
    Slots slots{};
    const bool isOpen = DASystem::GetInstance()->InitHandleList(&slots);
    const bool isClosed = DASystem::GetInstance()->DeinitHandleList(&slots);
    return Tell(isOpen, isClosed);
}

std::string CpNames(const Slots&, int)
{
    char** const names = DASystem::GetInstance()->GetCpNameList();
    std::string told = names == nullptr ? "null" : Tell(names[0], names[1], names[2] == nullptr);
    g_strfreev(names);
    return told;
}

std::string SimInfo(const Slots&, int)
{
    std::string mcc = "as", mnc = "they", msin = "were";
    const bool isRead = DASystem::GetInstance()->GetSimInfo("modem1", &mcc, &mnc, &msin);
    return Tell(isRead, mcc, mnc, msin);
}

std::string PhoneNumber(const Slots& slots, int slot)
{
    char* number = before;
    const bool isRead = DASystem::GetInstance()->GetPhoneNumber(&slots.handle[slot], &number);
    const std::string text = Take(number);
    return isRead ? Tell(true, text) : "false";
}

std::string Roaming(const Slots&, int slot)
{
    bool roaming = true;
    const bool isRead = DASystem::GetInstance()->GetRoamingStatus(slot, &roaming);
    return Tell(isRead, roaming);
}

std::string Exist(const Slots&, int)
{
    return Tell(DASystem::GetInstance()->IsSimExist());
}

std::string Dual(const Slots&, int)
{
    return Tell(DASystem::GetInstance()->IsDualSimAvailable());
}

const std::string kEnter = "I DASimManager.cpp GetPhoneNumber > Enter";
const std::string kBefore = "I DASimManager.cpp GetPhoneNumber > Before telephony_sim_get_subscriber_number";
const std::string kAfter = "I DASimManager.cpp GetPhoneNumber > After telephony_sim_get_subscriber_number";

const std::vector<Operation> kOperations = {
    {"InitHandleList", kWhole, InitAndDeinit, {"true true"},
        {{{Call::telephony_init}, {"false true"}}, {{Call::telephony_deinit}, {"true false"}}}},
    {"GetCpNameList", kWhole, CpNames, {"modem0 modem1 true"}, {{{kImsi[0]}, {"null"}}}},
    {"GetSimState", kWhole, Reading(&DASimManager::GetSimState), {"true 2"}, {{kState, {"false"}}}},
    {"IsSimExist", kWhole, Exist, {"true"}, {{{Call::telephony_init}, {"false"}}}},
    {"IsDualSimAvailable", kState, Dual, {"true"},
        {{{Call::telephony_init}, {"false", ErrorLine("SuccessToInitTelephonyHandle", "telephony_init Failed.")}},
            {kState, {"false", kNotAvailable}}}},
    {"IsAvaliableState", kWhole, Reading(&DASystem::IsAvaliableState), {"true 3"},
        {{{kImsi[0], kImsi[1], Call::tel_get_sim_init_info}, {"false"}}}, kImsi[0]},
    TextRow("GetMCCFromSim", &DASimManager::GetMCCFromSim, kImsi, "0 451", "4 null", "fail to get MCC"),
    TextRow("GetMNCFromSim", &DASimManager::GetMNCFromSim, kImsi, "0 012", "4 null", "fail to get MNC"),
    TextRow("GetIMSIFromSim", &DASimManager::GetIMSIFromSim, kImsi, "0 4510120123456781", "4 null", "fail to get imsi"),
    TextRow("GetPhoneNumberFromSim", &DASimManager::GetPhoneNumberFromSim, kNumber, "0 +491515550001", "-39841791 null",
        "fail to get phoneNumber"),
    {"GetPhoneNumber", kWhole, PhoneNumber, {"true +491515550001", kEnter, kBefore, kAfter},
        {{kNumber, {"false", kEnter, kBefore, ErrorLine("GetPhoneNumber", "telephony_sim_get_subscriber_number errno [-17]")}}}},
    {"GetSimInfo", kWhole, SimInfo, {"true 451 012 0123456781"},
        {{{kImsi[1]}, {"false as they were", ErrorLine("GetSimInfo", "tel_init error")}},
            {{kImsi[2]}, {"false as they were", ErrorLine("GetSimInfo", "tel_get_sim_imsi errno [-17]")}}}},
    {"GetRoamingStatus", kWhole, Roaming, {"true false"},
        {{{Call::telephony_init, Call::telephony_network_get_service_state, Call::telephony_network_get_roaming_status},
            {"false true"}}},
        Call::telephony_init},
    {"GetMainSimSubscription", kWhole, Reading(&DASystem::GetMainSimSubscription), {"true 1"},
        {{{kImsi[1], Call::tel_get_network_default_subscription}, {"false"}}}},
    {"GetCallPreferredSubscription", kWhole, Reading(&DASystem::GetCallPreferredSubscription), {"true 7"},
        {{{kImsi[1], Call::tel_get_call_preferred_voice_subscription}, {"false"}}}},
    {"GetDefaultDataSubscription", kWhole, Reading(&DASystem::GetDefaultDataSubscription), {"true -1"},
        {{{kImsi[1], Call::tel_get_network_default_data_subscription}, {"false"}}}},
    {"CheckSmsEnabled", kWhole, Reading(&DASystem::CheckSmsEnabled), {"true 1"},
        {{{kImsi[1], Call::tel_check_sms_device_status}, {"false"}}}},
    {"IsAvaliableSendSMS", kWhole, Reading(&DASystem::IsAvaliableSendSMS),
        {"true 3 5", ErrorLine("IsAvaliableSendSMS", "NetworkSvc[5]")},
        {{{kImsi[0], kImsi[1], Call::tel_get_property_int}, {"false"}},
            {{Call::tel_get_sim_init_info}, {"false", ErrorLine("IsAvaliableSendSMS", "Not available. ret[-17]")}}},
        kImsi[0]},
};

using SimOperations = SimTest;

TEST_F(SimOperations, GiveTheirTabledResultsAndCloseAllWhicheverCallFails)
{
    for (const Operation& operation : kOperations)
    {
        EXPECT_EQ(operation.good, Try(operation));
        EXPECT_FALSE(made.empty());
        std::map<Call, unsigned> numbers;
        for (const Call call : Calls(made))
        {
            const auto which = sim::Only(++numbers[call]);
            const bool isOpening = call == Call::telephony_init || call == Call::tel_init;
            const bool isRelease = call == Call::telephony_deinit || call == Call::tel_deinit;
            for (const auto leavings : {sim::Leavings::kNothing, sim::Leavings::kItsResults})
            {
                // A release that fails has released; what a failed opening opened, nobody could close.
                if (leavings == sim::Leavings::kNothing ? isRelease : isOpening)
                    continue;
                const auto arm = [&] { sim::FailCall(call, -17, which, sim::kNoSlot, leavings); };
                EXPECT_EQ(StoryOf(operation, call), Try(operation, arm)) << operation.name << ": " << sim::NameOf(call);
            }
        }
    }
}

TEST_F(SimOperations, FailWithoutAPlatformCallOnASlotThatIsNotThere)
{
    const Calls allowed{Call::telephony_init, Call::telephony_deinit, Call::tel_get_cp_name_list};
    for (const Operation& operation : kOperations)
    {
        if (operation.likeBadSlot == kNoCall)
            continue;
        for (const int slot : {-1, 2, INT_MAX, INT_MIN})
        {
            EXPECT_EQ(StoryOf(operation, operation.likeBadSlot), Try(operation, nullptr, slot)) << slot;
            EXPECT_THAT(made, testing::Each(testing::AnyOfArray(allowed)));
        }
    }
}

TEST_F(SimOperations, FailWhenTheirLockCanNotBeMade)
{
    for (const Operation& operation : kOperations)
    {
        const std::string good = Try(operation)[0];
        bool isRefused = !operation.locked.empty() && operation.name != "InitHandleList"; // the list would stay open for a retry
        for (int number = 1; isRefused; ++number)
        {
            const std::string result = Try(operation, [&] { refusedLock = number; })[0];
            isRefused = std::exchange(refusedLock, 0) == 0;
            EXPECT_EQ(isRefused, result != good) << operation.name << " at its lock " << number;
        }
    }
}

TEST_F(SimOperations, JudgeWhatTheModemSays)
{
    const auto line = [](const char* state) { return ErrorLine("IsSimExist", "SIM STATE[1] : " + std::string(state)); };
    const auto service = [](const char* type) { return ErrorLine("IsAvaliableSendSMS", "NetworkSvc[" + std::string(type) + ']'); };
    const struct
    {
        const char* operation;
        void (*change)(sim::SimSlot& slot);
        Story story;
    } cases[] = {
        {"IsSimExist", [](sim::SimSlot& slot) { slot.simState = 0; }, {"true", line("TELEPHONY_SIM_STATE_UNAVAILABLE")}},
        {"IsSimExist", [](sim::SimSlot& slot) { slot.simState = 3; }, {"true", line("TELEPHONY_SIM_STATE_UNKNOWN")}},
        {"IsSimExist", [](sim::SimSlot& slot) { slot.simState = 4; }, {"true", line("-")}},
        {"GetMCCFromSim", [](sim::SimSlot& slot) { slot.simState = 3; },
            {"4 null", kNotAvailable, ErrorLine("GetMCCFromSim", "fail to get MCC")}},
        {"GetSimState", [](sim::SimSlot& slot) { slot.simState = 17; }, {"true 17"}},
        {"GetRoamingStatus", [](sim::SimSlot& slot) { slot.serviceState = 1; }, {"false true"}},
        {"GetRoamingStatus", [](sim::SimSlot& slot) { slot.serviceState = 2; }, {"false true"}},
        {"GetRoamingStatus", [](sim::SimSlot& slot) { slot.roaming = true; }, {"true true"}},
        {"GetPhoneNumber", [](sim::SimSlot& slot) { slot.number = ""; }, {"true ", kEnter, kBefore, kAfter}},
        {"GetPhoneNumber", [](sim::SimSlot& slot) { slot.number.reset(); }, {"true null", kEnter, kBefore, kAfter}},
        {"IsAvaliableSendSMS", [](sim::SimSlot& slot) { slot.serviceType = 3; }, {"false", service("3")}},
        {"IsAvaliableSendSMS", [](sim::SimSlot& slot) { slot.serviceType = 4; }, {"true 3 4", service("4")}},
        {"IsAvaliableSendSMS", [](sim::SimSlot& slot) { slot.cardStatus = {99}; }, {"true 99 5", service("5")}},
    };
    for (const auto& [name, change, story] : cases)
    {
        const auto wanted = [&any = name](const Operation& operation) { return operation.name == any; };
        const auto operation = std::find_if(kOperations.begin(), kOperations.end(), wanted);
        const auto arm = [&each = change] { sim::ChangeDevice([&](sim::Device& device) { each(device.slots[1]); }); };
        EXPECT_EQ(story, Try(*operation, arm)) << name;
    }
}

} // namespace
