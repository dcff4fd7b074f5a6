// A letter that selects a lookup, and its key, compared with rows written independently of the library's.
#include "country/Lookups.h"
#include "Fuzz.h"

#include <LogControl.h>

using namespace kiv::fuzz;
using namespace kiv::test;

void Try(std::string_view input)
{
    static const bool isSilent = (kiv::platform::SetLogSink({}), true); // formatting lines would take longer than the lookup
    Require(isSilent, "the log is not formatted");
    const Lookup& lookup = kLookups[input.empty() ? 0 : static_cast<unsigned char>(input[0] - 'a') % std::size(kLookups)];
    const std::string key = input.empty() ? "" : std::string(input.substr(1)).c_str(); // up to the first null
    Require(lookup.ask(key.c_str()) == lookup.Answer(key), "a row answers its key, and no other key has an answer");
    Feed(1);
}
