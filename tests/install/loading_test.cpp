// An agent that opens the library while it runs, and closes it with changes and deliveries still to come.
#include "bus/Subscribers.h"
#include "support/Peer.h"
#include "support/PrivateBus.h"

#include <IDAConnectionStateListener.h>
#include <SimulatedDevice.h>

#include <gtest/gtest.h>

#include <atomic>
#include <dlfcn.h>

namespace
{

using namespace kiv::test;

struct Listener : IDAConnectionStateListener
{
    void OnWifiDeviceStateChanged(wifi_device_state_e, void*) override {}
    void OnWifiConnectionStateChanged(wifi_connection_state_e, void*, void*) override {}
    void OnFlightModeChanged(bool, void*) override { ++heard; }
    void OnPacketDataChanged(bool, void*) override {}
    void OnWifiConnectedChanged(bool, void*) override {}

    std::atomic<int> heard{0};
};

/// A function of the library by its name there; a member takes its object first.
template <class Function>
Function* Symbol(void* library, const char* name)
{
    return reinterpret_cast<Function*>(dlsym(library, name));
}

TEST(Library, ThatIsClosedWithAListenerAndAPushUnderWayStaysForThem)
{
    constexpr int kTimes = 1000;
    const PrivateBus bus;
    Peer client(bus);
    Subscribers store;
    store.records = {{client.Name(), "/example/client", "org.example.Client"}};
    Listener listener;
    ASSERT_EQ(nullptr, dlopen(KIV_LIBRARY, RTLD_NOW | RTLD_NOLOAD)) << "the test has to open it";

    for (int i = 1; i <= kTimes; ++i)
    {
        void* const library = dlopen(KIV_LIBRARY, RTLD_NOW | RTLD_LOCAL);
        ASSERT_NE(nullptr, library) << dlerror();
        void* const facade = Symbol<void*()>(library, "_ZN8DASystem11GetInstanceEv")();
        void* const manager = Symbol<void*()>(library, "_ZN13DADBusManager11GetInstanceEv")();
        Symbol<void(void*, IDAConnectionStateListener*, void*)>(
            library, "_ZN8DASystem26SetConnectionEventListenerEP26IDAConnectionStateListenerPv")(facade, &listener, nullptr);
        Symbol<int(void*, const char*, const char*, const char*, long long)>(
            library, "_ZN13DADBusManager18DeliverPushMessageEPKcS1_S1_x")(manager, "7", "data", "message", i);
        ASSERT_EQ(0, dlclose(library));

        kiv::sim::ChangeDevice([](kiv::sim::Device& device) { device.flightMode = !device.flightMode; });
        EXPECT_EQ(i, listener.heard);
        const gint64 deadline = g_get_monotonic_time() + 20 * G_TIME_SPAN_SECOND;
        while (client.Calls().size() < static_cast<std::size_t>(i) && g_get_monotonic_time() < deadline)
            g_main_context_iteration(nullptr, FALSE);
        ASSERT_EQ(static_cast<std::size_t>(i), client.Calls().size());
    }
    kiv::sim::ResetDevice();
}

} // namespace
