// The connection states, and the listener that is notified of changes.
#include "device/DeviceTest.h"

#include <DAConnectionManager.h>

#include <bitset>

namespace
{

using namespace kiv::test;
using C = DAConnectionManager;

struct Listener : IDAConnectionStateListener
{
    MOCK_METHOD(void, OnWifiDeviceStateChanged, (wifi_device_state_e state, void* userData), (override));
    MOCK_METHOD(void, OnWifiConnectionStateChanged, (wifi_connection_state_e state, void* ap, void* userData), (override));
    MOCK_METHOD(void, OnFlightModeChanged, (bool enabled, void* userData), (override));
    MOCK_METHOD(void, OnPacketDataChanged, (bool enabled, void* userData), (override));
    MOCK_METHOD(void, OnWifiConnectedChanged, (bool connected, void* userData), (override));
};

struct ConnectionTest : DeviceTest
{
    ~ConnectionTest() override { C::__pListener = nullptr; }

    testing::StrictMock<Listener> listener;
    char first = 0, second = 0; ///< user data
};

TEST_F(ConnectionTest, IsUpWhenAnySelectedConnectionIs)
{
    for (unsigned bits = 0; bits < 32; ++bits)
    {
        const std::bitset<5> bit(bits);
        const bool checkWifi = bit[0], checkBluetooth = bit[1], cellular = bit[2], wifi = bit[3], bluetooth = bit[4];
        Set(&Device::cellularState, cellular ? 5 : 2); // the same number means something else in the other states
        Set(&Device::wifiState, wifi ? 2 : 5);
        Set(&Device::bluetoothState, bluetooth ? 2 : 5);
        const bool isUp = cellular || (checkWifi && wifi) || (checkBluetooth && bluetooth);
        EXPECT_EQ(isUp, facade.IsNetworkConnected(checkWifi, checkBluetooth)) << bits;
        EXPECT_EQ(3U * (1 + bit[0] + bit[1]), TakeCalls()) << bits;
    }
}

TEST_F(ConnectionTest, ListenerReceivesFiveKindsOfChangeWhateverFails)
{
    const Device before = kiv::platform::GetDevice();
    Device after = before;
    after.wifiDeviceState = WIFI_DEVICE_STATE_DEACTIVATED;
    after.wifiConnectionState = WIFI_CONNECTION_STATE_CONNECTED;
    after.wifiStatus = 2;
    after.flightMode = after.dataRoaming = true;
    after.packetData = false;
    for (const Call call : {Call::wifi_initialize, Call::wifi_set_device_state_changed_cb, Call::runtime_info_set_changed_cb,
             Call::wifi_set_connection_state_changed_cb, Call::wifi_unset_device_state_changed_cb,
             Call::wifi_unset_connection_state_changed_cb, Call::runtime_info_unset_changed_cb})
        kiv::platform::FailCall(call, -1, kEveryCall, kNoSlot, Leavings::ItsResults);

    facade.SetConnectionEventListener(&listener, &first);
    EXPECT_CALL(listener, OnWifiDeviceStateChanged(WIFI_DEVICE_STATE_DEACTIVATED, &first));
    EXPECT_CALL(listener, OnWifiConnectionStateChanged(WIFI_CONNECTION_STATE_CONNECTED, nullptr, &first));
    EXPECT_CALL(listener, OnFlightModeChanged(true, &first));
    EXPECT_CALL(listener, OnPacketDataChanged(false, &first));
    EXPECT_CALL(listener, OnWifiConnectedChanged(true, &first));
    kiv::platform::SetDevice(after);
    EXPECT_EQ(6U + 3U, TakeCalls()) << "the registrations, and one read per reported value";

    for (int i = 0; i < 2; ++i) // also when there is nothing to unregister
    {
        facade.SetConnectionEventListener(nullptr, nullptr);
        EXPECT_EQ(6U, TakeCalls());
    }
    C::__pListener = &listener;
    kiv::platform::SetDevice(before); // would be notified if it were still registered
}

TEST_F(ConnectionTest, ListenerReceivesAChangeDuringItsRegistration)
{
    kiv::platform::SetCallHook(
        [](Call call, int)
        {
            if (call == Call::wifi_set_connection_state_changed_cb) // the call after the device state's
                Set(&Device::wifiDeviceState, WIFI_DEVICE_STATE_ACTIVATED);
            return "";
        });
    Set(&Device::wifiDeviceState, WIFI_DEVICE_STATE_DEACTIVATED);
    EXPECT_CALL(listener, OnWifiDeviceStateChanged(WIFI_DEVICE_STATE_ACTIVATED, &first));
    facade.SetConnectionEventListener(&listener, &first);
    kiv::platform::SetCallHook(nullptr);
}

TEST_F(ConnectionTest, ListenerAndUserDataAreThoseOfTheLastRegistration)
{
    facade.SetConnectionEventListener(&listener, &first);
    facade.SetConnectionEventListener(&listener, &second);
    for (const int status : {2, 1, 3, 0})
    {
        EXPECT_CALL(listener, OnWifiConnectedChanged(status == 2, &second)).RetiresOnSaturation();
        Set(&Device::wifiStatus, status);
    }
    testing::StrictMock<Listener> next;
    facade.SetConnectionEventListener(&next, &first);
    EXPECT_CALL(next, OnFlightModeChanged(true, &first));
    Set(&Device::flightMode, true);
}

TEST_F(ConnectionTest, EntriesNeedAListenerAKnownKeyAndAValue)
{
    const auto change = [this](int key) { C::OnConnectionStateChanged(static_cast<runtime_info_key_e>(key), &first); };
    C::wifi_device_state_changed(WIFI_DEVICE_STATE_ACTIVATED, &first);
    C::wifi_connection_state_changed(WIFI_CONNECTION_STATE_FAILURE, &second, &first);
    change(RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED);

    C::__pListener = &listener;
    for (const int key : {10, 2, -1})
        change(key);
    for (const Call read : {Call::runtime_info_get_value_bool, Call::runtime_info_get_value_int})
        kiv::platform::FailCall(read, -1);
    for (const int key : {1, 9, 0})
        change(key);
    EXPECT_CALL(listener, OnWifiConnectionStateChanged(WIFI_CONNECTION_STATE_FAILURE, &second, &first));
    C::wifi_connection_state_changed(WIFI_CONNECTION_STATE_FAILURE, &second, &first);
}

} // namespace
