/// @file
/// Every open handle of the simulated device, and reports of misuse.
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

/// The call that opened a handle.
struct Opening
{
    Call by;
    unsigned number;    ///< number of the call, counted from 1
    const void* caller; ///< return address of the call
};

struct OpenHandle
{
    HandleKind kind;
    int slot;
    Opening opening;
    std::string subject;           ///< package of a package handle, or CP name of a slot's modem
    std::vector<telephony_h> list; ///< handles of a handle list
};

/// Handles are addresses of heap memory that is freed on closing. A caller's pointer is looked up, and dereferenced only if it is
/// an open handle. Guarded by the lock of the state.
class Handles
{
public:
    /// Counts an opening call.
    Opening Open(Call by, const void* caller) { return {by, ++opened_[by], caller}; }

    /// Adds a handle and returns it: the address of the object, or of the array of a handle list.
    template <class Handle>
    Handle Add(OpenHandle handle)
    {
        return static_cast<Handle>(AddObject(std::move(handle)));
    }

    /// Finds an open handle of that kind. If there is none, reports a misuse and returns null.
    const OpenHandle* Find(HandleKind kind, const void* handle, Call user);

    /// Closes a handle. @return whether it was open; if not, reports a misuse
    bool Close(HandleKind kind, const void* handle, Call user);

    /// Returns the slot; kNoSlot for a handle that is not open or has none.
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
    std::array<Closed, 64> closed_{}; // the last ones, to distinguish "closed twice" from "never opened"
    std::size_t closedCount_ = 0;
    std::vector<std::string> misuses_;
};

} // namespace kiv::platform

#endif
