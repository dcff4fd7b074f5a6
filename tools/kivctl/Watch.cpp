#include "SimCard.h"
#include "Verbs.h"

#include <DASystem.h>
#include <StandardOutput.h>
#include <StopSignals.h>
#include <glib.h>

#include <algorithm>
#include <atomic>
#include <utility>

namespace
{

/// Prints the changes that the device reports, on the thread that reports them.
class Printer : public IDAConnectionStateListener
{
public:
    explicit Printer(Form form) : form_(std::move(form)) {}

    void OnWifiDeviceStateChanged(wifi_device_state_e state, void*) override
    {
        static constexpr Word kWords[] = {{WIFI_DEVICE_STATE_DEACTIVATED, "off"}, {WIFI_DEVICE_STATE_ACTIVATED, "on"}};
        Report("wifi_device", WordFor(kWords, state));
    }

    void OnWifiConnectionStateChanged(wifi_connection_state_e state, void*, void*) override
    {
        static constexpr Word kWords[] = {{WIFI_CONNECTION_STATE_FAILURE, "failure"},
            {WIFI_CONNECTION_STATE_DISCONNECTED, "disconnected"}, {WIFI_CONNECTION_STATE_ASSOCIATION, "associating"},
            {WIFI_CONNECTION_STATE_CONFIGURATION, "configuring"}, {WIFI_CONNECTION_STATE_CONNECTED, "connected"}};
        Report("wifi_connection", WordFor(kWords, state));
    }

    void OnFlightModeChanged(bool enabled, void*) override { Report("flight_mode", enabled); }
    void OnPacketDataChanged(bool enabled, void*) override { Report("packet_data", enabled); }

    /// Two states of Wi-Fi are "not connected": a change from one to the other is none here.
    void OnWifiConnectedChanged(bool connected, void*) override
    {
        if (wifiConnected_.exchange(connected) != static_cast<int>(connected))
            Report("wifi_connected", connected);
    }

private:
    void Report(const char* event, Value value) const { PrintLine({{"event", event}, {"value", std::move(value)}}, form_); }

    const Form form_;
    std::atomic<int> wifiConnected_{-1}; ///< not reported yet
};

/// Reads the card statuses once per second, in the default main context, and prints their changes, because the platform does not
/// report them.
class CardWatch
{
public:
    explicit CardWatch(const Form& form) : form_(form), cards_(ReadCards()), timer_(g_timeout_add_seconds(1, Check, this)) {}
    CardWatch(const CardWatch&) = delete;
    CardWatch& operator=(const CardWatch&) = delete;
    ~CardWatch() { g_source_remove(timer_); }

private:
    /// Card statuses by slot; none of a device without modems.
    static std::vector<std::string> ReadCards()
    {
        g_auto(GStrv) names = DASystem::GetInstance()->GetCpNameList();
        std::vector<std::string> cards;
        for (int slot = 0; names != nullptr && names[slot] != nullptr; ++slot)
            cards.push_back(ReadCard(slot).text);
        return cards;
    }

    static gboolean Check(gpointer self)
    {
        static_cast<CardWatch*>(self)->PrintChanges();
        return G_SOURCE_CONTINUE;
    }

    void PrintChanges()
    {
        std::vector<std::string> now = ReadCards();
        const auto card = [](const char* name, const std::vector<std::string>& cards, size_t slot) {
            return slot < cards.size() ? Field{name, cards[slot]} : Missing(name, "no such slot");
        };
        for (size_t slot = 0; slot < std::max(cards_.size(), now.size()); ++slot)
        {
            Field before = card("old", cards_, slot), after = card("new", now, slot);
            if (before.value != after.value)
                PrintLine(
                    {{"event", "card"}, {"slot", static_cast<std::int64_t>(slot)}, std::move(before), std::move(after)}, form_);
        }
        cards_ = std::move(now);
    }

    const Form& form_;
    std::vector<std::string> cards_;
    const guint timer_;
};

} // namespace

Exit Watch(const Command& command)
{
    const std::string device = DeviceAskedFor(command);
    if (IsProfileName(device) && !IsHost(device))
        Note("a device from a profile never changes; to change one, use a device file (kivctl device set --profile FILE)");

    // Registered until the process ends: it may be removed only while no change is being delivered, and the device delivers on
    // a separate thread at any time.
    static Printer* const printer = new Printer(command.form);
    kiv::StopSignals signals;
    DASystem::GetInstance()->SetConnectionEventListener(printer, nullptr);
    const CardWatch cards(command.form);
    PrintLine({{"event", "ready"}}, command.form);
    signals.IterateWhile([] { return true; });
    kiv::StandardOutput::EndStream();
    return Exit::Done;
}
