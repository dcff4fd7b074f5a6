// Operations on a store, one per line, with fields separated by tabs: "+" adds a subscription, "-" removes one, "@" writes a text
// at a place of the file. Until the first "@", the subscribers found must be right after each step.
#include "Fuzz.h"

#include <DASubscribeDataManager.h>
#include <DASubscriberStore.h>

#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <fstream>

using namespace kiv::fuzz;
using Outcome = DASubscriberStore::Outcome;

namespace
{

const std::filesystem::path kDirectory = std::filesystem::temp_directory_path() / ("kiv-fuzz-" + std::to_string(getpid()));
const std::string kPath = kDirectory / "subscribers.db";

void Take(const std::string& step, bool& isWhole)
{
    const char verb = step.c_str()[0];
    std::vector<std::string> fields = Split(step, '\t', 6);
    for (std::string& field : fields)
        field = field.c_str(); // up to the first null
    const DASubscription row{fields[1], fields[2], {fields[3], fields[4], fields[5]}};
    std::string reason;
    Outcome outcome = Outcome::Unchanged;
    if (verb == '+')
        outcome = DASubscriberStore().Add(row, reason);
    if (verb == '-')
        outcome = DASubscriberStore().Remove(row, reason);
    if (verb == '@')
        std::fstream(kPath, std::ios::in | std::ios::out).seekp(static_cast<unsigned>(Number(fields[1])) % 65536) << fields[2];
    isWhole = isWhole && verb != '@';
    Require((outcome == Outcome::Failed || outcome == Outcome::Refused) != reason.empty(), "a failure has a reason");

    std::list<_SubscriberInfo> found;
    const bool isAsked = DASubscribeDataManager().GetSubscriber(fields[1].c_str(), fields[2].c_str(), found);
    Require(isAsked || found.empty(), "a store that fails returns nothing");
    Require(!isWhole || (isAsked && outcome != Outcome::Failed), "a store that is whole does not fail");
    const auto count = std::count_if(found.begin(), found.end(),
        [&fields](const _SubscriberInfo& other)
        { return other.busname == fields[3] && other.objectpath == fields[4] && other.interface == fields[5]; });
    Require(!isWhole || verb != '+' || count == (outcome == Outcome::Refused ? 0 : 1), "what was added is found once");
    Require(!isWhole || verb != '-' || count == 0, "what was removed is gone");
}

} // namespace

void Try(std::string_view input)
{
    constexpr std::size_t kMostSteps = 16;
    setenv("KIV_SUBSCRIBERS", kPath.c_str(), 1);
    std::vector<std::string> steps = Split(input, '\n');
    steps.resize(std::min(steps.size(), kMostSteps));
    bool isWhole = true;
    for (const std::string& step : steps)
        Take(step, isWhole);
    std::filesystem::remove_all(kDirectory);
    Feed(steps.size());
}
