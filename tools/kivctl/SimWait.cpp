#include "Progress.h"
#include "SimCard.h"
#include "Verbs.h"

#include <DASystem.h>

#include <algorithm>
#include <chrono>
#include <thread>

namespace
{

using Clock = std::chrono::steady_clock;

/// The card of one slot, as one question found it.
struct Answer
{
    int slot;
    bool isUsable;
    bool mayBecomeUsable;
    std::string text;
};

Answer Ask(int slot)
{
    constexpr auto kUnread = static_cast<TelSimCardStatus_t>(-1);
    DASystem* const system = DASystem::GetInstance();
    TelSimCardStatus_t status = kUnread;
    const bool isUsable = system->IsAvaliableState(slot, &status);
    if (status == kUnread)
        return {slot, false, true, "modem does not answer"};
    // A card without power is waited for, as the library's own poll does.
    const bool mayBecomeUsable = system->IsWaittingSimCheck(status) || status == TAPI_SIM_STATUS_CARD_POWEROFF;
    return {slot, isUsable, mayBecomeUsable, CardStatusWord(status)};
}

std::string Tell(const std::vector<Answer>& answers)
{
    std::string text;
    for (const Answer& answer : answers)
        text += (text.empty() ? "slot " : "; slot ") + std::to_string(answer.slot) + ": " + answer.text;
    return text;
}

} // namespace

Exit WaitForSim(const SimOptions& options, const Command& command)
{
    const std::vector<int> slots = RequireSlots(options.slot, RequireCpNames().size());
    const auto begin = Clock::now();
    const auto waited = [begin] { return std::chrono::duration<double>(Clock::now() - begin).count(); };
    const auto seconds = [&waited] { return std::to_string(static_cast<std::int64_t>(waited())) + " s"; };
    const Progress progress;
    for (;;)
    {
        std::vector<Answer> answers;
        std::transform(slots.begin(), slots.end(), std::back_inserter(answers), Ask);
        const auto usable = std::find_if(answers.begin(), answers.end(), [](const Answer& answer) { return answer.isUsable; });
        if (usable != answers.end())
        {
            progress.Show("");
            Print({{"usable_slot", std::int64_t{usable->slot}}, {"waited_seconds", static_cast<std::int64_t>(waited())}},
                command.form);
            return Exit::Done;
        }
        if (std::none_of(answers.begin(), answers.end(), [](const Answer& answer) { return answer.mayBecomeUsable; }))
            throw Failure(Exit::No, "waiting makes no SIM usable: " + Tell(answers));
        if (options.timeout && waited() >= *options.timeout)
            throw Failure(Exit::TimeUp, "no SIM is usable after " + seconds() + ": " + Tell(answers));

        progress.Show("waiting, " + seconds() + ": " + Tell(answers));
        const double pause = options.timeout ? std::clamp(*options.timeout - waited(), 0.0, 1.0) : 1.0;
        std::this_thread::sleep_for(std::chrono::duration<double>(pause));
    }
}
