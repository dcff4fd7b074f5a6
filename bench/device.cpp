#include "Items.h"
#include "Ratios.h"

#include <DAConnectionManager.h>
#include <DASystem.h>
#include <system_settings.h>

#include <cstdlib>

namespace kiv::bench
{

namespace
{

class SilentListener : public IDAConnectionStateListener
{
public:
    void OnWifiDeviceStateChanged(wifi_device_state_e, void*) override {}
    void OnWifiConnectionStateChanged(wifi_connection_state_e, void*, void*) override {}
    void OnFlightModeChanged(bool enabled, void*) override { benchmark::DoNotOptimize(enabled); }
    void OnPacketDataChanged(bool, void*) override {}
    void OnWifiConnectedChanged(bool, void*) override {}
};

void Language()
{
    char* code = nullptr;
    DASystem::GetInstance()->GetDeviceLanguageCode(&code, true);
    benchmark::DoNotOptimize(code);
    std::free(code);
}

void LanguageSetting()
{
    char* setting = nullptr;
    system_settings_get_value_string(SYSTEM_SETTINGS_KEY_LOCALE_LANGUAGE, &setting);
    benchmark::DoNotOptimize(setting);
    std::free(setting);
}

void Change()
{
    DAConnectionManager::OnConnectionStateChanged(RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED, nullptr);
}

void FlightMode()
{
    bool enabled = false;
    runtime_info_get_value_bool(RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED, &enabled);
    benchmark::DoNotOptimize(enabled);
}

constexpr int kCalls = 1000;

} // namespace

void MeasureDeviceQueries(Table& table)
{
    Compare(table, {"device language, against its platform call", {1.2, 500}, CpuNs, kCalls, {Times(kCalls, Language)},
                       {Times(kCalls, LanguageSetting)}});

    SilentListener listener;
    DAConnectionManager::__pListener = &listener;
    Compare(table, {"change notification, against its platform call", {1.0, 2000}, CpuNs, kCalls, {Times(kCalls, Change)},
                       {Times(kCalls, FlightMode)}});
    DAConnectionManager::__pListener = nullptr;
}

} // namespace kiv::bench
