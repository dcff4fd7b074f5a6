#include "Progress.h"
#include "SimCard.h"
#include "Verbs.h"

#include <algorithm>
#include <chrono>
#include <thread>

namespace
{

using Clock = std::chrono::steady_clock;

std::string Describe(const std::vector<CardAnswer>& answers)
{
    std::string text;
    for (const CardAnswer& answer : answers)
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
        std::vector<CardAnswer> answers;
        std::transform(slots.begin(), slots.end(), std::back_inserter(answers), ReadCard);
        const auto usable = std::find_if(answers.begin(), answers.end(), [](const CardAnswer& answer) { return answer.isUsable; });
        if (usable != answers.end())
        {
            progress.Show("");
            Print({{"usable_slot", std::int64_t{usable->slot}}, {"waited_seconds", static_cast<std::int64_t>(waited())}},
                command.form);
            return Exit::Done;
        }
        if (std::none_of(answers.begin(), answers.end(), [](const CardAnswer& answer) { return answer.mayBecomeUsable; }))
            throw Failure(Exit::No, "waiting does not make a SIM usable: " + Describe(answers));
        if (options.timeout && waited() >= *options.timeout)
            throw Failure(Exit::TimeUp, "no SIM is usable after " + seconds() + ": " + Describe(answers));

        progress.Show("waiting, " + seconds() + ": " + Describe(answers));
        const double pause = options.timeout ? std::clamp(*options.timeout - waited(), 0.0, 1.0) : 1.0;
        std::this_thread::sleep_for(std::chrono::duration<double>(pause));
    }
}
