#include "Bus.h"
#include "Deadline.h"
#include "LibraryLog.h"
#include "Progress.h"
#include "StaleRecord.h"
#include "Verbs.h"

#include <DADBusManager.h>
#include <DASystem.h>
#include <ResultCode.h>

#include <algorithm>
#include <array>
#include <iterator>

namespace
{

/// An event that can be sent, and the kind of the subscriptions that receive it.
struct Type
{
    const char* word;
    _KIV_NOTI_TYPE_E type;
    const char* kind;
};

constexpr Type kTypes[] = {
    {"activated", KIV_NOTI_TYPE_ACTIVATED, "activated"},
    {"auth-fail", KIV_NOTI_TYPE_AUTH_FAIL, "auth"},
    {"auth-success", KIV_NOTI_TYPE_AUTH_SUCCESS, "auth"},
    {"deactivated", KIV_NOTI_TYPE_DEACTIVATED, "activated"},
    {"number_changed", KIV_NOTI_TYPE_NUMBER_CHANGED, "number_changed"},
    {"off", KIV_NOTI_TYPE_STATUS_OFF, "status"},
    {"on", KIV_NOTI_TYPE_STATUS_ON, "status"},
    {"policy", KIV_NOTI_TYPE_POLICY, "policy"},
};

const Type& TypeOf(const std::string& word)
{
    return *std::find_if(std::begin(kTypes), std::end(kTypes), [&word](const Type& type) { return word == type.word; });
}

bool IsSwitch(const std::string& word)
{
    return std::string("status") == TypeOf(word).kind;
}

bool TakesTexts(const std::string& type)
{
    return type == "policy" || type == "number_changed";
}

void Require(bool holds, const char* text)
{
    if (!holds)
        throw Failure(Exit::Usage, text);
}

/// Checks that the options fit together.
void CheckOptions(const NotifyOptions& options)
{
    const std::string& first = options.types.front();
    const bool areSwitches = std::all_of(options.types.begin(), options.types.end(), IsSwitch);
    Require(options.types.size() == 1 || areSwitches, "only \"on\" and \"off\" can be sent together");
    Require(options.types.size() == 1 || options.to == "subscribers", "the service manager accepts one event at a time");
    const size_t services = areSwitches ? options.types.size() : first == "policy" ? 1 : 0;
    Require(options.services.size() == services, areSwitches ? "each \"on\" and \"off\" needs one --service, in the same order"
                                                 : services  ? "\"policy\" needs one --service"
                                                             : "only \"on\", \"off\" and \"policy\" have a --service");
    Require(options.texts.size() == (TakesTexts(first) ? 4 : 0),
        "\"policy\" and \"number_changed\" need four --texts; the others have none");
}

/// The result of the call to one subscriber.
struct Delivery
{
    std::string busName;
    size_t event;        ///< which of the events, counted from 0
    std::string trouble; ///< empty when it was answered
};

/// Follows the library's walks over the subscribers, one per event, by the lines that it logs: "begin", then a record's bus name,
/// then an error line if the call failed. Error lines before the first record say why there was no walk.
class Walk
{
public:
    void Read(const LibraryLine& line)
    {
        static const std::string kBusName = "busname: ";
        const bool isError = line.level == LibraryLine::Level::Error;
        if (!isError && line.message == "begin")
            ++begun_;
        else if (!isError && line.message.rfind(kBusName, 0) == 0)
            deliveries_.push_back({line.message.substr(kBusName.size()), begun_ - 1, ""});
        else if (isError && deliveries_.empty())
            refusals_.push_back(line.message);
        else if (isError && line.message.rfind(' ', 0) != 0) // the lines that begin with a blank repeat the record
            deliveries_.back().trouble = line.message;
    }

    const std::vector<Delivery>& Deliveries() const { return deliveries_; }
    const std::vector<std::string>& Refusals() const { return refusals_; }

private:
    size_t begun_ = 0;
    std::vector<Delivery> deliveries_;
    std::vector<std::string> refusals_;
};

bool IsClosed(const std::string& trouble)
{
    return trouble.find("onnection is closed") != trouble.npos;
}

/// Says why there was no delivery. A connection that was closed at the deadline means that the time was up.
std::string Explained(const Delivery& delivery, const NotifyOptions& options, bool wasMissed)
{
    if (wasMissed && IsClosed(delivery.trouble))
        return "no answer in time";
    const std::string key = options.services.empty() ? "all" : std::to_string(options.services.at(delivery.event));
    return DeliveryTrouble(delivery.trouble, TypeOf(options.types.front()).kind, key, delivery.busName);
}

/// Sends the notifications through the facade. @return its result code
int SendToSubscribers(const NotifyOptions& options, std::string imsi, const std::array<const char*, 4>& texts)
{
    DASystem* const system = DASystem::GetInstance();
    if (options.types.size() == 1)
    {
        return system->SendNotiToServiceManager(TypeOf(options.types.front()).type, imsi.c_str(),
            options.services.empty() ? 0 : options.services.front(), texts[0], texts[1], texts[2], texts[3]);
    }
    std::vector<int> services = options.services;
    std::vector<std::string> words = options.types;
    std::vector<char*> statuses(words.size());
    std::transform(words.begin(), words.end(), statuses.begin(), [](std::string& word) { return word.data(); });
    return system->SendMultiOnOffNotiToServiceManager(
        imsi.c_str(), static_cast<int>(statuses.size()), services.data(), statuses.data());
}

Exit NotifySubscribers(
    const NotifyOptions& options, const std::string& imsi, const std::array<const char*, 4>& texts, const Form& form)
{
    Walk walk;
    const Progress progress;
    const LibraryLog log(
        [&walk, &progress](const LibraryLine& line)
        {
            walk.Read(line);
            if (!walk.Deliveries().empty())
                progress.Show("notifying " + walk.Deliveries().back().busName);
        });

    // The facade's result does not say whether the bus is reachable, so connect first and keep the connection for the walk.
    const BusConnection connection = RequireBus();
    Deadline deadline(options.timeout, [&connection] { g_dbus_connection_close_sync(connection.get(), nullptr, nullptr); });
    const int code = SendToSubscribers(options, imsi, texts);
    const bool wasMissed = deadline.WasMissed();
    progress.Show("");
    log.RequireStore();
    RequireSuccess(code == KIV_RESULT_SUCCESS && !walk.Refusals().empty() ? KIV_RESULT_INVALID_ARGUMENT : code, walk.Refusals());

    std::int64_t delivered = 0;
    for (const Delivery& delivery : walk.Deliveries())
    {
        if (delivery.trouble.empty())
            ++delivered;
        else
            Note("not delivered to " + delivery.busName + ": " + Explained(delivery, options, wasMissed));
    }
    const auto subscribers = static_cast<std::int64_t>(walk.Deliveries().size());
    PrintLine({{"event", "sent"}, {"subscribers", subscribers}, {"delivered", delivered}}, form);
    if (subscribers == 0)
        Note("there are no subscribers to this event (kivctl subscribers list)");
    if (wasMissed && delivered < subscribers)
        throw Failure(Exit::TimeUp, "timed out");
    return subscribers > 0 && delivered == subscribers ? Exit::Done : Exit::No;
}

Exit NotifyManager(const NotifyOptions& options, const std::string& imsi, const std::array<const char*, 4>& texts, const Form& form)
{
    const LibraryLog log;
    const BusConnection connection = RequireBus();
    Deadline deadline(options.timeout, [&connection] { g_dbus_connection_close_sync(connection.get(), nullptr, nullptr); });
    const int code = DADBusManager::GetInstance()->SendNotiToServiceManager(TypeOf(options.types.front()).type, imsi.c_str(),
        options.services.empty() ? 0 : options.services.front(), texts[0], texts[1], texts[2], texts[3]);
    if (deadline.WasMissed() && code != 0)
        throw Failure(Exit::TimeUp, "the service manager did not answer in time");
    RequireSuccess(code, log.Errors());
    PrintLine({{"event", "sent"}, {"delivered", std::int64_t{1}}}, form);
    return Exit::Done;
}

/// The IMSI that was given; without one, that of the first SIM that answers, as an agent reads it.
std::string Imsi(const NotifyOptions& options)
{
    if (!options.imsi.empty())
        return options.imsi;
    char* imsi = nullptr;
    DASystem::GetInstance()->GetIMSIFromSim(&imsi);
    const LibraryText owner(imsi);
    if (!imsi)
        throw Failure(Exit::No, "no SIM of this device has a readable IMSI; give one with --imsi");
    return imsi;
}

} // namespace

std::vector<std::string> NotificationTypes()
{
    std::vector<std::string> words(std::size(kTypes));
    std::transform(std::begin(kTypes), std::end(kTypes), words.begin(), [](const Type& type) { return type.word; });
    return words;
}

std::string KindOf(const std::string& type)
{
    return TypeOf(type).kind;
}

Exit Notify(const NotifyOptions& options, const Command& command)
{
    CheckOptions(options);
    std::array<const char*, 4> texts{};
    std::transform(options.texts.begin(), options.texts.end(), texts.begin(), [](const std::string& text) { return text.c_str(); });
    const auto notify = options.to == "manager" ? NotifyManager : NotifySubscribers;
    return notify(options, Imsi(options), texts, command.form);
}
