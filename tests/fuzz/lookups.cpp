// A letter that picks a lookup, and its key, against rows that were listed apart from the library's own.
#include "country/Lookups.h"
#include "Fuzz.h"

#include <LogControl.h>

using namespace kiv::fuzz;
using namespace kiv::test;

void Try(std::string_view input)
{
    static const bool isSilent = (kiv::platform::SetLogSink({}), true); // to format lines would take longer than to look up
    Require(isSilent, "nobody reads the log");
    const Lookup& lookup = kLookups[input.empty() ? 0 : static_cast<unsigned char>(input[0] - 'a') % std::size(kLookups)];
    const std::string key = input.empty() ? "" : std::string(input.substr(1)).c_str(); // up to the first null
    Require(lookup.ask(key.c_str()) == lookup.Answer(key), "a row answers its key, and no other key has an answer");
    Feed(1);
}
