#include "SimCard.h"
#include "Verbs.h"

#include <DASimManager.h>
#include <DASystem.h>
#include <DeviceControl.h>

namespace
{

/// The telephony handles of all slots, closed with their owner.
class HandleList
{
public:
    HandleList()
    {
        if (!DASystem::GetInstance()->InitHandleList(&list_))
            throw Failure(Exit::No, "the telephony of this device cannot be started");
    }
    HandleList(const HandleList&) = delete;
    HandleList& operator=(const HandleList&) = delete;
    ~HandleList() { DASystem::GetInstance()->DeinitHandleList(&list_); }

    const telephony_handle_list_s& operator*() const { return list_; }

private:
    telephony_handle_list_s list_{};
};

constexpr char kNoAnswer[] = "modem does not answer";

/// One slot while its fields are read. Card status and service type are read at once, because the status of a card that is starting
/// may change from one read to the next.
struct Slot
{
    Slot(const telephony_handle_list_s& handles, int slot, std::string cp, Identifiers shown)
        : list(handles), index(slot), cpName(std::move(cp)), identifiers(shown)
    {
        TelSimCardStatus_t status = kUnread;
        DASystem::GetInstance()->IsAvaliableSendSMS(index, &status, &serviceType);
        card = status == kUnread ? "" : CardStatusWord(status);
        const bool isReady = status == TAPI_SIM_STATUS_SIM_INIT_COMPLETED;
        reason = card.empty() || isReady ? kNoAnswer : card;
    }

    static constexpr auto kUnread = static_cast<TelSimCardStatus_t>(-1);

    const telephony_handle_list_s& list;
    const int index;
    mutable std::string cpName; ///< mutable for platform calls that only read a char*
    const Identifiers identifiers;
    std::string card;     ///< status in words; empty when it could not be read
    std::string reason;   ///< why a value is missing, unless a better reason is known
    int serviceType = -1; ///< -1 when it could not be read
};

/// The value of a field, or why it is missing. kFields has its name.
Field Held(Value value)
{
    return {"", std::move(value)};
}
Field Gone(const std::string& reason)
{
    return Missing("", reason);
}
/// A field that is missing because a ready card does not have it, or because the slot cannot be read.
Field GoneFromCard(const Slot& slot, const char* key, const char* reason)
{
    const std::string known = kiv::platform::ReasonFor("sim" + std::to_string(slot.index) + "." + key);
    return Gone(slot.reason != kNoAnswer ? slot.reason : known.empty() ? reason : known);
}

Field TextOrGone(const LibraryText& text, const Slot& slot, const char* key)
{
    return text ? Held(std::string(text.get())) : GoneFromCard(slot, key, kNoAnswer);
}

Field SimState(const Slot& slot)
{
    static constexpr Word kWords[] = {{TELEPHONY_SIM_STATE_UNAVAILABLE, "unavailable"}, {TELEPHONY_SIM_STATE_LOCKED, "locked"},
        {TELEPHONY_SIM_STATE_AVAILABLE, "available"}, {TELEPHONY_SIM_STATE_UNKNOWN, "unknown"}};
    telephony_sim_state_e state{};
    return DASimManager::GetInstance()->GetSimState(&slot.list.handle[slot.index], &state) ? Held(WordFor(kWords, state))
                                                                                           : Gone(kNoAnswer);
}

LibraryText ReadMcc(const Slot& slot)
{
    const char* mcc = nullptr;
    DASimManager::GetInstance()->GetMCCFromSim(slot.list, slot.index, &mcc);
    return LibraryText(const_cast<char*>(mcc)); // the caller owns the copy, although its type is const
}

LibraryText Read(const Slot& slot, int (DASimManager::*read)(telephony_handle_list_s, int, char**))
{
    char* text = nullptr;
    (DASimManager::GetInstance()->*read)(slot.list, slot.index, &text);
    return LibraryText(text);
}

Field Country(const Slot& slot)
{
    const LibraryText mcc = ReadMcc(slot);
    if (!mcc)
        return GoneFromCard(slot, "mcc", kNoAnswer);
    char* name = nullptr;
    DASystem::GetInstance()->GetCountryNameFromMcc(mcc.get(), &name);
    const LibraryText owner(name);
    return TextOr("", name, "no country has this MCC");
}

Field Imsi(const Slot& slot)
{
    const LibraryText imsi = Read(slot, &DASimManager::GetIMSIFromSim);
    return imsi ? Masked(Held(std::string(imsi.get())), 5, 0, slot.identifiers) : GoneFromCard(slot, "mcc", kNoAnswer);
}

Field Number(const Slot& slot)
{
    const LibraryText number = Read(slot, &DASimManager::GetPhoneNumberFromSim);
    if (number)
        return Masked(Held(std::string(number.get())), 0, 2, slot.identifiers);
    return GoneFromCard(slot, "number", "none given");
}

Field Service(const Slot& slot)
{
    static constexpr Word kWords[] = {{0, "unknown"}, {1, "none"}, {2, "emergency only"}, {3, "searching"}};
    if (slot.serviceType < 0)
        return Gone(kNoAnswer);
    return Held(slot.serviceType > 3 ? "in service" : WordFor(kWords, slot.serviceType));
}

Field ServiceType(const Slot& slot)
{
    return slot.serviceType < 0 ? Gone(kNoAnswer) : Held(std::int64_t{slot.serviceType});
}

Field Roaming(const Slot& slot)
{
    bool roaming = false;
    if (DASystem::GetInstance()->GetRoamingStatus(slot.index, &roaming))
        return Held(roaming);
    return Gone(slot.reason == kNoAnswer ? "not in service" : slot.reason);
}

Field Sms(const Slot& slot)
{
    int status = 0;
    return DASystem::GetInstance()->CheckSmsEnabled(slot.cpName.data(), &status) ? Held(status ? "ready" : "not ready")
                                                                                 : Gone(kNoAnswer);
}

/// The purposes that this slot's SIM is the default for.
Field DefaultFor(const Slot& slot)
{
    DASystem* const system = DASystem::GetInstance();
    TelNetworkDefaultSubs_t network = TAPI_NETWORK_DEFAULT_SUBS_UNKNOWN;
    TelCallPreferredVoiceSubs_t voice = TAPI_CALL_PREFERRED_VOICE_SUBS_UNKNOWN;
    TelNetworkDefaultDataSubs_t data = TAPI_NETWORK_DEFAULT_DATA_SUBS_UNKNOWN;
    const bool wereRead = system->GetMainSimSubscription(slot.cpName.data(), &network) &&
                          system->GetCallPreferredSubscription(slot.cpName.data(), &voice) &&
                          system->GetDefaultDataSubscription(slot.cpName.data(), &data);
    if (!wereRead)
        return Gone(kNoAnswer);
    std::vector<std::string> roles;
    if (network == slot.index)
        roles.emplace_back("network");
    if (voice == slot.index)
        roles.emplace_back("voice");
    if (data == slot.index)
        roles.emplace_back("data");
    return Held(roles);
}

struct SlotField
{
    const char* name;
    Field (*read)(const Slot&);
};

const SlotField kFields[] = {
    {"slot", [](const Slot& slot) { return Held(std::int64_t{slot.index}); }},
    {"cp_name", [](const Slot& slot) { return Held(slot.cpName); }},
    {"state", SimState},
    {"card", [](const Slot& slot) { return slot.card.empty() ? Gone(kNoAnswer) : Held(slot.card); }},
    {"mcc", [](const Slot& slot) { return TextOrGone(ReadMcc(slot), slot, "mcc"); }},
    {"country", Country},
    {"mnc", [](const Slot& slot) { return TextOrGone(Read(slot, &DASimManager::GetMNCFromSim), slot, "mcc"); }},
    {"imsi", Imsi},
    {"number", Number},
    {"service", Service},
    {"service_type", ServiceType},
    {"roaming", Roaming},
    {"sms", Sms},
    {"default_for", DefaultFor},
};

} // namespace

Exit ShowSims(const SimOptions& options, const Command& command)
{
    const std::vector<std::string> cpNames = RequireCpNames();
    const HandleList handles;
    std::vector<Record> rows;
    for (const int index : RequireSlots(options.slot, std::min<size_t>((*handles).count, cpNames.size())))
    {
        const Slot slot(*handles, index, cpNames[static_cast<size_t>(index)], command.identifiers);
        Record row;
        for (const SlotField& field : kFields)
        {
            row.push_back(field.read(slot));
            row.back().name = field.name;
        }
        rows.push_back(std::move(row));
    }
    PrintTable(rows, command.form);
    return Exit::Done;
}
