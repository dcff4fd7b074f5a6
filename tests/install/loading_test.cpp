// An agent that opens the library at run time, and closes it while changes and deliveries are still to come.
#include "bus/BusTest.h"

#include <DeviceControl.h>
#include <IDAConnectionStateListener.h>
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

    std::atomic<unsigned> heard{0};
};

/// Returns a function of the library by its symbol; a member takes its object first.
template <class Function>
Function* Symbol(void* library, const char* name)
{
    return reinterpret_cast<Function*>(dlsym(library, name));
}

TEST(Library, StaysLoadedForItsCallbacksAfterItIsClosed)
{
    const PrivateBus bus;
    Peer client(bus);
    Subscribers store;
    store.records = {BusTest::Record(client)};
    Listener listener;
    ASSERT_EQ(nullptr, dlopen(KIV_LIBRARY, RTLD_NOW | RTLD_NOLOAD)) << "the test has to open it";

    for (unsigned i = 1; i <= 50 && !HasFailure(); ++i)
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

        kiv::platform::ChangeDevice([](kiv::platform::Device& device) { device.flightMode = !device.flightMode; });
        EXPECT_EQ(i, listener.heard);
        IterateUntil([&] { return client.Calls().size() == i; });
    }
    kiv::platform::ResetDevice();
}

} // namespace
