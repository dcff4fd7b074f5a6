// The facade's questions about all SIMs, each beside what its contract makes of a device.
#include "sim/SimTest.h"

#include <algorithm>

namespace
{

using namespace kiv::test;
namespace sim = kiv::sim;

const std::string kNotAvailable = ErrorLine("IsSimAvailable", "Sim is not available");

/// One of the four texts of a SIM.
struct Text
{
    std::string name, failure;
    int noAnswer;
    int (DASystem::*first)(char**);
    void (DASystem::*every)(std::vector<char*>*, int*);
    std::string bySlot[3];
};

const Text kTexts[] = {
    {"GetMCCFromSim", "fail to get MCC", 4, &DASystem::GetMCCFromSim, &DASystem::GetMCCFromSim, {"450", "451", "452"}},
    {"GetMNCFromSim", "fail to get MNC", 4, &DASystem::GetMNCFromSim, &DASystem::GetMNCFromSim, {"05", "012", "99"}},
    {"GetIMSIFromSim", "fail to get imsi", 4, &DASystem::GetIMSIFromSim, &DASystem::GetIMSIFromSim,
        {"450050123456780", "4510120123456781", "452990123456782"}},
    {"GetPhoneNumberFromSim", "fail to get phoneNumber", -39841791, &DASystem::GetPhoneNumberFromSim,
        &DASystem::GetPhoneNumberFromSim, {"", "+491515550001", "0002"}},
};

std::string AskFirst(const Text& text)
{
    char* out = before;
    const int code = (DASystem::GetInstance()->*text.first)(&out);
    return Tell(code, Take(out));
}

std::string AskEvery(const Text& text)
{
    std::vector<char*> values{before};
    int count = 77;
    (DASystem::GetInstance()->*text.every)(&values, &count);
    std::string told = Tell(count);
    for (char* const value : values)
        told += ' ' + Take(value);
    return told;
}

/// @param most  1 for the first answer, 3 for every one
Story TextStory(const Text& text, const Sims& sims, int most)
{
    Story story(1);
    std::string answers;
    int count = 0;
    for (std::size_t slot = 0; slot < sims.size() && count < most; ++slot)
    {
        if (sims[slot] == Sim::kLocked)
            story.push_back(kNotAvailable);
        if (sims[slot] != Sim::kAnswers)
        {
            story.push_back(ErrorLine(text.name, text.failure));
            continue;
        }
        ++count;
        answers += ' ' + text.bySlot[slot];
    }
    if (most == 1)
        story[0] = count == 1 ? '0' + answers : Tell(text.noAnswer, "before");
    else
        story[0] = Tell(count, "before") + answers;
    return story;
}

Story AnyStory(const Sims& sims)
{
    const auto usable = std::find_if(sims.begin(), sims.end(), [](Sim sim) { return sim != Sim::kLocked; });
    Story story{Tell(usable != sims.end())};
    story.resize(1 + static_cast<std::size_t>(usable - sims.begin()), kNotAvailable);
    return story;
}

Story DualStory(const Sims& sims)
{
    if (sims.size() < 2)
        return {"false", "E DASystem.cpp IsDualSimAvailable > [Single Sim Device] Not support Dual Sim."};
    if (sims[0] == Sim::kLocked || sims[1] == Sim::kLocked)
        return {"false", kNotAvailable};
    return {"true"};
}

Story ExistStory(const Sims& sims)
{
    Story story{"false"};
    for (std::size_t slot = 0; slot < sims.size(); ++slot)
    {
        if (sims[slot] == Sim::kLocked)
            story.push_back(ErrorLine("IsSimExist", "SIM STATE[" + Tell(slot) + "] : TELEPHONY_SIM_STATE_LOCKED"));
        else
            story[0] = "true";
    }
    return story;
}

struct FacadeSims : SimTest
{
    /// Asks each question. Telephony can not be opened without SIMs.
    void Ask(const Sims& sims)
    {
        SCOPED_TRACE(testing::PrintToString(sims));
        const auto expect = [&](const Story& opened, const char* notOpened, const std::function<std::string()>& ask)
        {
            const Story none{notOpened, ErrorLine("SuccessToInitTelephonyHandle", "telephony_init Failed.")};
            EXPECT_EQ(sims.empty() ? none : opened, Hear(ask));
        };
        expect(AnyStory(sims), "false", [] { return Tell(DASystem::GetInstance()->IsSimAvailable()); });
        expect(DualStory(sims), "false", [] { return Tell(DASystem::GetInstance()->IsDualSimAvailable()); });
        EXPECT_EQ(ExistStory(sims), Hear([] { return Tell(DASystem::GetInstance()->IsSimExist()); }));
        for (const Text& text : kTexts)
        {
            expect(TextStory(text, sims, 1), "4 before", [&] { return AskFirst(text); });
            expect(TextStory(text, sims, 3), "77 before", [&] { return AskEvery(text); });
        }
    }
};

TEST_F(FacadeSims, AnswerOnEveryPatternOfUpToThreeSlots)
{
    std::vector<Sims> patterns = {{}};
    for (std::size_t i = 0; i < patterns.size(); ++i)
    {
        const Sims sims = patterns[i];
        for (const Sim next : {Sim::kAnswers, Sim::kSilent, Sim::kLocked})
        {
            if (sims.size() < 3)
                patterns.insert(patterns.end(), sims)->push_back(next);
        }
        Insert(sims);
        Ask(sims);
    }
    EXPECT_EQ(1U + 3 + 9 + 27, patterns.size());
}

TEST_F(FacadeSims, AnswerAsWithoutSlotsWhenTelephonyDoesNotOpenOrNoStateIsRead)
{
    Insert({Sim::kAnswers, Sim::kAnswers});
    sim::FailCall(Call::telephony_init, -17);
    Ask({});
    sim::ClearFaults();
    sim::FailCall(Call::telephony_sim_get_state, -17);
    EXPECT_EQ(Story{"false"}, Hear([] { return Tell(DASystem::GetInstance()->IsSimExist()); }));
    sim::ClearFaults();
}

} // namespace
