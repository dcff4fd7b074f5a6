#include "Suggestion.h"

#include <algorithm>
#include <cctype>
#include <numeric>
#include <utility>

namespace kiv::platform
{

namespace
{

char Lower(char letter)
{
    return static_cast<char>(std::tolower(static_cast<unsigned char>(letter)));
}

/// Number of letters to insert, remove or replace to turn one word into the other. Ignores case.
size_t Distance(const std::string& from, const std::string& to)
{
    std::vector<size_t> row(to.size() + 1);
    std::iota(row.begin(), row.end(), size_t{0});
    for (size_t i = 0; i < from.size(); ++i)
    {
        size_t diagonal = std::exchange(row[0], i + 1);
        for (size_t j = 0; j < to.size(); ++j)
        {
            const size_t replaced = diagonal + (Lower(from[i]) == Lower(to[j]) ? 0 : 1);
            diagonal = row[j + 1];
            row[j + 1] = std::min({replaced, row[j] + 1, row[j + 1] + 1});
        }
    }
    return row.back();
}

} // namespace

std::string DidYouMean(const std::string& typed, const std::vector<std::string>& words)
{
    const auto nearest = std::min_element(words.begin(), words.end(),
        [&typed](const std::string& one, const std::string& other) { return Distance(typed, one) < Distance(typed, other); });
    if (nearest == words.end() || 2 * Distance(typed, *nearest) > std::max(typed.size(), nearest->size()))
        return "";
    return " (did you mean \"" + *nearest + "\"?)";
}

} // namespace kiv::platform
