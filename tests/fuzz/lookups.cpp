// A letter that picks a lookup, and its key, against rows that were listed apart from the library's own.
#include "Fuzz.h"

#include <DASystem.h>
#include <SimulatedLog.h>

#include <cstdlib>
#include <cstring>
#include <fstream>
#include <unordered_map>

using namespace kiv::fuzz;

namespace
{

using Answers = std::unordered_map<std::string, std::string>;
enum class Row
{
    kFirst,
    kLast
};

/// What the first or last row with a key holds in a column.
Answers Column(const char* file, std::size_t key, std::size_t column, Row which = Row::kFirst)
{
    Answers answers;
    std::ifstream in(std::string(KIV_TEST_DATA "/") + file);
    for (std::string line; std::getline(in, line);)
    {
        const auto row = Split(line, '\t');
        if (row[key] != "-" && row[column] != "-" && (which == Row::kLast || answers.count(row[key]) == 0))
            answers[row[key]] = row[column];
    }
    Require(!answers.empty(), "the rows are there");
    return answers;
}

Answers Composite(const Answers& answerOfMcc)
{
    Answers answers = Column("codes.tsv", 2, 0);
    for (auto& [key, answer] : answers)
        answer = answerOfMcc.at(answer);
    return answers;
}

DASystem& facade = *DASystem::GetInstance();
char untouched[] = "";

template <void (DASystem::*ask)(const char*, char**)>
char* Ask(const char* key)
{
    char* out = untouched;
    (facade.*ask)(key, &out);
    return out;
}

template <bool (DASystem::*ask)(const char*)>
char* Confirm(const char* key)
{
    return (facade.*ask)(key) ? strdup(key) : nullptr;
}

/// Which gives the library's own text.
char* AskAlpha2(const char* key)
{
    char* const out = Ask<&DASystem::GetCountryNameAlpha2FromCountryCallingCode>(key);
    return out == untouched ? out : strdup(out);
}

const struct
{
    char* (*ask)(const char* key);
    Answers answers;
} kLookups[] = {
    {Ask<&DASystem::GetCountryCodeFromMcc>, Column("country.tsv", 0, 1)},
    {Ask<&DASystem::GetCountryNameFromMcc>, Column("country.tsv", 0, 2)},
    {Ask<&DASystem::GetMccFromCountryCode>, Column("country.tsv", 1, 0)},
    {Ask<&DASystem::GetMccFromServiceCountryCode>, Column("service.tsv", 1, 0)},
    {Ask<&DASystem::GetServiceCountryCodeFromMcc>, Column("service.tsv", 0, 1)},
    {Ask<&DASystem::GetCountryCallingCodeFromMcc>, Column("codes.tsv", 0, 2)},
    {Ask<&DASystem::GetAlpha3CountryCodeFromMcc>, Column("codes.tsv", 0, 1)},
    {Ask<&DASystem::GetMccFromCountryCallingCode>, Column("codes.tsv", 2, 0)},
    {Confirm<&DASystem::IsValidMcc>, Column("country.tsv", 0, 0)},
    {Confirm<&DASystem::IsMoSupportMcc>, Column("mo.txt", 0, 0)},
    {Ask<&DASystem::GetCountryNameFromCountryCallingCode>, Composite(Column("country.tsv", 0, 2))},
    {AskAlpha2, Composite(Column("country.tsv", 0, 1, Row::kLast))},
};

} // namespace

void Try(std::string_view input)
{
    static const bool isSilent = (kiv::sim::SetLogSink({}), true); // to format lines would take longer than to look up
    Require(isSilent, "nobody reads the log");
    const auto& lookup = kLookups[input.empty() ? 0 : static_cast<unsigned char>(input[0] - 'a') % std::size(kLookups)];
    const std::string key = input.empty() ? "" : std::string(input.substr(1)).c_str(); // up to the first null
    char* const answer = lookup.ask(key.c_str());
    const auto expected = lookup.answers.find(key);
    if (expected == lookup.answers.end())
        Require(answer == nullptr || answer == untouched, "a key of no row has no answer");
    else
        Require(answer != nullptr && expected->second == answer, "a row answers its key");
    if (answer != untouched)
        std::free(answer);
    Feed(1);
}
