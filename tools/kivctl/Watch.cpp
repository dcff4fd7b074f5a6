#include "Verbs.h"

#include <DASystem.h>
#include <StopSignals.h>

#include <utility>

namespace
{

/// Prints what the device tells, on the thread on which it does.
class Printer : public IDAConnectionStateListener
{
public:
    explicit Printer(Form form) : form_(form) {}

    void OnWifiDeviceStateChanged(wifi_device_state_e state, void*) override
    {
        static constexpr Word kWords[] = {{WIFI_DEVICE_STATE_DEACTIVATED, "off"}, {WIFI_DEVICE_STATE_ACTIVATED, "on"}};
        Tell("wifi_device", WordFor(kWords, state));
    }

    void OnWifiConnectionStateChanged(wifi_connection_state_e state, void*, void*) override
    {
        static constexpr Word kWords[] = {{WIFI_CONNECTION_STATE_FAILURE, "failure"},
            {WIFI_CONNECTION_STATE_DISCONNECTED, "disconnected"}, {WIFI_CONNECTION_STATE_ASSOCIATION, "associating"},
            {WIFI_CONNECTION_STATE_CONFIGURATION, "configuring"}, {WIFI_CONNECTION_STATE_CONNECTED, "connected"}};
        Tell("wifi_connection", WordFor(kWords, state));
    }

    void OnFlightModeChanged(bool enabled, void*) override { Tell("flight_mode", enabled); }
    void OnPacketDataChanged(bool enabled, void*) override { Tell("packet_data", enabled); }
    void OnWifiConnectedChanged(bool connected, void*) override { Tell("wifi_connected", connected); }

private:
    void Tell(const char* event, Value value) const { PrintLine({{"event", event}, {"value", std::move(value)}}, form_); }

    const Form form_;
};

} // namespace

Exit Watch(const Command& command)
{
    const std::string device = DeviceAskedFor(command);
    if (IsProfileName(device) && !IsHost(device))
        Note("this device comes from a profile and never changes; one from a file does (kivctl device set --profile FILE)");

    // Registered for as long as the process lives: taking it back is for a moment in which no change can be under way, and there
    // is none while the device goes on on a thread of its own.
    static Printer* const printer = new Printer(command.form);
    kiv::StopSignals signals;
    DASystem::GetInstance()->SetConnectionEventListener(printer, nullptr);
    PrintLine({{"event", "ready"}}, command.form);
    signals.IterateWhile([] { return true; });
    return Exit::Done;
}
