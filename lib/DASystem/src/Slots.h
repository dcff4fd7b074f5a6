/// @file
/// The facade's queries over the SIMs of all slots.
#ifndef KIV_SLOTS_H
#define KIV_SLOTS_H

#include "DASimManager.h"
#include "Forward.h"
#include "Handles.h"
#include "NoThrow.h"
#include "ResultCode.h"

#include <cstring>
#include <vector>

namespace kiv
{

/// The telephony handles of all slots, for one query.
class Slots
{
public:
    Slots() : isOpen_(Ask(false, &DASimManager::SuccessToInitTelephonyHandle, &list_)) {}
    Slots(const Slots&) = delete;
    Slots& operator=(const Slots&) = delete;
    ~Slots()
    {
        if (isOpen_)
            Ask(&DASimManager::DeleteTelephonyHandle, list_);
    }

    explicit operator bool() const { return isOpen_; }

    /// Returns the number of slots; 0 when telephony could not be opened.
    int Count() const { return isOpen_ ? static_cast<int>(list_.count) : 0; }

    bool IsAvailable(int slot) const { return Ask(false, &DASimManager::IsSimAvailable, list_, slot); }

    telephony_h Handle(int slot) const { return list_.handle[slot]; }

    /// Reads a text of one slot.
    /// @return the reader's code, 0 with a text
    template <class Char>
    int Read(int (DASimManager::*reader)(telephony_handle_list_s, int, Char**), int slot, CString& text) const
    {
        Char* value = nullptr;
        const int code = Ask<DASimManager, int>(KIV_RESULT_INVALID_ARGUMENT, reader, list_, slot, &value);
        text.reset(const_cast<char*>(value)); // the reader of the MCC returns const, but the caller owns the text
        return code;
    }

private:
    telephony_handle_list_s list_ = {};
    bool isOpen_;
};

/// Copies the text of the first slot that answers; the out-parameter is unchanged when none does.
template <class Reader>
int FirstAnswer(Reader reader, char** out)
{
    const Slots slots;
    int code = KIV_RESULT_INVALID_ARGUMENT;
    for (int slot = 0; slot < slots.Count(); ++slot)
    {
        CString text;
        code = slots.Read(reader, slot, text);
        if (code != 0)
            continue;
        char* const copy = strdup(text.get());
        if (copy == nullptr)
            return KIV_RESULT_INVALID_ARGUMENT;
        *out = copy;
        return 0;
    }
    return code;
}

/// Appends a text and passes its ownership to the vector.
/// @return the number of appended texts: 0 for null, else 1
inline int Append(char* text, std::vector<char*>& values)
{
    CString owner(text);
    if (owner == nullptr)
        return 0;
    values.push_back(text);
    static_cast<void>(owner.release());
    return 1;
}

/// Appends a copy of the text of every slot that answers.
template <class Reader>
void EveryAnswer(Reader reader, std::vector<char*>* values, int* count)
{
    const Slots slots;
    if (!slots)
        return;

    *count = 0;
    for (int slot = 0; slot < slots.Count(); ++slot)
    {
        CString text;
        if (slots.Read(reader, slot, text) != 0)
            continue;
        *count += NoThrow(0, [&] { return Append(strdup(text.get()), *values); });
    }
}

} // namespace kiv

#endif
