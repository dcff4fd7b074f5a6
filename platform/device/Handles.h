/// @file
/// Every handle that the simulated device has given out, and what was done wrong with them.
#ifndef KIV_DEVICE_HANDLES_H
#define KIV_DEVICE_HANDLES_H

#include "DeviceControl.h"
#include "telephony.h"

#include <array>
#include <cstddef>
#include <memory>
#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

namespace kiv::platform
{

enum class HandleKind
{
    HandleList,
    Telephony,
    Tapi,
    PackageInfo,
    Connection
};

/// Who opened a handle.
struct Opening
{
    Call by;
    unsigned number;    ///< that of the call, counted from 1
    const void* caller; ///< where the call returns to
};

struct OpenHandle
{
    HandleKind kind;
    int slot;
    Opening opening;
    std::string subject;           ///< package of a package handle, CP name of the modem that belongs to one of a slot
    std::vector<telephony_h> list; ///< of a handle list
};

/// Handles are addresses of heap memory that is freed on closing. A pointer that comes in is only looked up, never followed,
/// until it is known to be open. Guarded by the lock of the state.
class Handles
{
public:
    /// Counts one opening call.
    Opening Open(Call by, const void* caller) { return {by, ++opened_[by], caller}; }

    /// Gives out a handle: the address of the object, or that of the array of a handle list.
    template <class Handle>
    Handle Add(OpenHandle handle)
    {
        return static_cast<Handle>(AddObject(std::move(handle)));
    }

    /// Null, and a misuse is noted, when `handle` is not open or not of the kind.
    const OpenHandle* Find(HandleKind kind, const void* handle, Call user);

    /// Whether it was open; else a misuse is noted.
    bool Close(HandleKind kind, const void* handle, Call user);

    /// kNoSlot for what is not open or has none.
    int SlotOf(const void* handle) const;

    std::vector<std::string> Describe() const;
    std::vector<std::string> TakeMisuses();

private:
    struct Closed
    {
        const void* handle = nullptr;
        HandleKind kind{};
        int slot = kNoSlot;
        Opening opening{};
    };

    void* AddObject(OpenHandle handle);
    void NoteMisuse(HandleKind kind, const void* handle, Call user, const char* whenClosed);

    std::unordered_map<const void*, std::unique_ptr<OpenHandle>> open_;
    std::unordered_map<Call, unsigned> opened_;
    std::array<Closed, 64> closed_{}; // the last ones, to tell "closed twice" from "never one"
    std::size_t closedCount_ = 0;
    std::vector<std::string> misuses_;
};

} // namespace kiv::platform

#endif
