#ifndef KIV_SUBSCRIPTIONRULES_H
#define KIV_SUBSCRIPTIONRULES_H

#include "RecordRules.h"

#include <algorithm>
#include <iterator>

namespace kiv
{

inline constexpr const char* kKinds[] = {"policy", "status", "auth", "activated", "number_changed", "push"};

inline bool IsKind(const std::string& text)
{
    return std::find(std::begin(kKinds), std::end(kKinds), text) != std::end(kKinds);
}

inline std::string KindWanted()
{
    std::string wanted = "is invalid; expected one of";
    for (const char* const kind : kKinds)
        wanted.append(kind == kKinds[0] ? " " : ", ").append(kind);
    return wanted;
}

/// Whether a text has no control characters, invisible formatting characters or line separators.
inline bool IsPlain(const std::string& text)
{
    for (const char* at = text.c_str(); *at != '\0'; at = g_utf8_next_char(at))
    {
        switch (g_unichar_type(g_utf8_get_char(at)))
        {
        case G_UNICODE_CONTROL:
        case G_UNICODE_FORMAT:
        case G_UNICODE_LINE_SEPARATOR:
        case G_UNICODE_PARAGRAPH_SEPARATOR:
            return false;
        default:
            break;
        }
    }
    return true;
}

/// Whether the agent can look up this text as a service ID: it uses the first nine characters of the decimal ID.
inline bool IsServiceId(const std::string& text)
{
    const std::string digits = text.substr(text.front() == '-' ? 1 : 0);
    return text.size() <= 9 && !digits.empty() && digits.find_first_not_of("0123456789") == std::string::npos &&
           (digits.front() != '0' || text == "0");
}

/// Returns what is wrong with a key and what is expected; null if the key is valid.
inline const char* WantedKey(const std::string& kind, const std::string& key)
{
    if (key.empty() || key.size() > 255 || g_utf8_validate(key.data(), static_cast<gssize>(key.size()), nullptr) == FALSE ||
        !IsPlain(key))
        return "is invalid; expected 1 to 255 bytes of UTF-8 without control or invisible characters, such as 7 or all";
    if ((kind == "policy" || kind == "status") && !IsServiceId(key))
        return "is invalid; expected a service ID, a decimal number of at most nine characters, such as 7";
    return nullptr;
}

inline constexpr std::size_t kMostPathBytes = 1024;

inline std::string Refusal(const char* field, const std::string& value, const std::string& wanted)
{
    const g_autofree char* shown = g_strescape(value.c_str(), nullptr);
    return std::string(field) + " \"" + shown + "\" " + wanted;
}

/// Returns why a subscription is invalid; empty when it is valid.
inline std::string ObjectionTo(const std::string& kind, const std::string& key, const std::string& busName,
    const std::string& objectPath, const std::string& interface)
{
    constexpr const char* kName = "is invalid; expected two or more elements joined by dots, such as org.example.Client";
    constexpr const char* kPath =
        "is invalid; expected a slash before each element of letters, digits and underscores, such as /org/example/Client";
    constexpr const char* kReserved = "is reserved, like all names with this beginning; the bus disconnects their callers";

    if (!IsKind(kind))
        return Refusal("kind", kind, KindWanted());
    if (const char* const wanted = WantedKey(kind, key))
        return Refusal("key", key, wanted);
    if (objectPath.size() > kMostPathBytes)
        return Refusal("object path", objectPath, "is too long; expected at most " + std::to_string(kMostPathBytes) + " bytes");

    switch (FlawOf(busName, objectPath, interface))
    {
    case RecordFlaw::BusName:
        return Refusal("bus name", busName, kName);
    case RecordFlaw::ObjectPath:
        return Refusal("object path", objectPath, kPath);
    case RecordFlaw::Interface:
        return Refusal("interface", interface, kName);
    case RecordFlaw::ReservedPath:
        return Refusal("object path", objectPath, kReserved);
    case RecordFlaw::ReservedInterface:
        return Refusal("interface", interface, kReserved);
    case RecordFlaw::None:
        break;
    }
    return {};
}

} // namespace kiv

#endif
