#include <DeviceControl.h>
#include <ITapiSim.h>
#include <net_connection.h>
#include <package_info.h>
#include <runtime_info.h>
#include <sys/wait.h>
#include <telephony.h>
#include <unistd.h>
#include <wifi.h>

using namespace kiv::platform;
using testing::StartsWith;

namespace
{

TEST(Handles, AreReportedWhileTheyAreOpen)
{
    telephony_handle_list_s list{};
    package_info_h package = nullptr;
    connection_h connection = nullptr;
    ASSERT_EQ(0, telephony_init(&list));
    TapiHandle* const modem = tel_init("modem0");
    ASSERT_EQ(0, package_info_create("org.example.mail", &package));
    ASSERT_EQ(0, connection_create(&connection));
    EXPECT_THAT(
        OpenHandles(), testing::UnorderedElementsAre(StartsWith("handle list, opened by telephony_init"),
                           StartsWith("TAPI handle of slot 0"), StartsWith("package handle"), StartsWith("connection handle")));
    for (const int result :
        {telephony_deinit(&list), tel_deinit(modem), package_info_destroy(package), connection_destroy(connection)})
        EXPECT_EQ(0, result);
    EXPECT_THAT(OpenHandles(), testing::IsEmpty());
}

TEST(Handles, FollowTheirModemToAnotherSlot)
{
    ResetDevice();
    TapiHandle* const modem = tel_init("modem1");
    const auto mcc = [modem]
    {
        TelSimImsiInfo_t record{};
        return tel_get_sim_imsi(modem, &record) == 0 ? std::string(record.szMcc) : "none";
    };
    EXPECT_EQ("262", mcc());
    for (const char* expected : {"262", "none"}) // unplugged, one after the other
    {
        ChangeDevice([](Device& device) { device.slots.erase(device.slots.begin()); });
        EXPECT_EQ(expected, mcc());
    }
    EXPECT_EQ(0, tel_deinit(modem));
    ResetDevice();
}

TEST(Fork, LeavesNoLockHeldInTheChild)
{
    constexpr auto kKey = RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED;
    EXPECT_EQ(0, runtime_info_set_changed_cb(
                     kKey, [](runtime_info_key_e, void*) { std::this_thread::yield(); }, nullptr));
    std::atomic<bool> isOver{false};
    std::thread changer(
        [&]
        {
            while (!isOver)
                ChangeDevice([](Device& device) { device.flightMode = !device.flightMode; });
        });
    for (int i = 0; i < 100; ++i)
    {
        const pid_t child = fork();
        if (child == 0)
        {
            alarm(20); // which ends one that hangs
            bool isOn = false;
            _exit(runtime_info_get_value_bool(kKey, &isOn) == 0 && runtime_info_unset_changed_cb(kKey) == 0 ? 0 : 1);
        }
        int status = -1;
        waitpid(child, &status, 0);
        EXPECT_EQ(0, status);
    }
    isOver = true;
    changer.join();
    ResetDevice();
}

TEST(Wifi, RefusesCallbacksUntilItIsInitialized)
{
    const auto onDevice = [](wifi_device_state_e, void*) {};
    const auto onConnection = [](wifi_connection_state_e, wifi_ap_h, void*) {};
    ResetDevice();
    for (const bool isInitialized : {false, true})
    {
        EXPECT_EQ(isInitialized, wifi_set_device_state_changed_cb(onDevice, nullptr) == 0);
        EXPECT_EQ(isInitialized, wifi_set_connection_state_changed_cb(onConnection, nullptr) == 0);
        EXPECT_EQ(0, wifi_initialize());
    }
    ResetDevice();
}

TEST(Handles, ThatAreMisusedAreReported)
{
    ResetDevice(); // which counts the calls
    telephony_handle_list_s list{};
    ASSERT_EQ(0, telephony_init(&list));
    const telephony_h second = list.handle[1];
    TapiHandle* const modem = tel_init("modem1");
    telephony_sim_state_e state{};
    EXPECT_NE(0, tel_deinit(reinterpret_cast<TapiHandle*>(second)));
    EXPECT_EQ(0, telephony_deinit(&list));
    EXPECT_EQ(0, tel_deinit(modem));
    for (const int refusal : {telephony_sim_get_state(second, &state), tel_deinit(modem), tel_deinit(nullptr)})
        EXPECT_NE(0, refusal);
    EXPECT_THAT(TakeMisuses(),
        testing::ElementsAre(
            StartsWith("tel_deinit: needs a TAPI handle, got a telephony handle of slot 1, opened by telephony_init"),
            StartsWith("telephony_sim_get_state: used after closing: telephony handle of slot 1, opened by telephony_init call 1"),
            StartsWith("tel_deinit: closed twice: TAPI handle of slot 1, opened by tel_init call 1 from platform_test+0x"),
            "tel_deinit: needs a TAPI handle, got null"));
}

} // namespace
