/// @file
/// The values of a device file as text: the possible values of each type, and how they are read and written.
#ifndef KIV_SOURCES_FIELDVALUES_H
#define KIV_SOURCES_FIELDVALUES_H

#include "DeviceControl.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <type_traits>
#include <vector>

namespace kiv::platform
{

/// The word for a number.
struct Word
{
    std::int64_t number;
    const char* text;
};

/// Bounds of a number, or of the length of a text.
struct Limits
{
    std::int64_t low = 0;
    std::int64_t high = 0;
    bool digits = false;         ///< of a text
    const Word* words = nullptr; ///< of a number, in ascending order
    std::size_t wordCount = 0;
};

/// A number that always has a word.
template <std::size_t count>
constexpr Limits OneOf(const Word (&words)[count])
{
    return {words[0].number, words[count - 1].number, false, words, count};
}

/// A number up to `high`, which may have a word.
template <std::size_t count>
constexpr Limits UpTo(std::int64_t high, const Word (&words)[count])
{
    return {words[0].number, high, false, words, count};
}

/// Describes the possible values, such as "true or false".
std::string Describe(bool type, const Limits& limits);
std::string Describe(std::int64_t type, const Limits& limits);
std::string Describe(const std::string& type, const Limits& limits);
std::string Describe(const std::vector<int>& type, const Limits& limits);

/// Reads a value. @return whether the text is a value
bool Parse(const std::string& text, const Limits& limits, bool& value);
bool Parse(const std::string& text, const Limits& limits, std::int64_t& value);
bool Parse(const std::string& text, const Limits& limits, std::string& value);
bool Parse(const std::string& text, const Limits& limits, std::vector<int>& value);

/// Writes a value as in a device file, as a word if it has one. None when the value is missing.
Text Format(bool value, const Limits& limits);
Text Format(std::int64_t value, const Limits& limits);
Text Format(const std::string& value, const Limits& limits);
Text Format(const std::vector<int>& value, const Limits& limits);

template <class Number>
inline constexpr bool kIsOtherInteger =
    std::is_integral_v<Number> && !std::is_same_v<Number, bool> && !std::is_same_v<Number, std::int64_t>;

template <class Number, std::enable_if_t<kIsOtherInteger<Number>, int> = 0>
std::string Describe(Number /*type*/, const Limits& limits)
{
    return Describe(std::int64_t{}, limits);
}

template <class Value>
std::string Describe(const std::optional<Value>& /*type*/, const Limits& limits)
{
    return Describe(Value{}, limits);
}

template <class Number, std::enable_if_t<kIsOtherInteger<Number>, int> = 0>
bool Parse(const std::string& text, const Limits& limits, Number& value)
{
    std::int64_t number = 0;
    const bool isRight = Parse(text, limits, number);
    value = static_cast<Number>(number);
    return isRight;
}

template <class Value>
bool Parse(const std::string& text, const Limits& limits, std::optional<Value>& value)
{
    return Parse(text, limits, value.emplace());
}

template <class Number, std::enable_if_t<kIsOtherInteger<Number>, int> = 0>
Text Format(Number value, const Limits& limits)
{
    return Format(static_cast<std::int64_t>(value), limits);
}

template <class Value>
Text Format(const std::optional<Value>& value, const Limits& limits)
{
    return value ? Format(*value, limits) : std::nullopt;
}

} // namespace kiv::platform

#endif
