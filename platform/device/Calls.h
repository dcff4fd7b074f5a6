/// @file
/// How every function of the platform answers: past hook and faults, from the one state, into the journal.
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

/// What tells the slot of a call: a handle, or the CP name of a modem; neither when the call concerns no slot.
struct Subject
{
    const void* handle = nullptr;
    const char* cpName = nullptr;
};

/// Makes one call: `work` runs with the state locked, unless a fault takes its place. No exception leaves it.
int Perform(Call call, const Subject& subject, int (*work)(void* context, State& state), void* context) noexcept;

/// Perform() of a lambda that takes the state and gives the code.
template <class Work>
int Answer(Call call, const Subject& subject, Work work) noexcept
{
    return Perform(
        call, subject, [](void* context, State& state) { return (*static_cast<Work*>(context))(state); }, &work);
}

/// Answer() with the slot that a handle stands for; a handle that is not right is noted and refused.
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

/// Gives a copy of the text, made with malloc(); a text that is not there is an error.
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

/// Makes a call that registers for a topic; without a topic or a callback it is refused.
int Register(Call call, std::optional<Topic> topic, bool hasCallback, Notifier::Callback callback) noexcept;

/// Makes a call that ends a registration. Returns when no callback of it runs on another thread.
int Unregister(Call call, std::optional<Topic> topic) noexcept;

/// Forgets hook, faults and journal.
void ResetCalls();

} // namespace kiv::platform

#endif
