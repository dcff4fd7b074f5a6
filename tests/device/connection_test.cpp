// The connection states, and the listener that hears of their changes.
#include "device/DeviceTest.h"

#include <DAConnectionManager.h>
#include <net_connection.h>

#include <bitset>

namespace
{

using namespace kiv::test;
using testing::ElementsAre;
using testing::IsEmpty;

const struct StateQuery
{
    int (DASystem::*ask)();
    Call call;
    int Device::*fact;
} kCellular = {&DASystem::GetCellularNetworkState, Call::connection_get_cellular_state, &Device::cellularState},
  kWifi = {&DASystem::GetWifiNetworkState, Call::connection_get_wifi_state, &Device::wifiState},
  kBluetooth = {&DASystem::GetBTNetworkState, Call::connection_get_bt_state, &Device::bluetoothState};

/// What the listener heard: what changed, the new value, and the text that the user data stands for.
struct Listener : IDAConnectionStateListener
{
    void OnWifiDeviceStateChanged(wifi_device_state_e state, void* userData) override { Hear("device", state, userData); }
    void OnWifiConnectionStateChanged(wifi_connection_state_e state, void* ap, void* userData) override
    {
        accessPoint = ap;
        Hear("connection", state, userData);
    }
    void OnFlightModeChanged(bool enabled, void* userData) override { Hear("flight", enabled, userData); }
    void OnPacketDataChanged(bool enabled, void* userData) override { Hear("packet", enabled, userData); }
    void OnWifiConnectedChanged(bool connected, void* userData) override { Hear("wifi", connected, userData); }

    void Hear(const char* what, int value, void* userData)
    {
        heard.push_back(what + (' ' + std::to_string(value)) + ' ' + static_cast<const char*>(userData));
    }
    Lines Take() { return std::exchange(heard, {}); }

    Lines heard;
    void* accessPoint = nullptr;
};

/// Nothing of it is ever logged.
struct ConnectionTest : DeviceTest
{
    ConnectionTest()
    {
        after.wifiDeviceState = 0;
        after.wifiConnectionState = 3;
        after.wifiStatus = 2;
        after.flightMode = after.dataRoaming = true;
        after.packetData = false;
    }
    ~ConnectionTest() override
    {
        DAConnectionManager::__pListener = nullptr;
        EXPECT_THAT(log.Take(), IsEmpty());
    }
    void Register(IDAConnectionStateListener* to, const char* userData)
    {
        facade.SetConnectionEventListener(to, const_cast<char*>(userData));
    }

    const Device before = kiv::sim::GetDevice();
    Device after = before;
    Listener listener;
};

TEST_F(ConnectionTest, IsUpWhenOneOfTheSelectedIsAndAllOfThemAreAsked)
{
    for (unsigned bits = 0; bits < 32; ++bits)
    {
        const std::bitset<5> bit(bits);
        const bool checkWifi = bit[0], checkBluetooth = bit[1], cellular = bit[2], wifi = bit[3], bluetooth = bit[4];
        Set(kCellular.fact, cellular ? 5 : 2); // what means connected to one means something else to the others
        Set(kWifi.fact, wifi ? 2 : 5);
        Set(kBluetooth.fact, bluetooth ? 2 : 5);
        std::vector<Call> calls;
        for (const auto& [query, isSelected] : {std::pair(kCellular, true), {kWifi, checkWifi}, {kBluetooth, checkBluetooth}})
        {
            if (isSelected)
                calls.insert(calls.end(), {Call::connection_create, query.call, Call::connection_destroy});
        }
        const bool isUp = cellular || (checkWifi && wifi) || (checkBluetooth && bluetooth);
        EXPECT_EQ(isUp, facade.IsNetworkConnected(checkWifi, checkBluetooth)) << bits;
        EXPECT_EQ(calls, TakeCalls()) << bits;
    }
    for (const StateQuery& query : {kCellular, kWifi, kBluetooth})
    {
        for (const int state : {0, 99, -1}) // goes through as the platform has it
        {
            Set(query.fact, state);
            EXPECT_EQ(state, std::invoke(query.ask, facade));
        }
    }
}

TEST_F(ConnectionTest, ListenerIsRegisteredForFiveChangesAndUnregisteredFromThemWhateverFails)
{
    constexpr Call kStart = Call::wifi_initialize, kSetDevice = Call::wifi_set_device_state_changed_cb,
                   kUnsetDevice = Call::wifi_unset_device_state_changed_cb, kSetWifi = Call::wifi_set_connection_state_changed_cb,
                   kUnsetWifi = Call::wifi_unset_connection_state_changed_cb, kSet = Call::runtime_info_set_changed_cb,
                   kUnset = Call::runtime_info_unset_changed_cb;
    Register(nullptr, "a"); // there is nothing to unregister
    EXPECT_THAT(TakeCalls(), ElementsAre(kStart, kUnsetDevice, kUnsetWifi, kUnset, kUnset, kUnset));
    Register(&listener, "a");
    EXPECT_THAT(TakeCalls(), ElementsAre(kStart, kSetDevice, kSetWifi, kSet, kSet, kSet));
    const std::string values[] = {"wifi 1 a", "packet 0 a", "flight 1 a"};
    for (unsigned number = 1; number <= 3; ++number)
    {
        kiv::sim::ClearFaults();
        Register(nullptr, "a");
        kiv::sim::SetDevice(before);
        kiv::sim::FailCall(kSet, -1, kiv::sim::Only(number));
        Register(&listener, "a");
        kiv::sim::SetDevice(after);
        EXPECT_THAT(listener.Take(), testing::AllOf(testing::SizeIs(4), testing::Not(testing::Contains(values[number - 1]))));

        kiv::sim::SetDevice(before);
        Register(&listener, "a");
        kiv::sim::FailCall(kUnset, -1, kiv::sim::Only(number));
        Register(nullptr, "a");
        DAConnectionManager::__pListener = &listener;
        listener.Take();
        kiv::sim::SetDevice(after);
        EXPECT_THAT(listener.Take(), ElementsAre(values[number - 1])) << "the one registration that stayed";
    }
}

TEST_F(ConnectionTest, ListenerHearsOfEachChangedValueOnceWithTheUserDataOfTheLastRegistration)
{
    Register(&listener, "a");
    for (int i = 0; i < 2; ++i)
        kiv::sim::SetDevice(after);
    EXPECT_THAT(
        listener.Take(), testing::UnorderedElementsAre("device 0 a", "connection 3 a", "wifi 1 a", "packet 0 a", "flight 1 a"));

    Register(&listener, "b");
    for (const int status : {1, 2, 0, 3})
        Set(&Device::wifiStatus, status);
    EXPECT_THAT(listener.Take(), ElementsAre("wifi 0 b", "wifi 1 b", "wifi 0 b", "wifi 0 b"));

    Listener next;
    Register(&next, "c");
    Set(&Device::flightMode, false);
    EXPECT_THAT(next.Take(), ElementsAre("flight 0 c"));
    Register(nullptr, "d");
    kiv::sim::SetDevice(before);
    EXPECT_THAT(next.Take(), IsEmpty());
    EXPECT_THAT(listener.Take(), IsEmpty());
}

TEST_F(ConnectionTest, ListenerIsCalledByTheEntriesThemselvesWhenThereIsOneAndTheValueCanBeRead)
{
    char text[] = "a";
    kiv::sim::SetDevice(after);
    for (Listener* const to : {static_cast<Listener*>(nullptr), &listener})
    {
        DAConnectionManager::__pListener = to;
        DAConnectionManager::wifi_device_state_changed(WIFI_DEVICE_STATE_ACTIVATED, text);
        DAConnectionManager::wifi_connection_state_changed(WIFI_CONNECTION_STATE_FAILURE, &text, text);
        for (const int key : {1, 9, 0, 10, 2, -1})
            DAConnectionManager::OnConnectionStateChanged(static_cast<runtime_info_key_e>(key), text);
        EXPECT_THAT(TakeCalls(), testing::SizeIs(to == nullptr ? 0 : 3)) << "one read for each value to tell";
    }
    EXPECT_THAT(listener.Take(), ElementsAre("device 1 a", "connection -1 a", "wifi 1 a", "packet 0 a", "flight 1 a"));
    EXPECT_EQ(&text, listener.accessPoint);
}

} // namespace
