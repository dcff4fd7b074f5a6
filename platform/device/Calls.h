/// @file
/// The path of every platform call: hook, faults, the shared state, journal.
#ifndef KIV_DEVICE_CALLS_H
#define KIV_DEVICE_CALLS_H

#include "DeviceControl.h"
#include "Handles.h"
#include "State.h"

#include <cerrno>
#include <cstring>
#include <optional>
#include <utility>

#define PLATFORM_API extern "C" __attribute__((visibility("default")))

namespace kiv::platform
{

/// Identifies the slot of a call by a handle or by the CP name of a modem. Both are null for a call without a slot.
struct Subject
{
    const void* handle = nullptr;
    const char* cpName = nullptr;
};

/// Makes one call: runs `work` with the state locked, unless a fault replaces it. Does not throw.
int Perform(Call call, const Subject& subject, int (*work)(void* context, State& state), void* context) noexcept;

/// Calls Perform() with a lambda that takes the state and returns the code.
template <class Work>
int Answer(Call call, const Subject& subject, Work work) noexcept
{
    return Perform(
        call, subject, [](void* context, State& state) { return (*static_cast<Work*>(context))(state); }, &work);
}

/// Calls Answer() with the slot of a handle; an invalid handle is refused and reported as misuse.
template <class Work>
int AnswerForSlot(Call call, HandleKind kind, const void* handle, Work work) noexcept
{
    return Answer(call, {handle},
        [&](State& state)
        {
            const OpenHandle* const open = state.handles.Find(kind, handle, call);
            if (open == nullptr)
                return -EINVAL;
            SimSlot* const slot = state.Find(open->slot, open->subject);
            return slot != nullptr ? work(*slot) : -ENODEV;
        });
}

template <class Out, class Value>
int Give(Out* out, Value value)
{
    if (out == nullptr)
        return -EINVAL;
    *out = static_cast<Out>(value);
    return 0;
}

/// Returns a copy of the text in `out`, made with malloc(); a missing text is an error.
inline int GiveText(char** out, const Text& text)
{
    if (out == nullptr)
        return -EINVAL;
    if (!text)
        return -ENODATA;
    char* const copy = strdup(text->c_str());
    if (copy == nullptr)
        return -ENOMEM;
    *out = copy;
    return 0;
}

/// Makes a call that registers for a topic. A call without topic or callback is refused.
int Register(Call call, std::optional<Topic> topic, bool hasCallback, Notifier::Callback callback) noexcept;

/// Makes a call that ends a registration. Returns when none of its callbacks runs on another thread.
int Unregister(Call call, std::optional<Topic> topic) noexcept;

/// Removes hook, faults and journal.
void ResetCalls();

} // namespace kiv::platform

#endif
