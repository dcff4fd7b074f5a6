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

void Language(benchmark::State& state)
{
    for (auto _ : state)
    {
        char* code = nullptr;
        DASystem::GetInstance()->GetDeviceLanguageCode(&code, true);
        benchmark::DoNotOptimize(code);
        std::free(code);
    }
}

void LanguageSetting(benchmark::State& state)
{
    for (auto _ : state)
    {
        char* setting = nullptr;
        system_settings_get_value_string(SYSTEM_SETTINGS_KEY_LOCALE_LANGUAGE, &setting);
        benchmark::DoNotOptimize(setting);
        std::free(setting);
    }
}

void Change(benchmark::State& state)
{
    SilentListener listener;
    DAConnectionManager::__pListener = &listener;
    for (auto _ : state)
        DAConnectionManager::OnConnectionStateChanged(RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED, nullptr);
    DAConnectionManager::__pListener = nullptr;
}

void FlightMode(benchmark::State& state)
{
    for (auto _ : state)
    {
        bool enabled = false;
        runtime_info_get_value_bool(RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED, &enabled);
        benchmark::DoNotOptimize(enabled);
    }
}

} // namespace

void AddDeviceQueries()
{
    Compare("device language, against its platform call", {1.2, 500}, Clock::Cpu, Language, LanguageSetting);
    Compare("change notification, against its platform call", {1.0, 2000}, Clock::Cpu, Change, FlightMode);
}

} // namespace kiv::bench
