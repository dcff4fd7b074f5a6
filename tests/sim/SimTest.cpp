#include "sim/SimTest.h"

namespace kiv::test
{

SimTest::~SimTest()
{
    EXPECT_THAT(sim::OpenHandles(), testing::IsEmpty());
    EXPECT_THAT(sim::TakeMisuses(), testing::IsEmpty());
    EXPECT_STREQ("", heldLock);
    sim::ResetDevice();
}

void SimTest::Insert(const Sims& sims)
{
    static const sim::SimSlot kSlots[] = {{"modem0", {3}, {}, "450", "05", "0123456780", "", {}},
        {"modem1", {3}, {}, "451", "012", "0123456781", "+491515550001", {}},
        {"modem2", {3}, {}, "452", "99", "0123456782", "0002", {}}};
    sim::Device device;
    device.defaultNetwork = 1;
    device.preferredVoice = 7; // no enumeration names it
    device.defaultData = -1;
    for (std::size_t i = 0; i < sims.size(); ++i)
    {
        sim::SimSlot& slot = device.slots.emplace_back(kSlots[i]);
        if (sims[i] == Sim::kLocked)
            slot.cardStatus = {4};
        if (sims[i] == Sim::kSilent)
            slot.mcc = slot.number = std::nullopt;
    }
    sim::SetDevice(device);
}

Story SimTest::Hear(const std::function<std::string()>& ask)
{
    log.Take();
    Story story{ask()};
    const auto lines = log.Take();
    story.insert(story.end(), lines.begin(), lines.end());
    return story;
}

Story SimTest::Try(const Operation& operation, const std::function<void()>& arm, int slot)
{
    SCOPED_TRACE(operation.name);
    Insert({Sim::kAnswers, Sim::kAnswers});
    Slots slots{};
    EXPECT_EQ(0, telephony_init(&slots));
    made.clear();
    sim::SetCallHook(
        [this, &locked = operation.locked](Call call, int)
        {
            const bool isLocked = locked == kWhole || testing::Value(locked, testing::Contains(call));
            EXPECT_STREQ(isLocked ? kSimAccess : "", heldLock) << sim::NameOf(call);
            made.push_back(call);
            return "";
        });
    if (arm)
        arm();
    Story story = Hear([&] { return operation.run(slots, slot); });
    sim::SetCallHook(nullptr);
    sim::ClearFaults();
    EXPECT_EQ(0, telephony_deinit(&slots));
    EXPECT_THAT(sim::OpenHandles(), testing::IsEmpty());
    return story;
}

} // namespace kiv::test
