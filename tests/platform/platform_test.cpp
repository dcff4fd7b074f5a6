#include "support/Deliveries.h"
#include "support/Texts.h"

#include <DeviceControl.h>
#include <ITapiSim.h>
#include <LogControl.h>
#include <SourceControl.h>
#include <net_connection.h>
#include <package_info.h>
#include <runtime_info.h>
#include <telephony.h>
#include <wifi.h>

using namespace kiv::platform;
using kiv::test::IterateUntil;
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

constexpr auto kKey = RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED;

/// A device file, at first as the profile "dual" has it, that the device follows; nothing else may stay beside it.
struct Changes : testing::Test
{
    Changes()
    {
        EXPECT_EQ("", SetInDeviceFile(path, {}));
        EXPECT_EQ("", UseProfile(path));
    }
    ~Changes() override
    {
        ResetDevice();
        EXPECT_EQ(2U, std::filesystem::remove_all(directory));
    }

    const std::string directory = mkdtemp((std::filesystem::temp_directory_path() / "kiv-device-XXXXXX").string().data());
    const std::string path = directory + "/my device";
};

TEST_F(Changes, OfAFileAreFollowedHoweverItIsWritten)
{
    static std::atomic<bool> isOn, isOver;
    const auto follow = [](runtime_info_key_e key, void*)
    {
        isOn = GetDevice().flightMode;
        isOver = !isOn && runtime_info_unset_changed_cb(key) == 0; // on the thread that follows the file
    };
    ChangeDevice([](Device& device) { device.slots[0].cardReads = 1; });
    EXPECT_EQ(0, runtime_info_set_changed_cb(kKey, follow, nullptr));
    std::atomic<int> complaints{0};
    SetLogSink([&](const LogLine& line)
        { complaints += line.text.find("[runtime] flight-mode: \"maybe\" is") != line.text.npos ? 1 : 9; });
    const std::string good = kiv::test::Contents(path);
    const auto write = [&](const std::string& text) { EXPECT_TRUE(g_file_set_contents(path.c_str(), text.c_str(), -1, nullptr)); };
    for (const char* comment : {"# one\n", "# two\n", "# three\n"})
        write(comment + good + "[runtime]\nflight-mode=maybe\n");
    IterateUntil([&] { return complaints > 0; });
    g_usleep(200000); // GLib tells of changes that follow each other ten times a second
    write(good + "[runtime]\nflight-mode=true\n");
    IterateUntil([] { return isOn.load(); }); // a file renamed over the other
    EXPECT_EQ(1U, GetDevice().slots[0].cardReads) << "the card's script does not begin anew";
    EXPECT_EQ(1, complaints);
    SetLogSink(nullptr);
    std::ofstream(path) << good;
    IterateUntil([] { return isOver.load(); }); // one written in place
}

TEST_F(Changes, AreNotDeliveredAfterAnUnregistrationReturned)
{
    static std::atomic<int> step;
    const auto slowly = [](runtime_info_key_e, void*)
    {
        step = 1;
        while (step == 1)
            std::this_thread::yield();
        g_usleep(20'000); // in which the unregistration could return
        step = 3;
    };
    step = 0;
    EXPECT_EQ(0, runtime_info_set_changed_cb(kKey, slowly, nullptr));
    std::thread changer([] { ChangeDevice([](Device& device) { device.flightMode = true; }); });
    IterateUntil([] { return step == 1; });
    step = 2;
    EXPECT_EQ(0, runtime_info_unset_changed_cb(kKey));
    EXPECT_EQ(3, step);
    changer.join();
}

TEST_F(Changes, OfTwoWritersAtOnceAreAllKept)
{
    const auto write = [this](const std::string& prefix)
    {
        for (int i = 0; i < 10; ++i)
            EXPECT_EQ("", SetInDeviceFile(path, {"packages." + prefix + std::to_string(i) + "=1.0"}));
    };
    const std::size_t before = GetDevice().packages.size();
    std::thread other(write, "x");
    write("y");
    other.join();
    EXPECT_EQ("", UseProfile(path));
    EXPECT_EQ(before + 20, GetDevice().packages.size());
}

} // namespace
