#include "sweep/Sweep.h"

#include <SourceControl.h>

#include <cstring>

namespace kiv::test
{

namespace
{

World& TheWorld()
{
    static World world;
    return world;
}

constexpr char kManySlots[] = "dual, many times over";

/// Replaces the numbers of a line, so that they do not matter.
std::string AnyNumber(std::string line)
{
    const auto isOfNumber = [](char ch) { return std::strchr("-0123456789", ch) != nullptr; };
    line.erase(std::remove_if(line.begin(), line.end(), isOfNumber), line.end());
    return line;
}

std::set<std::string> Words(const std::string& text)
{
    std::istringstream in(text);
    return {std::istream_iterator<std::string>(in), {}};
}

} // namespace

std::vector<unsigned> Lengths()
{
    constexpr unsigned kAll = 1'000'000;
    return {1, 2, 3, 4, 6, 8, 12, 16, 24, 32, kAll};
}

Sweep::Sweep()
{
    TheWorld();
    Use("dual");
}

Sweep::~Sweep()
{
    platform::ResetDevice();
}

std::vector<std::string> Sweep::Devices()
{
    std::vector<std::string> names{kManySlots};
    for (const platform::Profile& profile : platform::ListProfiles())
        names.push_back(profile.name);
    return names;
}

void Sweep::Use(const std::string& name)
{
    World::Use(name == kManySlots ? "dual" : name);
    device = platform::GetDevice();
    while (name == kManySlots && device.slots.size() < (IsLong() ? 32 : 20))
    {
        device.slots.push_back(device.slots[device.slots.size() % 2]);
        device.slots.back().cpName += '_' + std::to_string(device.slots.size());
    }
}

const Operation& Sweep::Find(const std::string& name)
{
    for (const Operation& operation : Operations())
        if (operation.name == name)
            return operation;
    throw std::out_of_range(name);
}

Story Sweep::Try(const Operation& operation, const std::function<void()>& arm, const std::function<void()>& disarm)
{
    platform::SetDevice(device);
    pauses = 0;
    Story story;
    {
        Session session;
        log.Take();
        arm();
        story.push_back(operation.run(session));
        disarm();
        const Story lines = log.Take();
        story.insert(story.end(), lines.begin(), lines.end());
    }
    if (operation.kind == Kind::Push)
        TheWorld().deliveries.Settle();
    EXPECT_THAT(platform::OpenHandles(), testing::IsEmpty());
    EXPECT_THAT(platform::TakeMisuses(), testing::IsEmpty());
    EXPECT_STREQ("", heldLock);
    return story;
}

testing::AssertionResult Sweep::MayBe(const Operation& operation, const Story& story, const Story& untouched) const
{
    std::set<std::string> results(operation.noMemory.begin(), operation.noMemory.end()), lines;
    const auto allow = [&](const Story& each)
    {
        results.insert(each[0]);
        std::transform(each.begin() + 1, each.end(), std::inserter(lines, lines.end()), AnyNumber);
    };
    allow(untouched);
    for (const Failing& each : operation.failing)
        allow(each.story);

    auto words = Words(untouched[0] + " before true false"), told = Words(story[0]);
    for (int number = 0; number <= 32; ++number) // a status, or the number of returned texts
        words.insert(std::to_string(number));
    for (const platform::SimSlot& slot : device.slots)
    {
        const std::string mcc = slot.mcc.value_or(""), mnc = slot.mnc.value_or("");
        words.insert({mcc, mnc, mcc + mnc + slot.msin.value_or(""), slot.number.value_or(""), slot.imei.value_or("")});
    }
    const bool isPartial = operation.kind != Kind::Single && std::includes(words.begin(), words.end(), told.begin(), told.end());
    const bool hasCount = operation.name.find("vector") != std::string::npos; // of its texts, each after a space, like itself
    const auto texts = std::count(story[0].begin(), story[0].end(), ' ') - 1;
    if (hasCount && story[0].substr(story[0].rfind(' ') + 1) != std::to_string(texts))
        return testing::AssertionFailure() << operation.name << " miscounts " << story[0];
    if (results.count(story[0]) == 0 && !isPartial)
        return testing::AssertionFailure() << operation.name << " gave " << story[0] << ", untouched " << untouched[0];
    for (std::size_t i = 1; i < story.size(); ++i)
    {
        if (lines.count(AnyNumber(story[i])) == 0)
            return testing::AssertionFailure() << operation.name << " logged " << story[i];
    }
    return testing::AssertionSuccess();
}

} // namespace kiv::test
