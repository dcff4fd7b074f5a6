#include "FieldValues.h"

#include <algorithm>
#include <charconv>

namespace kiv::platform
{

namespace
{

const Word* WordOf(std::int64_t number, const Limits& limits)
{
    const Word* const end = limits.words + limits.wordCount;
    const Word* const found = std::find_if(limits.words, end, [number](const Word& word) { return word.number == number; });
    return found == end ? nullptr : found;
}

} // namespace

std::string Describe(bool /*type*/, const Limits& /*limits*/)
{
    return "true or false";
}

std::string Describe(std::int64_t /*type*/, const Limits& limits)
{
    std::vector<std::string> choices;
    for (std::size_t i = 0; i < limits.wordCount; ++i)
        choices.push_back(std::string(limits.words[i].text) + " (" + std::to_string(limits.words[i].number) + ")");
    if (limits.high - limits.low != static_cast<std::int64_t>(limits.wordCount) - 1)
        choices.push_back("a number from " + std::to_string(limits.low) + " to " + std::to_string(limits.high));

    std::string text = choices.front();
    for (std::size_t i = 1; i < choices.size(); ++i)
        text += (i + 1 < choices.size() ? ", " : " or ") + choices[i];
    return text;
}

std::string Describe(const std::string& /*type*/, const Limits& limits)
{
    const std::string most = std::to_string(limits.high);
    const std::string length = limits.low == limits.high ? most : std::to_string(limits.low) + " to " + most;
    return length + (limits.digits ? " digits" : " bytes of text");
}

std::string Describe(const std::vector<int>& /*type*/, const Limits& limits)
{
    return Describe(std::int64_t{}, limits) + ", or several with ; between them";
}

bool Parse(const std::string& text, const Limits& /*limits*/, bool& value)
{
    value = text == "true";
    return value || text == "false";
}

bool Parse(const std::string& text, const Limits& limits, std::int64_t& value)
{
    for (std::size_t i = 0; i < limits.wordCount; ++i)
    {
        if (text == limits.words[i].text)
        {
            value = limits.words[i].number;
            return true;
        }
    }
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, value);
    return error == std::errc() && stop == end && value >= limits.low && value <= limits.high;
}

bool Parse(const std::string& text, const Limits& limits, std::string& value)
{
    value = text;
    const auto length = static_cast<std::int64_t>(text.size());
    const bool fits = length >= limits.low && length <= limits.high;
    return fits && (!limits.digits || text.find_first_not_of("0123456789") == std::string::npos);
}

bool Parse(const std::string& text, const Limits& limits, std::vector<int>& value)
{
    value.clear();
    std::size_t start = 0;
    for (std::size_t stop = 0; stop != std::string::npos; start = stop + 1)
    {
        stop = text.find(';', start);
        if (!Parse(text.substr(start, stop - start), limits, value.emplace_back()))
            return false;
    }
    return true;
}

Text Format(bool value, const Limits& /*limits*/)
{
    return value ? "true" : "false";
}

Text Format(std::int64_t value, const Limits& limits)
{
    const Word* const word = WordOf(value, limits);
    return word != nullptr ? word->text : std::to_string(value);
}

Text Format(const std::string& value, const Limits& /*limits*/)
{
    return value;
}

Text Format(const std::vector<int>& value, const Limits& limits)
{
    std::string text;
    for (const int number : value)
        text += (text.empty() ? "" : ";") + *Format(number, limits);
    return text;
}

} // namespace kiv::platform
