/// @file
/// Reads values from the platform's services, and copies their texts for the caller.
#ifndef KIV_PLATFORMREAD_H
#define KIV_PLATFORMREAD_H

#include <cerrno>
#include <cstring>

namespace kiv
{

/// Reads one value from a platform service. Always writes to `out`: zero or null when the service wrote nothing.
template <class Key, class Value>
int Read(int (*read)(Key, Value*), Key key, Value* out)
{
    Value value{};
    const int code = read(key, &value);
    *out = value;
    return code;
}

/// Reads a switch from a platform service; off when the service wrote nothing.
template <class Key>
bool ReadSwitch(int (*read)(Key, bool*), Key key)
{
    bool isOn = false;
    Read(read, key, &isOn);
    return isOn;
}

/// Copies a text of the platform for the caller; copies null as null.
inline int CopyOut(const char* text, char** out)
{
    char* const copy = text == nullptr ? nullptr : strdup(text);
    if (text != nullptr && copy == nullptr)
        return -ENOMEM;
    *out = copy;
    return 0;
}

} // namespace kiv

#endif
