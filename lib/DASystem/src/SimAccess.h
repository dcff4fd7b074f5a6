/// @file
/// The lock that serialises SIM access, and the owners of telephony handles.
#ifndef KIV_SIMACCESS_H
#define KIV_SIMACCESS_H

#include "Handles.h"
#include "NoThrow.h"

#include <DAMutex.h>
#include <ITapiSim.h>
#include <TapiUtility.h>
#include <telephony.h>

#include <cerrno>
#include <glib.h>
#include <optional>

namespace kiv
{

inline constexpr char kSimAccess[] = "CORE_MUTEX_NAME_SIM_ACCESS";

/// Holds the SIM-access lock for the rest of an operation; false when there is no memory for the lock.
class SimAccess
{
public:
    SimAccess()
    {
        NoThrow(0,
            [this]
            {
                lock_.emplace(kSimAccess);
                return 0;
            });
    }

    explicit operator bool() const { return lock_.has_value(); }

private:
    std::optional<DAMutexLock> lock_;
};

/// One platform call under the SIM-access lock.
/// @return the call's code, or -ENOMEM when there is no memory for the lock
template <class Call>
int UnderSimAccess(Call&& call)
{
    struct Bracket
    {
        Bracket() { access.Lock(); }
        ~Bracket() { access.Unlock(); }
        DAMutex access{kSimAccess};
    };
    return NoThrow(-ENOMEM,
        [&]
        {
            const Bracket bracket;
            return call();
        });
}

using Tapi = Owned<TapiHandle, tel_deinit>;

/// The names of the modems.
class CpNames
{
public:
    CpNames() : names_(tel_get_cp_name_list()) {}

    /// Returns the name of a slot's modem; null when there is none.
    const char* Of(int slot) const
    {
        const guint count = names_ == nullptr ? 0 : g_strv_length(names_.get());
        return slot >= 0 && static_cast<guint>(slot) < count ? names_.get()[slot] : nullptr;
    }

    /// Opens a slot's modem; null when there is none or it does not open.
    Tapi Open(int slot) const
    {
        const char* const name = Of(slot);
        return Tapi(name == nullptr ? nullptr : tel_init(name));
    }

private:
    Owned<char*, g_strfreev> names_;
};

/// The telephony handles of all slots, for one operation.
class HandleList
{
public:
    HandleList() : isOpen_(telephony_init(&list_) == 0) {}
    HandleList(const HandleList&) = delete;
    HandleList& operator=(const HandleList&) = delete;
    ~HandleList()
    {
        if (isOpen_)
            telephony_deinit(&list_);
    }

    /// Returns the number of slots; 0 when telephony could not be opened.
    int Count() const { return isOpen_ ? static_cast<int>(list_.count) : 0; }

    bool Has(int slot) const { return slot >= 0 && slot < Count(); }

    telephony_h operator[](int slot) const { return list_.handle[slot]; }

private:
    telephony_handle_list_s list_ = {};
    bool isOpen_;
};

inline bool HasSlot(const telephony_handle_list_s& list, int slot)
{
    return slot >= 0 && static_cast<unsigned>(slot) < list.count;
}

/// Reads a card status, without the flag that it changed.
inline int ReadCardStatus(const Tapi& modem, TelSimCardStatus_t* status)
{
    int cardChanged = 0;
    return tel_get_sim_init_info(modem.get(), status, &cardChanged);
}

} // namespace kiv

#endif
