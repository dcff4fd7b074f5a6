#include "State.h"

#include "Calls.h"
#include "Locked.h"
#include "Report.h"

#include <algorithm>
#include <pthread.h>
#include <utility>

namespace kiv::platform
{

namespace
{

/// Runs `change` under the lock, and delivers the changes that it returns without the lock.
template <class Make>
void Apply(Make change)
{
    Changes changes;
    {
        const Locked state(TheState());
        state->Ready();
        changes = change(*state);
        state->trouble.clear();
    }
    SettleSource();
    TheState().notifier.Deliver(changes);
}

} // namespace

State& TheState()
{
    // A child of fork() has only the thread that called it, so locks that other threads held at that moment stay locked.
    static State* const state = []
    {
        SettleLog();
        pthread_atfork(
            []
            {
                TheState().mutex.lock();
                TheState().notifier.HoldStill();
            },
            []
            {
                TheState().notifier.GoOn();
                TheState().mutex.unlock();
            },
            []
            {
                TheState().notifier.GoOnAlone();
                TheState().mutex.unlock();
            });
        return new State;
    }();
    return *state;
}

bool State::Ready()
{
    if (loaded_)
        return trouble.empty();

    loaded_ = true;
    isReported_ = false;
    try
    {
        Origin origin = OpenEnvironment();
        device = std::move(origin.device);
        source = std::move(origin.source);
    }
    catch (const std::exception& error)
    {
        device = Device();
        device.telephony = false;
        trouble = error.what();
    }
    return trouble.empty();
}

std::string State::TakeTrouble()
{
    return std::exchange(isReported_, true) ? std::string() : trouble;
}

Changes State::Replace(Device next)
{
    Changes changes = Differences(device, next);
    device = std::move(next);
    return changes;
}

int State::SlotOf(const char* cpName) const
{
    const auto found =
        std::find_if(device.slots.begin(), device.slots.end(), [cpName](const SimSlot& sim) { return sim.cpName == cpName; });
    return found == device.slots.end() ? kNoSlot : static_cast<int>(found - device.slots.begin());
}

SimSlot* State::Find(int slot, const std::string& cpName)
{
    auto index = static_cast<std::size_t>(slot);
    if (index >= device.slots.size() || device.slots[index].cpName != cpName)
        index = static_cast<std::size_t>(SlotOf(cpName.c_str()));
    return index < device.slots.size() ? &device.slots[index] : nullptr;
}

void SettleSource() noexcept
{
    if (const std::shared_ptr<Source> source = Locked(TheState())->source)
        source->Settle();
}

void Use(Origin origin)
{
    Apply(
        [&](State& state)
        {
            std::swap(state.source, origin.source);
            return state.Replace(std::move(origin.device));
        });
    if (origin.source != nullptr)
        origin.source->Settle();
}

Device GetDevice()
{
    const Locked state(TheState());
    state->Ready();
    return state->device;
}

void SetDevice(const Device& device)
{
    Use({device, nullptr});
}

void ChangeDevice(const std::function<void(Device&)>& change)
{
    Apply(
        [&](State& state)
        {
            Device next = state.device;
            change(next);
            return state.Replace(std::move(next));
        });
}

std::string ReasonFor(const std::string& key)
{
    const Locked state(TheState());
    const auto found = state->device.reasons.find(key);
    return found == state->device.reasons.end() ? "" : found->second;
}

std::string DeviceTrouble()
{
    const Locked state(TheState());
    state->Ready();
    state->TakeTrouble(); // the caller reports it
    return state->trouble;
}

void ResetDevice()
{
    ResetCalls();
    TheState().notifier.RemoveAll();
    std::shared_ptr<Source> source;
    {
        const Locked state(TheState());
        state->handles = Handles();
        state->wifiInitialized = false;
        state->trouble.clear();
        state->loaded_ = false;
        source = std::exchange(state->source, nullptr);
    }
    if (source != nullptr)
        source->Settle();
}

std::vector<std::string> OpenHandles()
{
    const Locked state(TheState());
    return state->handles.Describe();
}

std::vector<std::string> TakeMisuses()
{
    const Locked state(TheState());
    return state->handles.TakeMisuses();
}

} // namespace kiv::platform
