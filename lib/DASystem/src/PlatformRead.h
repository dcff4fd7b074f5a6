/// @file
/// How the facade reads values of the platform's services, and hands out their texts.
#ifndef KIV_PLATFORMREAD_H
#define KIV_PLATFORMREAD_H

#include <cerrno>
#include <cstring>

namespace kiv
{

/// Reads one value of a platform service: stored in every case, zero or null when the service wrote none.
template <class Key, class Value>
int Read(int (*read)(Key, Value*), Key key, Value* out)
{
    Value value{};
    const int code = read(key, &value);
    *out = value;
    return code;
}

/// Reads a switch of a platform service; off when the service wrote none.
template <class Key>
bool ReadSwitch(int (*read)(Key, bool*), Key key)
{
    bool isOn = false;
    Read(read, key, &isOn);
    return isOn;
}

/// Hands out a copy of a platform's text; a service that succeeds without one gives null.
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
