#include "Calls.h"

#include "Locked.h"
#include "Report.h"

#include <atomic>
#include <memory>
#include <mutex>
#include <utility>

namespace kiv::platform
{

namespace
{

constexpr const char* kNames[] = {
#define CALL(name) #name,
#include "calls.inc"
#undef CALL
};

struct Fault
{
    Call call;
    int code;
    CallNumbers which;
    int slot;
    Leavings leavings;
    unsigned seen;
};

struct Calls
{
    std::atomic<bool> watched{false}; // false without hook, faults and journal, which are then not read
    std::mutex mutex;
    std::shared_ptr<const CallHook> hook;
    std::vector<Fault> faults;
    bool journaling = false;
    std::vector<JournalEntry> journal;
};

Calls& TheCalls()
{
    static Calls* const calls = new Calls;
    return *calls;
}

/// Changes the handling of calls.
template <class Change>
void Set(Change change)
{
    const Locked calls(TheCalls());
    change(*calls);
    calls->watched = calls->hook != nullptr || calls->journaling || !calls->faults.empty();
}

int SlotOf(const Subject& subject)
{
    const Locked state(TheState());
    if (subject.handle != nullptr)
        return state->handles.SlotOf(subject.handle);
    return subject.cpName != nullptr && state->Ready() ? state->SlotOf(subject.cpName) : kNoSlot;
}

std::string RunHook(Call call, int slot)
{
    static thread_local bool inHook = false;
    const std::shared_ptr<const CallHook> hook = inHook ? nullptr : Locked(TheCalls())->hook;
    if (hook == nullptr)
        return {};

    struct Inside
    {
        Inside() { inHook = true; }
        ~Inside() { inHook = false; }
    } const inside;
    return (*hook)(call, slot);
}

std::optional<Fault> TakeFault(Call call, int slot)
{
    const Locked calls(TheCalls());
    std::optional<Fault> hit;
    for (Fault& fault : calls->faults)
    {
        if (fault.call != call || (fault.slot != kNoSlot && fault.slot != slot))
            continue;
        ++fault.seen;
        if (!hit && fault.seen >= fault.which.first && fault.seen <= fault.which.last)
            hit = fault;
    }
    return hit;
}

/// Returns the code with which the device fails this call, if it does. Every fault of the function counts the call.
std::optional<int> Break(Call call, std::vector<BrokenCall>& faults)
{
    std::optional<int> code;
    for (BrokenCall& fault : faults)
    {
        if (fault.call == call && (++fault.seen == fault.number || (fault.number == 0 && !code)))
            code = fault.code;
    }
    return code;
}

int Work(Call call, int (*work)(void*, State&), void* context)
{
    std::string trouble;
    {
        const Locked state(TheState());
        if (state->Ready())
        {
            const std::optional<int> code = Break(call, state->device.faults);
            return code ? *code : work(context, *state);
        }
        trouble = state->TakeTrouble();
    }
    if (!trouble.empty())
        Report(trouble);
    return -ENODEV;
}

} // namespace

int Perform(Call call, const Subject& subject, int (*work)(void* context, State& state), void* context) noexcept
try
{
    if (!TheCalls().watched.load(std::memory_order_relaxed))
        return Work(call, work, context);

    const int slot = SlotOf(subject);
    std::string note = RunHook(call, slot);
    const std::optional<Fault> fault = TakeFault(call, slot);
    int result = 0;
    if (!fault || fault->leavings == Leavings::ItsResults)
        result = Work(call, work, context);
    if (fault)
        result = fault->code;

    const Locked calls(TheCalls());
    if (calls->journaling)
        calls->journal.push_back({call, slot, result, std::move(note)});
    return result;
}
catch (...)
{
    return -ENOMEM;
}

int Register(Call call, std::optional<Topic> topic, bool hasCallback, Notifier::Callback callback) noexcept
{
    const int result = Answer(call, {},
        [&](State& state)
        {
            const bool isWifi = topic == Topic::WifiDevice || topic == Topic::WifiConnection;
            if (isWifi && !state.wifiInitialized)
                return -EPERM;
            if (!topic || !hasCallback)
                return -EINVAL;
            state.notifier.Add(*topic, std::move(callback));
            return 0;
        });
    SettleSource();
    return result;
}

int Unregister(Call call, std::optional<Topic> topic) noexcept
{
    const int result = Answer(call, {}, [&](State& state) { return topic && state.notifier.Remove(*topic) ? 0 : -EINVAL; });
    if (topic)
        TheState().notifier.AwaitEnd(*topic);
    SettleSource();
    return result;
}

const char* NameOf(Call call)
{
    return kNames[static_cast<std::size_t>(call)];
}

void FailCall(Call call, int code, CallNumbers which, int slot, Leavings leavings)
{
    // The caller could not release what a call with a null result leaves behind.
    if (call == Call::tel_init || call == Call::tel_get_cp_name_list || call == Call::vconf_get_str)
        leavings = Leavings::Nothing;

    Set([&](Calls& calls) { calls.faults.push_back({call, code, which, slot, leavings, 0}); });
}

void ClearFaults()
{
    Set([](Calls& calls) { calls.faults.clear(); });
}

void SetCallHook(CallHook hook)
{
    Set([&](Calls& calls) { calls.hook = hook ? std::make_shared<const CallHook>(std::move(hook)) : nullptr; });
}

void StartJournal()
{
    TakeJournal();
    Set([](Calls& calls) { calls.journaling = true; });
}

std::vector<JournalEntry> TakeJournal()
{
    return std::exchange(Locked(TheCalls())->journal, {});
}

void StopJournal()
{
    Set([](Calls& calls) { calls.journaling = false; });
}

void ResetCalls()
{
    SetCallHook(nullptr);
    ClearFaults();
    StopJournal();
    TakeJournal();
}

} // namespace kiv::platform
