#include "support/Test.h"

#include <SimulatedDevice.h>
#include <SimulatedLog.h>
#include <runtime_info.h>

#include <condition_variable>

using namespace kiv::sim;
using testing::ElementsAre;
using testing::HasSubstr;

namespace
{

// What callbacks told.
class Told
{
public:
    void Add(const std::string& what)
    {
        const std::lock_guard lock(mutex_);
        all_.push_back(what);
        changed_.notify_all();
    }

    std::vector<std::string> Take(std::size_t atLeast = 0)
    {
        std::unique_lock lock(mutex_);
        changed_.wait_for(lock, std::chrono::seconds(10), [&] { return all_.size() >= atLeast; });
        return std::exchange(all_, {});
    }

private:
    std::mutex mutex_;
    std::condition_variable changed_;
    std::vector<std::string> all_;
};

Told told;
constexpr auto kKey = RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED;

void OnChange(runtime_info_key_e key, void* /*userData*/)
{
    bool value = false;
    EXPECT_EQ(0, runtime_info_get_value_bool(key, &value));
    told.Add(value ? "on" : "off");
}

// A device file, at first as the profile "dual" has it, that the device follows; nothing else may stay beside it.
class Changes : public testing::Test
{
protected:
    Changes()
    {
        EXPECT_EQ("", SetInDeviceFile(path, {}));
        EXPECT_EQ("", UseProfile(path));
        EXPECT_EQ(0, runtime_info_set_changed_cb(kKey, OnChange, nullptr));
    }
    ~Changes() override
    {
        ResetDevice();
        EXPECT_EQ(2U, std::filesystem::remove_all(directory.get()));
    }

    void Set(const std::string& assignment) const { EXPECT_EQ("", SetInDeviceFile(path, {assignment})); }
    void Write(const std::string& text) const { EXPECT_TRUE(g_file_set_contents(path.c_str(), text.c_str(), -1, nullptr)); }
    std::string Read() const { return std::string(std::istreambuf_iterator<char>(std::ifstream(path).rdbuf()), {}); }

    const std::unique_ptr<char, decltype(&g_free)> directory{g_dir_make_tmp("kiv-device-XXXXXX", nullptr), g_free};
    const std::string path = std::string(directory.get()) + "/my device";
};

TEST_F(Changes, AreNotBeingToldAnyMoreWhenAnUnregistrationReturned)
{
    const auto once = [](runtime_info_key_e key, void* /*userData*/)
    {
        EXPECT_EQ(0, runtime_info_unset_changed_cb(key));
        told.Add("once");
    };
    EXPECT_EQ(0, runtime_info_set_changed_cb(kKey, once, nullptr));
    Set("runtime.flight-mode=true");
    EXPECT_THAT(told.Take(1), ElementsAre("once")) << "by the callback itself, on the thread that follows the file";

    std::promise<void> returned;
    auto unregistration = returned.get_future();
    const auto callback = [](runtime_info_key_e /*key*/, void* userData)
    {
        told.Add("inside");
        EXPECT_EQ(std::future_status::timeout, static_cast<std::future<void>*>(userData)->wait_for(std::chrono::milliseconds(100)));
    };
    EXPECT_EQ(0, runtime_info_set_changed_cb(kKey, callback, &unregistration));
    std::thread changer([] { ChangeDevice([](Device& device) { device.flightMode = false; }); });
    EXPECT_THAT(told.Take(1), ElementsAre("inside"));
    EXPECT_EQ(0, runtime_info_unset_changed_cb(kKey));
    returned.set_value();
    changer.join();
}

TEST_F(Changes, OfAFileAreToldHoweverItIsWrittenAndThoseThatBreakItAreComplainedAboutOnce)
{
    Told complaints;
    SetLogSink([&complaints](const LogLine& line) { complaints.Add(line.tag + ": " + line.text); });
    ChangeDevice([](Device& device) { device.slots[0].cardReads = 1; });
    const std::string good = Read();
    for (const char* comment : {"# one\n", "# two\n", "# three\n"})
        Write(comment + good + "[runtime]\nflight-mode=maybe\n");
    EXPECT_THAT(complaints.Take(1),
        ElementsAre("KIV_PLATFORM: " + path + ": [runtime] flight-mode: \"maybe\" is wrong; true or false would be right\n"));
    EXPECT_FALSE(GetDevice().flightMode) << "the last good state";

    Write(good);
    Set("runtime.flight-mode=true");
    EXPECT_THAT(told.Take(1), ElementsAre("on")) << "renamed over";
    EXPECT_EQ(1U, GetDevice().slots[0].cardReads) << "the card's script does not begin anew";
    EXPECT_THAT(complaints.Take(), testing::IsEmpty());
    SetLogSink(nullptr);

    std::ofstream(path) << good;
    EXPECT_THAT(told.Take(1), ElementsAre("off")) << "written in place";
}

TEST_F(Changes, OfTwoWritersAtOnceAreAllKept)
{
    const auto write = [this](const std::string& prefix)
    {
        for (int i = 0; i < 10; ++i)
            Set("packages.org.example." + prefix + std::to_string(i) + "=1.0");
    };
    const std::size_t before = GetDevice().packages.size();
    std::thread other(write, "x");
    write("y");
    other.join();
    EXPECT_EQ("", UseProfile(path));
    EXPECT_EQ(before + 20, GetDevice().packages.size());
}

TEST_F(Changes, ThatAreWrongAreRefusedAsAWholeWithGroupAndKeyAndWhatWouldBeRight)
{
    const char* const rows[][2] = {
        {"runtime.flightmode=true", "[runtime] flightmode: no such key; keys are flight-mode, packet-data, data-roaming, wifi"},
        {"rumtime.flight-mode=true", "[rumtime]: no such group; groups are profile, telephony, sim0, "},
        {"sim0.mcc=45", "[sim0] mcc: \"45\" is wrong; 3 digits would be right"},
        {"sim0.mnc=4x", "[sim0] mnc: \"4x\" is wrong; 2 to 3 digits would be right"},
        {"sim0.card-status=2;;3", "[sim0] card-status: \"2;;3\" is wrong; a number from 0 to 255, or several with ; between them"},
        {"sim1.cp-name=modem0", "[sim1] cp-name: \"modem0\" is that of sim0"},
        {"sim4.cp-name=modem4", "[sim3] cp-name: missing"},
        {"sim8.cp-name=modem8", "[sim8]: no such group; slots are sim0 to sim7"},
        {"sim2.mcc=450", "[sim2] mnc: missing; mcc, mnc and msin stand together or not at all"},
        {"sim1.mnc=123", "[sim1] msin: too long"},
        {"network.cellular=5 bars", "[network] cellular: \"5 bars\" is wrong; a number from 0 to 5 would be right"},
        {"network.wifi-connection=-2", "[network] wifi-connection: \"-2\" is wrong; a number from -1 to 3 would be right"},
        {"storage.block-size=4294967296", "[storage] block-size: \"4294967296\" is wrong"},
        {"flight-mode=true", "\"flight-mode=true\" sets nothing; GROUP.KEY=VALUE is needed"},
        {"run\ttime.wifi=1", "\"run\ttime.wifi=1\" has a group or a key with a bracket, a blank or a control character in it"},
        {"device.serial=\xff", "[device] serial: the value is not UTF-8"},
    };
    const std::string before = Read();
    for (const auto& [assignment, complaint] : rows)
    {
        EXPECT_THAT(SetInDeviceFile(path, {"sim2.cp-name=modem2", assignment}), HasSubstr(path + ": " + complaint));
        EXPECT_EQ(before, Read()) << assignment;
    }

    Write("");
    EXPECT_THAT(UseProfile(path), HasSubstr(path + ": [profile] description: missing"));
    EXPECT_THAT(UseProfile("tripel"), HasSubstr("\"tripel\" is no profile and no file; profiles are dual, dual-first-locked, "));
    EXPECT_EQ("modem1", GetDevice().slots.at(1).cpName) << "after so much trouble";

    Write("[profile]\ndescription=x\n[device]\nserial=\\q\n");
    g_setenv("KIV_PROFILE", path.c_str(), TRUE);
    ResetDevice();
    EXPECT_NE(0, runtime_info_set_changed_cb(kKey, OnChange, nullptr)) << "as every call";
    EXPECT_THAT(DeviceTrouble(), HasSubstr(path + ": [device] serial: not UTF-8, or a backslash that escapes nothing"));
    g_unsetenv("KIV_PROFILE");
}

} // namespace
