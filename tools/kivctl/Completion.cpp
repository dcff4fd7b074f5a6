#include "Completion.h"

#include "Kivctl.h"

#include <DASubscriberStore.h>
#include <DeviceControl.h>
#include <SourceControl.h>
#include <Visible.h>

#include <algorithm>
#include <array>
#include <set>

namespace
{

struct Candidate
{
    std::string word;
    std::string description = {};
};
using Candidates = std::vector<Candidate>;

constexpr char kFiles[] = ":files";

bool IsOption(const std::string& word)
{
    return word.size() > 1 && word.front() == '-';
}

const OptionManual* FindOption(const VerbManual& verb, const std::string& name)
{
    for (const OptionManual& option : verb.options)
    {
        if (std::find(option.names.begin(), option.names.end(), name) != option.names.end())
            return &option;
    }
    return nullptr;
}

/// The place of the last word in a command line: the verb, the operands before the word, and the option whose value the word is.
struct Place
{
    const VerbManual* program;
    const VerbManual* verb = program;
    std::vector<std::string> operands = {};
    const OptionManual* option = nullptr;

    const OptionManual* Find(const std::string& name) const
    {
        const OptionManual* const own = FindOption(*verb, name);
        return own != nullptr ? own : FindOption(*program, name);
    }

    void Pass(const std::string& word)
    {
        if (option != nullptr)
        {
            option = nullptr;
            return;
        }
        if (IsOption(word))
        {
            const OptionManual* const found = Find(word);
            option = found != nullptr && !found->value.empty() ? found : nullptr;
            return;
        }
        const auto below = std::find_if(verb->verbs.begin(), verb->verbs.end(),
            [&word](const VerbManual& candidate) { return candidate.path.substr(candidate.path.rfind(' ') + 1) == word; });
        if (operands.empty() && below != verb->verbs.end())
            verb = &*below;
        else
            operands.push_back(word);
    }
};

/// The values that the next operand has in the recorded subscriptions that match the operands before it. For a new subscription,
/// the operand after the kind is one of that kind's keys or "all", and later ones are those of any subscription.
Candidates Recorded(const std::vector<std::string>& operands, bool isNew)
{
    std::vector<DASubscription> subscriptions;
    std::string reason;
    DASubscriberStore().List(subscriptions, reason);
    const size_t index = operands.size();
    const std::ptrdiff_t compared = isNew && index > 1 ? 0 : static_cast<std::ptrdiff_t>(index);
    std::set<std::string> words;
    if (isNew && index == 1)
        words.insert("all");
    for (const DASubscription& subscription : subscriptions)
    {
        const _SubscriberInfo& who = subscription.subscriber;
        const std::array<std::string, 5> fields{subscription.kind, subscription.key, who.busname, who.objectpath, who.interface};
        const bool isOffered = index < fields.size() && std::equal(operands.begin(), operands.begin() + compared, fields.begin());
        if (isOffered && fields.at(index) == kiv::platform::Visible(fields.at(index))) // shells print what they complete
            words.insert(fields.at(index));
    }
    Candidates candidates;
    for (const std::string& word : words)
        candidates.push_back({word});
    return candidates;
}

/// The keys of a device file, each followed by `end`. Keys of slots get the slot that is typed.
Candidates Keys(const std::string& typed, const char* end)
{
    const bool isOfSlot = typed.rfind("sim", 0) == 0 && typed.find('.') == 4;
    Candidates candidates;
    for (const kiv::platform::FieldInfo& field : kiv::platform::ListFields())
    {
        std::string name = field.group + "." + field.key;
        if (isOfSlot && name.rfind("sim0.", 0) == 0)
            name[3] = typed[3];
        name += end;
        candidates.push_back({std::move(name), field.meaning});
    }
    return candidates;
}

/// "GROUP.KEY=" for every key; after the "=", each value of the key.
Candidates Assignments(const std::string& typed)
{
    const std::string key = typed.substr(0, typed.find('='));
    if (key.size() == typed.size())
        return Keys(typed, "=");
    const std::string general = key.rfind("sim", 0) == 0 && key.find('.') == 4 ? "sim0" + key.substr(4) : key;
    Candidates candidates;
    for (const kiv::platform::FieldInfo& field : kiv::platform::ListFields())
    {
        if (field.group + "." + field.key != general)
            continue;
        for (const std::string& word : field.words)
            candidates.push_back({std::string(key).append("=").append(word)});
    }
    return candidates;
}

Candidates Profiles()
{
    Candidates candidates;
    for (const kiv::platform::Profile& profile : kiv::platform::ListProfiles())
        candidates.push_back({profile.name, profile.description});
    return candidates;
}

/// The list of fields that is typed, with one more field in place of the last, unfinished one.
Candidates FieldLists(const VerbManual& verb, const std::string& typed)
{
    const std::string before = typed.substr(0, typed.rfind(',') + 1);
    Candidates candidates;
    for (const std::string& field : verb.fields)
    {
        if ((',' + before).find(',' + field + ',') == before.npos)
            candidates.push_back({before + field});
    }
    return candidates;
}

/// The possible values of an option.
Candidates ValuesOf(const OptionManual& option, const VerbManual& verb, const std::string& typed)
{
    Candidates candidates;
    if (option.names.back() == "--fields")
        return FieldLists(verb, typed);
    if (option.names.back() == "--profile")
    {
        candidates = Profiles();
        const kiv::platform::Profile host = kiv::platform::HostProfile();
        candidates.push_back({host.name, host.description});
    }
    if (option.names.back() == "--from" || option.names.back() == "PROFILE")
        return Profiles();
    for (const std::string& word : option.words)
        candidates.push_back({word});
    if (option.value.find("FILE") != option.value.npos)
        candidates.push_back({kFiles});
    return candidates;
}

/// The possible values of the next operand.
Candidates Operands(const Place& place, const std::string& typed)
{
    std::vector<const OptionManual*> operands;
    for (const OptionManual& option : place.verb->options)
    {
        if (!IsOption(option.names.back()))
            operands.push_back(&option);
    }
    const size_t index = place.operands.size();
    if (operands.empty() || (index >= operands.size() && !operands.back()->isRepeated))
        return {};
    const OptionManual& operand = *operands[std::min(index, operands.size() - 1)];
    if (operand.names.back() == "GROUP.KEY=VALUE")
        return Assignments(typed);
    if (operand.names.back() == "GROUP.KEY")
        return Keys(typed, "");
    const bool isNew = place.verb->path == "subscribers add";
    if ((!isNew && place.verb->path != "subscribers remove") || (isNew && index == 0))
        return ValuesOf(operand, *place.verb, typed);
    return Recorded(place.operands, isNew);
}

Candidates Verbs(const Place& place)
{
    Candidates candidates;
    for (const VerbManual& below : place.verb->verbs)
    {
        if (place.operands.empty())
            candidates.push_back({below.path.substr(below.path.rfind(' ') + 1), below.help});
    }
    return candidates;
}

Candidates Options(const Place& place)
{
    Candidates candidates;
    std::set<std::string> named;
    for (const VerbManual* verb : {place.verb, place.program})
    {
        for (const OptionManual& option : verb->options)
        {
            for (const std::string& name : option.names)
            {
                if (IsOption(name) && named.insert(name).second)
                    candidates.push_back({name, option.help});
            }
        }
    }
    return candidates;
}

Candidates Following(const Place& place, const std::string& typed)
{
    if (place.option != nullptr)
        return ValuesOf(*place.option, *place.verb, typed);
    const size_t equals = typed.find('=');
    if (IsOption(typed) && equals != typed.npos)
    {
        const OptionManual* const option = place.Find(typed.substr(0, equals));
        Candidates candidates = option == nullptr ? Candidates() : ValuesOf(*option, *place.verb, typed.substr(equals + 1));
        for (Candidate& candidate : candidates)
        {
            if (candidate.word != kFiles)
                candidate.word.insert(0, typed, 0, equals + 1);
        }
        return candidates;
    }
    if (IsOption(typed) || typed == "-")
        return Options(place);
    Candidates candidates = Verbs(place);
    for (Candidate& operand : Operands(place, typed))
        candidates.push_back(std::move(operand));
    return candidates.empty() && typed.empty() ? Options(place) : candidates;
}

} // namespace

std::string Completions(const VerbManual& program, const std::vector<std::string>& words)
{
    Place place{&program};
    const std::string typed = words.empty() ? "" : words.back();
    for (size_t i = 0; i + 1 < words.size(); ++i)
        place.Pass(words[i]);
    std::string text;
    for (const Candidate& candidate : Following(place, typed))
    {
        if (candidate.word == kFiles || candidate.word.rfind(typed, 0) == 0)
            text += candidate.word + (candidate.description.empty() ? "" : '\t' + candidate.description) + '\n';
    }
    return text;
}
