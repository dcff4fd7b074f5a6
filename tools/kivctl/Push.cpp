#include "Bus.h"
#include "LibraryLog.h"
#include "Progress.h"
#include "StaleRecord.h"
#include "Verbs.h"

#include <DADBusManager.h>
#include <ResultCode.h>

namespace
{

/// Counts the library's deliveries by the lines that it logs. A delivery begins with the bus name of its record. It ends with an
/// error about its proxy, or with the "end" line of its call; the error of a failed call comes before that line.
class Deliveries
{
public:
    void Read(const LibraryLine& line)
    {
        const bool isError = line.level == LibraryLine::Level::Error;
        const bool isStart = line.function == "DeliverPushMessage";
        if (!isError && isStart && line.message.rfind("busname: ", 0) == 0)
            ++started_;
        else if (isError && line.message.rfind("Unable to create proxy: ", 0) == 0)
            End(line.message);
        else if (isError && isStart)
            refusals_.push_back(line.message);
        else if (isError)
            trouble_ = line.message;
        else if (line.function == "proxy_call_cb" && line.message == "end")
            End(trouble_);
    }

    size_t UnderWay() const { return started_ - ended_; }
    size_t Started() const { return started_; }
    const std::vector<std::string>& Troubles() const { return troubles_; }
    const std::vector<std::string>& Refusals() const { return refusals_; }

private:
    void End(const std::string& trouble)
    {
        ++ended_;
        if (!trouble.empty())
            troubles_.push_back(trouble);
        trouble_.clear();
    }

    size_t started_ = 0;
    size_t ended_ = 0;
    std::string trouble_; ///< of the call that is ending
    std::vector<std::string> troubles_;
    std::vector<std::string> refusals_;
};

void AwaitEnd(const Deliveries& deliveries)
{
    const Progress progress;
    while (deliveries.UnderWay() > 0)
    {
        progress.Show(std::to_string(deliveries.UnderWay()) + " of " + std::to_string(deliveries.Started()) + " not answered yet");
        g_main_context_iteration(nullptr, TRUE);
    }
}

} // namespace

Exit Push(const PushOptions& options, const Command& command)
{
    Deliveries deliveries;
    const LibraryLog log([&deliveries](const LibraryLine& line) { deliveries.Read(line); });
    const BusConnection connection = RequireBus();

    DADBusManager::GetInstance()->DeliverPushMessage(
        options.service.c_str(), options.data.c_str(), options.message.c_str(), options.time);
    log.RequireStore();
    RequireSuccess(deliveries.Refusals().empty() ? KIV_RESULT_SUCCESS : KIV_RESULT_INVALID_ARGUMENT, deliveries.Refusals());
    AwaitEnd(deliveries);

    const size_t failed = deliveries.Troubles().size();
    for (const std::string& trouble : deliveries.Troubles())
        Note("a delivery failed: " + DeliveryTrouble(trouble, "push", options.service, ""));
    PrintLine({{"event", "sent"}, {"subscribers", static_cast<std::int64_t>(deliveries.Started())},
                  {"delivered", static_cast<std::int64_t>(deliveries.Started() - failed)}},
        command.form);
    if (deliveries.Started() == 0)
        Note("there are no subscribers to pushes of \"" + options.service + "\" (kivctl subscribers list)");
    return deliveries.Started() > 0 && failed == 0 ? Exit::Done : Exit::No;
}
