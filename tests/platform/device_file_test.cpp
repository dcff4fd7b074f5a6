#include "support/Deliveries.h"
#include "support/Texts.h"

#include <DeviceControl.h>
#include <SourceControl.h>
#include <TapiUtility.h>
#include <runtime_info.h>
#include <telephony.h>

#include <fcntl.h>
#include <unistd.h>

using namespace kiv::platform;
using kiv::test::Contents;
using kiv::test::IterateUntil;

namespace
{

constexpr auto kKey = RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED;

/// Captures the text that the process prints on standard error.
class StandardError
{
public:
    explicit StandardError(std::string path) : path_(std::move(path))
    {
        const int file = open(path_.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600);
        dup2(file, STDERR_FILENO);
        close(file);
    }
    StandardError(const StandardError&) = delete;
    StandardError& operator=(const StandardError&) = delete;
    ~StandardError()
    {
        dup2(saved_, STDERR_FILENO);
        close(saved_);
        std::filesystem::remove(path_);
    }

    std::string Text() const { return Contents(path_); }

private:
    const int saved_ = dup(STDERR_FILENO);
    const std::string path_;
};

/// A device file that the device follows, at first with the values of the profile "dual". No other file may remain beside it.
struct Changes : testing::Test
{
    Changes() { EXPECT_EQ("", UseProfile(path)); }
    ~Changes() override
    {
        ResetDevice();
        EXPECT_EQ(2U, std::filesystem::remove_all(directory));
    }

    void Write(const std::string& text) const { EXPECT_TRUE(g_file_set_contents(path.c_str(), text.c_str(), -1, nullptr)); }

    const std::string directory = mkdtemp((std::filesystem::temp_directory_path() / "kiv-device-XXXXXX").string().data());
    const std::string path = directory + "/my device";
    const std::string trouble = SetInDeviceFile(path, {});
    const std::string good = Contents(path);
};

TEST_F(Changes, OfAFileAreFollowedWhenItIsWrittenOrReplaced)
{
    static std::atomic<bool> isOn, isOver;
    const auto follow = [](runtime_info_key_e key, void*)
    {
        isOn = GetDevice().flightMode;
        isOver = !isOn && runtime_info_unset_changed_cb(key) == 0; // on the thread that follows the file
    };
    ChangeDevice([](Device& device) { device.slots[0].cardReads = 1; });
    EXPECT_EQ(0, runtime_info_set_changed_cb(kKey, follow, nullptr));
    Write(good + "[runtime]\nflight-mode=true\n");
    IterateUntil([] { return isOn.load(); }); // a file renamed over the other
    EXPECT_EQ(1U, GetDevice().slots[0].cardReads) << "the card's script does not start again";
    std::ofstream(path) << good;
    IterateUntil([] { return isOver.load(); }); // one written in place
}

constexpr auto kIgnore = [](runtime_info_key_e, void*) {};

TEST_F(Changes, OfATargetOfSymbolicLinksAreFollowed)
{
    // There are two releases, and a link to a directory selects the current one.
    for (const char* release : {"one", "two"})
        std::filesystem::create_directory(directory + "/" + release);
    std::filesystem::create_directory_symlink("one", directory + "/current");
    std::filesystem::copy_file(path, directory + "/one/device");
    std::filesystem::remove(path);
    std::filesystem::create_symlink("current/device", path);
    EXPECT_EQ("", UseProfile(path));
    EXPECT_EQ(0, runtime_info_set_changed_cb(kKey, kIgnore, nullptr));
    const auto await = [](bool isOn) { IterateUntil([isOn] { return GetDevice().flightMode == isOn; }); };

    EXPECT_EQ("", SetInDeviceFile(directory + "/one/device", {"runtime.flight-mode=true"})); // renamed over the target
    await(true);
    EXPECT_EQ("", SetInDeviceFile(directory + "/two/device", {}));
    std::filesystem::create_directory_symlink("two", directory + "/next");
    std::filesystem::rename(directory + "/next", directory + "/current"); // and over a link on the way
    await(false);
    EXPECT_EQ("", SetInDeviceFile(directory + "/two/device", {"runtime.flight-mode=true"}));
    await(true);
    for (const char* name : {"/one", "/two", "/current"})
        std::filesystem::remove_all(directory + name);
}

TEST_F(Changes, ThatCannotBeUsedAreReportedOnce)
{
    EXPECT_EQ(0, runtime_info_set_changed_cb(kKey, kIgnore, nullptr));
    const StandardError printed(directory + "/stderr");
    std::string report;
    const auto awaitReport = [&](const std::string& what)
    {
        report += "platform_test: " + path + ": " + what + "\n";
        IterateUntil([&] { return printed.Text().size() >= report.size(); });
        EXPECT_EQ(report, printed.Text());
    };
    for (const char* comment : {"# one\n", "# two\n", "# three\n"})
        Write(comment + good + "[runtime]\nflight-mode=maybe\n");
    awaitReport("[runtime] flight-mode: \"maybe\" is invalid; expected true or false");
    Write(good + "[runtime]\nflight-mode=maybe\n");
    g_usleep(500'000); // in which the same trouble could be reported again
    std::filesystem::remove(path);
    awaitReport("No such file or directory");
    Write(good + "[runtime]\nflight-mode=true\n");
    IterateUntil([] { return GetDevice().flightMode; });
    std::filesystem::remove(path);
    awaitReport("No such file or directory");
    Write(good);
}

TEST_F(Changes, OfFaultsTakeEffectAndContinueToCount)
{
    EXPECT_EQ(0, runtime_info_set_changed_cb(kKey, kIgnore, nullptr));
    const auto read = []
    {
        int value = 0;
        return runtime_info_get_value_int(RUNTIME_INFO_KEY_WIFI_STATUS, &value);
    };
    const auto await = [](const char* key) { IterateUntil([key] { return ListValues().back().key == key; }); };
    const std::string name = "faults.runtime_info_get_value_int";
    EXPECT_EQ("", SetInDeviceFile(path, {name + "@3=-5", name + "@1=-6", "faults.tel_init=-1"}));
    await("faults.tel_init");
    EXPECT_EQ(-6, read());
    EXPECT_EQ(0, read());
    EXPECT_EQ(nullptr, tel_init("modem0"));
    FailCall(Call::runtime_info_get_value_int, -7, Only(1));
    EXPECT_EQ(-7, read()) << "what a test asks for comes first";
    EXPECT_EQ("", UnsetInDeviceFile(path, {"faults.tel_init"}));
    await((name + "@1").c_str());
    EXPECT_EQ(-5, read()) << "the third that reached the device";
    EXPECT_EQ("", SetInDeviceFile(path, {name + "=-8"}));
    await(name.c_str());
    EXPECT_EQ(-8, read());
    EXPECT_EQ("", UnsetInDeviceFile(path, {name, name + "@1", name + "@3"}));
    IterateUntil([&] { return read() == 0; });
}

TEST_F(Changes, OfValuesAreTheSameByWordAndByNumber)
{
    const auto value = [](const std::string& key)
    {
        const std::vector<FieldValue> values = ListValues();
        const auto found = std::find_if(values.begin(), values.end(), [&key](const FieldValue& one) { return one.key == key; });
        return found == values.end() ? "no such key" : found->value.value_or("none");
    };
    const std::array<std::string, 3> cases[] = {
        // key, a number, how it is shown
        {"runtime.wifi-status", "2", "connected"},
        {"network.wifi-connection", "-1", "failure"},
        {"telephony.default-data", "1", "1"},
        {"sim1.card-status", "2;200;3", "initialising;200;ready"},
        {"sim0.service-type", "3", "searching"},
        {"sim0.sim-state", "1", "locked"},
        {"settings.font-size", "4", "giant"},
    };
    for (const auto& [key, number, word] : cases)
    {
        for (const std::string& typed : {number, word})
        {
            EXPECT_EQ("", SetInDeviceFile(path, {key + "=" + typed})) << key;
            EXPECT_EQ("", UseProfile(path));
            EXPECT_EQ(word, value(key)) << typed;
        }
    }
    EXPECT_EQ(2, GetDevice().wifiStatus);
    EXPECT_EQ("", UnsetInDeviceFile(path, {"sim0.sim-state", "runtime.wifi-status"}));
    EXPECT_EQ("", UseProfile(path));
    EXPECT_EQ("none", value("sim0.sim-state"));
    EXPECT_EQ("off", value("runtime.wifi-status"));
    EXPECT_EQ(path + ": [runtime] flight-mod: not in the file (did you mean \"flight-mode\"?)",
        UnsetInDeviceFile(path, {"runtime.flight-mod"}));
}

TEST_F(Changes, OfTextsTakeOnlyWholeEscapes)
{
    const auto use = [this](const std::string& name)
    {
        Write("[profile]\ndescription=x\n[settings]\ndevice-name=" + name + "\n");
        return UseProfile(path);
    };
    EXPECT_EQ("", use(R"(a\\b\tc)"));
    EXPECT_EQ("a\\b\tc", GetDevice().deviceName);
    for (const char* name : {R"(\b)", "end\\", R"(\b\)", "\xff"}) // GLib prints a warning about the third
        EXPECT_EQ(path + R"(: [settings] device-name: not UTF-8, or a backslash that escapes nothing; write \\ for a backslash)",
            use(name));
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

TEST_F(Changes, OfTheEnvironmentAreReportedByTheFirstCall)
{
    g_setenv("KIV_PROFILE", "singel", TRUE);
    ResetDevice();
    const StandardError printed(directory + "/stderr");
    telephony_handle_list_s list{};
    EXPECT_EQ("", UseProfile("single")); // which takes its place
    EXPECT_EQ(0, telephony_init(&list));
    ResetDevice();
    EXPECT_EQ("", printed.Text());
    EXPECT_NE(0, telephony_init(&list));
    EXPECT_EQ(nullptr, tel_init("modem0"));
    g_unsetenv("KIV_PROFILE");
    EXPECT_EQ("platform_test: " + DeviceTrouble() + "\n", printed.Text());
    EXPECT_THAT(printed.Text(), testing::EndsWith("host (did you mean \"single\"?)\n"));
}

} // namespace
