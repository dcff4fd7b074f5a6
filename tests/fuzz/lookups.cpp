// A letter that picks a lookup, and its key, against the rows that were listed apart from the library's own.
#include "Fuzz.h"

#include <DASystem.h>

#include <cstdlib>
#include <fstream>

namespace
{

using kiv::fuzz::Require;
using Rows = std::vector<std::vector<std::string>>;

Rows Read(const char* file)
{
    Rows rows;
    std::ifstream in(std::string(KIV_TEST_DATA "/") + file);
    for (std::string line; std::getline(in, line);)
        rows.push_back(kiv::fuzz::Split(line, '\t'));
    Require(!rows.empty(), "the rows are there");
    return rows;
}

const Rows kCountry = Read("country.tsv"); // mcc, alpha-2, name
const Rows kService = Read("service.tsv"); // mcc, service country code
const Rows kCodes = Read("codes.tsv");     // mcc, alpha-3, calling code or "-"
const Rows kMo = Read("mo.txt");           // mcc

DASystem& facade = *DASystem::GetInstance();
char untouched[] = "(untouched)";

/// The answer of the first row with that key, or of the last; null when there is none.
const char* Cell(const Rows& rows, std::size_t keyColumn, const std::string& key, std::size_t column, bool isLast = false)
{
    const char* found = nullptr;
    for (const auto& row : rows)
    {
        if (row[keyColumn] != key || row[column] == "-" || key == "-")
            continue;
        found = row[column].c_str();
        if (!isLast)
            break;
    }
    return found;
}

void ExpectText(const char* expected, const char* answer)
{
    Require(
        expected == nullptr || answer == nullptr ? expected == answer : std::string_view(expected) == answer, "the row answers");
}

using Ask = void (DASystem::*)(const char*, char**);
const struct
{
    Ask ask;
    const Rows& rows;
    std::size_t keyColumn, column;
} kLookups[] = {
    {&DASystem::GetCountryCodeFromMcc, kCountry, 0, 1},
    {&DASystem::GetCountryNameFromMcc, kCountry, 0, 2},
    {&DASystem::GetMccFromCountryCode, kCountry, 1, 0},
    {&DASystem::GetMccFromServiceCountryCode, kService, 1, 0},
    {&DASystem::GetServiceCountryCodeFromMcc, kService, 0, 1},
    {&DASystem::GetCountryCallingCodeFromMcc, kCodes, 0, 2},
    {&DASystem::GetAlpha3CountryCodeFromMcc, kCodes, 0, 1},
    {&DASystem::GetMccFromCountryCallingCode, kCodes, 2, 0},
};
constexpr std::size_t kIsValid = std::size(kLookups), kIsMo = kIsValid + 1, kName = kIsMo + 1, kAlpha2 = kName + 1;

void TryComposite(bool isName, const std::string& key)
{
    char* answer = untouched;
    const char* const mcc = Cell(kCodes, 2, key, 0);
    const char* const expected = mcc == nullptr ? untouched : Cell(kCountry, 0, mcc, isName ? 2 : 1, !isName);
    if (isName)
        facade.GetCountryNameFromCountryCallingCode(key.c_str(), &answer);
    else
        facade.GetCountryNameAlpha2FromCountryCallingCode(key.c_str(), &answer);
    ExpectText(expected, answer);
    if (isName && answer != untouched)
        std::free(answer);
}

} // namespace

void Try(std::string_view input)
{
    if (input.empty())
        return;
    const std::size_t pick = static_cast<unsigned char>(input[0] - 'a') % (kAlpha2 + 1U);
    const std::string key = std::string(input.substr(1)).c_str(); // up to the first null
    kiv::fuzz::Feed(1);
    if (pick >= kName)
        return TryComposite(pick == kName, key);
    if (pick == kIsValid)
        return Require(facade.IsValidMcc(key.c_str()) == (Cell(kCountry, 0, key, 0) != nullptr), "an MCC is one of a row");
    if (pick == kIsMo)
        return Require(facade.IsMoSupportMcc(key.c_str()) == (Cell(kMo, 0, key, 0) != nullptr), "an MCC is one of a row");

    const auto& lookup = kLookups[pick];
    char* answer = untouched;
    (facade.*lookup.ask)(key.c_str(), &answer);
    ExpectText(key.empty() ? untouched : Cell(lookup.rows, lookup.keyColumn, key, lookup.column), answer);
    if (answer != untouched)
        std::free(answer);
}
