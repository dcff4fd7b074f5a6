#include "Verbs.h"

#include <DASystem.h>

#include <algorithm>
#include <cctype>

namespace
{

/// A type of key, and the function that looks up its MCC; null for an MCC.
struct KeyKind
{
    const char* word;
    const char* name;
    void (DASystem::*toMcc)(const char*, char**);
    const char* shape;
};

constexpr KeyKind kKeyKinds[] = {
    {"mcc", "MCC", nullptr, "three digits, such as 450"},
    {"alpha2", "alpha-2 code", &DASystem::GetMccFromCountryCode, "two lower-case letters, such as kr"},
    {"calling", "calling code", &DASystem::GetMccFromCountryCallingCode, "digits, such as 82"},
    {"service", "service country code", &DASystem::GetMccFromServiceCountryCode, "language and country, such as ko_KR"},
};
constexpr const KeyKind& kMcc = kKeyKinds[0];
constexpr const KeyKind& kAlpha2 = kKeyKinds[1];
constexpr const KeyKind& kCalling = kKeyKinds[2];
constexpr const KeyKind& kService = kKeyKinds[3];

/// One fact about an MCC.
struct Fact
{
    const char* name;
    void (DASystem::*lookup)(const char*, char**);
};

constexpr Fact kFacts[] = {
    {"name", &DASystem::GetCountryNameFromMcc},
    {"alpha2", &DASystem::GetCountryCodeFromMcc},
    {"alpha3", &DASystem::GetAlpha3CountryCodeFromMcc},
    {"calling_code", &DASystem::GetCountryCallingCodeFromMcc},
    {"service_code", &DASystem::GetServiceCountryCodeFromMcc},
};

LibraryText Lookup(void (DASystem::*lookup)(const char*, char**), const std::string& key)
{
    char* result = nullptr;
    (DASystem::GetInstance()->*lookup)(key.c_str(), &result);
    return LibraryText(result);
}

bool IsKnownMcc(const std::string& mcc)
{
    return std::any_of(
        std::begin(kFacts), std::end(kFacts), [&mcc](const Fact& fact) { return Lookup(fact.lookup, mcc) != nullptr; });
}

bool IsAll(int (*is)(int), const std::string& text)
{
    return std::all_of(text.begin(), text.end(), [is](unsigned char byte) { return is(byte) != 0; });
}

const KeyKind& Guess(const std::string& key)
{
    if (key.find('_') != key.npos)
        return kService;
    if (key.size() == 2 && IsAll(std::isalpha, key))
        return kAlpha2;
    if (key.empty() || !IsAll(std::isdigit, key))
    {
        std::vector<std::string> shapes;
        for (const KeyKind& kind : kKeyKinds)
            shapes.push_back(std::string(kind.name) + ": " + kind.shape);
        throw Failure(Exit::Usage, '"' + key + "\" is not a key of a country; a key is one of", shapes);
    }
    if (key.size() != 3 || !IsKnownMcc(key))
        return kCalling;
    if (Lookup(kCalling.toMcc, key))
        Note(key + " was read as an MCC; for the calling code, add --by calling");
    return kMcc;
}

std::string ToMcc(const KeyKind& kind, const std::string& key)
{
    const LibraryText found = kind.toMcc ? Lookup(kind.toMcc, key) : nullptr;
    if (found)
        return found.get();
    if (!kind.toMcc && IsKnownMcc(key))
        return key;

    std::string text = std::string("no country has the ") + kind.name + " \"" + key + "\"; expected " + kind.shape;
    throw Failure(Exit::No, text);
}

Record Describe(const KeyKind& kind, const std::string& key)
{
    const std::string mcc = ToMcc(kind, key);
    Record record{{"mcc", mcc}};
    for (const Fact& fact : kFacts)
        record.push_back(TextOr(fact.name, Lookup(fact.lookup, mcc).get(), "none recorded for this MCC"));
    record.push_back({"mo_support", DASystem::GetInstance()->IsMoSupportMcc(mcc.c_str())});
    if (&kind == &kCalling)
    {
        char* alpha2 = nullptr; // constant text of the library
        DASystem::GetInstance()->GetCountryNameAlpha2FromCountryCallingCode(key.c_str(), &alpha2);
        record.push_back(TextOr("alpha2_of_calling_code", alpha2, "none recorded"));
    }
    return record;
}

} // namespace

std::vector<std::string> CountryKeyKinds()
{
    std::vector<std::string> words;
    for (const KeyKind& kind : kKeyKinds)
        words.emplace_back(kind.word);
    return words;
}

Exit ShowCountry(const CountryOptions& options, const Command& command)
{
    const bool hasPlus = options.key.rfind('+', 0) == 0;
    const std::string key = hasPlus ? options.key.substr(1) : options.key;
    const KeyKind* kind = std::find_if(std::begin(kKeyKinds), std::end(kKeyKinds),
        [&options](const KeyKind& candidate) { return candidate.word == options.kind; });
    if (kind == std::end(kKeyKinds))
        kind = hasPlus ? &kCalling : &Guess(key);
    Print(Describe(*kind, key), command.form);
    return Exit::Done;
}
