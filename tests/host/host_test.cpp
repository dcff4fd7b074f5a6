#include "support/Test.h"

#include <HostFiles.h>
#include <ITapiSim.h>
#include <Services.h>
#include <net_connection.h>
#include <telephony.h>
#include <wifi.h>

using namespace kiv::platform;

namespace
{

/// Adds objects in the text form of GVariant's dictionary entries "{oa{sa{sv}}}".
void Read(const std::string& text, Reports& reports)
{
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) all =
        g_variant_parse(G_VARIANT_TYPE("a{oa{sa{sv}}}"), ("{" + text + "}").c_str(), nullptr, nullptr, &error);
    ASSERT_NE(nullptr, all) << text << ": " << error->message;
    GVariantIter objects;
    const char* path = nullptr;
    GVariant* interfaces = nullptr;
    for (g_variant_iter_init(&objects, all); g_variant_iter_loop(&objects, "{&o@a{sa{sv}}}", &path, &interfaces) != FALSE;)
        ReadObject(path, interfaces, reports);
}

/// What services report that are there if they have objects.
Reports Present(const std::string& modems, const std::string& network = "", const std::string& bluetooth = "")
{
    Reports reports;
    reports.modemManager = modems.empty() ? Presence::Absent : Presence::Present;
    reports.networkManager = network.empty() ? Presence::Absent : Presence::Present;
    for (const std::string& objects : {modems, network, bluetooth})
        Read(objects, reports);
    return reports;
}

constexpr char kSims[] =
    "'/sim': {'org.freedesktop.ModemManager1.Sim': {'Imsi': <'310150123456789'>, 'OperatorIdentifier': <'310150'>}}";

/// A modem with properties of its own, and further interfaces.
std::string Modem(const std::string& path, const std::string& properties, const std::string& interfaces = "")
{
    return "'" + path + "': {'org.freedesktop.ModemManager1.Modem': {'Sim': <objectpath '/sim'>, " + properties + "}" + interfaces +
           "}";
}

std::string Registered(int state)
{
    return ", 'org.freedesktop.ModemManager1.Modem.Modem3gpp': {'RegistrationState': <uint32 " + std::to_string(state) + ">}";
}

std::string NetworkDevice(const std::string& path, int type, int state, const std::string& more = "")
{
    return "'" + path + "': {'org.freedesktop.NetworkManager.Device': {'DeviceType': <uint32 " + std::to_string(type) +
           ">, 'State': <uint32 " + std::to_string(state) + ">" + more + "}}";
}

std::string Switches(bool wifi, bool wwan, const std::string& more = "")
{
    const auto word = [](bool on) { return on ? "<true>" : "<false>"; };
    return std::string(
               "'/org/freedesktop/NetworkManager': {'org.freedesktop.NetworkManager': {'WirelessHardwareEnabled': <true>, ") +
           "'WwanHardwareEnabled': <true>, 'WirelessEnabled': " + word(wifi) + ", 'WwanEnabled': " + word(wwan) + more + "}}";
}

Device Described(const Reports& reports)
{
    Device device;
    Describe(reports, device);
    return device;
}

SimSlot OnlySlot(const std::string& properties, const std::string& interfaces = "")
{
    const Device device = Described(Present(kSims + (", " + Modem("/modem", properties, interfaces))));
    EXPECT_EQ(1U, device.slots.size());
    return device.slots.empty() ? SimSlot() : device.slots[0];
}

TEST(Modem, StateReasonAndLockGiveTheCardStatus)
{
    const std::pair<const char*, std::vector<int>> kRows[] = {
        // State -1 by its reason
        {"'State': <-1>, 'StateFailedReason': <uint32 %d>",
            {TAPI_SIM_STATUS_CARD_ERROR, TAPI_SIM_STATUS_CARD_ERROR, TAPI_SIM_STATUS_CARD_NOT_PRESENT, TAPI_SIM_STATUS_CARD_ERROR,
                TAPI_SIM_STATUS_CARD_ERROR, TAPI_SIM_STATUS_CARD_NOT_PRESENT, TAPI_SIM_STATUS_CARD_ERROR}},
        // every state; 2 is locked, by a lock not known yet here; the last one is no state
        {"'State': <%d>", {255, 2, 255, 3, 3, 3, 3, 3, 3, 3, 3, 3, 255}},
        // every lock; the last one is no lock
        {"'State': <2>, 'UnlockRequired': <uint32 %d>", {255, 2, 4, 3, 5, 3, 9, 9, 7, 7, 12, 10, 10, 12, 12, 8, 8, 12}},
        {"'State': <3>, 'PowerState': <uint32 %d>", {3, TAPI_SIM_STATUS_CARD_POWEROFF, 3, 3}},
    };
    for (const auto& [format, cards] : kRows)
        for (std::size_t value = 0; value < cards.size(); ++value)
        {
            std::string properties = format;
            properties.replace(properties.find("%d"), 2, std::to_string(value));
            EXPECT_EQ(std::vector<int>{cards[value]}, OnlySlot(properties).cardStatus) << properties;
        }
}

TEST(Modem, WithoutACardOrWithOneThatIsNotReadYetIsNotReady)
{
    const auto card = [](const std::string& sim)
    {
        const std::string modem =
            "'/modem': {'org.freedesktop.ModemManager1.Modem': {'State': <8>, 'Sim': <objectpath '" + sim + "'>}}";
        return Described(Present(modem)).slots.at(0).cardStatus.at(0);
    };
    EXPECT_EQ(TAPI_SIM_STATUS_CARD_NOT_PRESENT, card("/"));
    EXPECT_EQ(TAPI_SIM_STATUS_SIM_INITIALIZING, card("/sim"));
    const std::string empty = "'/modem': {'org.freedesktop.ModemManager1.Modem': {'Sim': <objectpath '/'>}}";
    EXPECT_TRUE(SimsOf(Present(empty)).empty()) << "nothing to read";
}

TEST(Modem, RegistrationGivesServiceRoamingAndReadinessForTexts)
{
    constexpr struct
    {
        int serviceState;
        bool roaming;
        int serviceType, cellular;
    } kRows[] = {
        {1, false, 1, 0}, // idle
        {0, false, 9, 4}, // home
        {1, false, 3, 0}, // searching
        {1, false, 1, 0}, // denied
        {1, false, 1, 0}, // unknown
        {0, true, 9, 2},  // roaming
        {0, false, 9, 3}, // home, SMS only
        {0, true, 9, 3},  // roaming, SMS only
        {2, false, 2, 0}, // emergency only
        {0, false, 9, 4}, // home, CSFB not preferred
        {0, true, 9, 2},  // roaming, CSFB not preferred
        {2, false, 2, 0}, // restricted
        {1, false, 1, 0}, // a later one
    };
    for (int state = 0; state < static_cast<int>(std::size(kRows)); ++state)
    {
        const auto& row = kRows[state];
        const std::string interfaces = Registered(state) + ", 'org.freedesktop.ModemManager1.Modem.Messaging': @a{sv} {}";
        const Device device = Described(Present(Modem("/modem", "'State': <8>, 'AccessTechnologies': <uint32 16384>", interfaces)));
        const SimSlot& slot = device.slots.at(0);
        EXPECT_EQ(std::tie(row.serviceState, row.roaming, row.serviceType, row.cellular),
            std::tie(slot.serviceState, slot.roaming, slot.serviceType, device.cellularState))
            << state;
        EXPECT_EQ(row.serviceState == 0 ? 1 : 0, slot.smsStatus) << state;
        EXPECT_EQ(0, OnlySlot("'State': <8>", Registered(state)).smsStatus) << "without the messaging interface";
    }
}

TEST(Modem, AccessTechnologyGivesTheGenerationOfTheService)
{
    constexpr int kTypes[] = {4, 4, 4, 5, 6, 7, 8, 8, 8, 8, 5, 7, 7, 7, 9, 10, 9, 9}; // by bit, from analogue on
    for (std::size_t bit = 0; bit < std::size(kTypes); ++bit)
    {
        const std::string technology = "'AccessTechnologies': <uint32 " + std::to_string(1U << bit) + ">";
        EXPECT_EQ(kTypes[bit], OnlySlot(technology, Registered(1)).serviceType) << technology;
    }
    EXPECT_EQ(10, OnlySlot("'AccessTechnologies': <uint32 49152>", Registered(1)).serviceType) << "LTE and 5G";
    EXPECT_EQ(4, OnlySlot("'AccessTechnologies': <uint32 0>", Registered(1)).serviceType) << "not known";
}

TEST(Modem, OperatorCodeSplitsTheImsiAndNothingElseDoes)
{
    constexpr struct
    {
        const char *imsi, *ofSim, *ofNetwork, *record;
    } kRows[] = {
        {"310150123456789", "310150", "", "310 150 123456789"},
        {"262011234567890", "26201", "310150", "262 01 1234567890"},
        {"262011234567890", "", "26201", "262 01 1234567890"},
        {"262011234567890", "", "310150", "missing"}, // roaming
        {"262011234567890", "", "", "missing"},
        {"262011234567890", "2620", "", "missing"},
        {"262011234567890", "2620112", "", "missing"},
        {"26201", "26201", "", "missing"},
        {"2620112345678901", "26201", "", "missing"},
        {"", "26201", "", "missing"},
    };
    for (const auto& row : kRows)
    {
        const std::string sim = std::string("'/sim': {'org.freedesktop.ModemManager1.Sim': {'Imsi': <'") + row.imsi +
                                "'>, 'OperatorIdentifier': <'" + row.ofSim + "'>}}";
        const std::string network =
            std::string(", 'org.freedesktop.ModemManager1.Modem.Modem3gpp': {'OperatorCode': <'") + row.ofNetwork + "'>}";
        const Device device = Described(Present(sim + ", " + Modem("/modem", "'State': <8>", network)));
        const SimSlot& slot = device.slots.at(0);
        EXPECT_EQ(row.record, slot.mcc ? *slot.mcc + " " + *slot.mnc + " " + *slot.msin : "missing") << row.imsi;
        EXPECT_EQ(slot.mcc ? 0U : 1U, device.reasons.count("sim0.mcc"));
    }
}

TEST(Modems, AreSlotsInTheNaturalOrderOfDeviceAndPort)
{
    const auto modem = [](const std::string& path, const std::string& device, const std::string& port)
    {
        return Modem(path, "'State': <8>, 'Device': <'" + device + "'>, 'PrimaryPort': <'" + port +
                               "'>, 'OwnNumbers': <['+1', '+2']>, " + "'EquipmentIdentifier': <'356938035643809'>");
    };
    const Device device = Described(
        Present(modem("/0", "/usb10", "tty1") + ", " + modem("/1", "/usb2", "tty10") + ", " + modem("/2", "/usb2", "tty9")));
    std::vector<std::string> names;
    for (const SimSlot& slot : device.slots)
        names.push_back(slot.cpName + " " + slot.number.value_or("") + " " + slot.imei.value_or(""));
    EXPECT_THAT(names, testing::ElementsAre("tty9 +1 356938035643809", "tty10 +1 356938035643809", "tty1 +1 356938035643809"));
    EXPECT_EQ(-1, device.defaultNetwork) << "of several nobody knows";
    EXPECT_EQ(0, Described(Present(modem("/0", "/usb", "tty"))).defaultData) << "the only one";
}

TEST(Modem, PropertiesOfAnotherTypeCountAsMissing)
{
    const SimSlot slot =
        OnlySlot("'State': <'8'>, 'OwnNumbers': <uint32 1>, 'EquipmentIdentifier': <@as []>, 'PrimaryPort': <(1, 2)>");
    EXPECT_EQ(std::vector<int>{TAPI_SIM_STATUS_UNKNOWN}, slot.cardStatus);
    EXPECT_EQ(std::make_tuple(Text(), Text(), std::string()), std::tie(slot.number, slot.imei, slot.cpName));
}

TEST(Network, StateOfAWifiDeviceGivesItsConnection)
{
    const std::map<int, std::pair<int, int>> kRows = {{0, {0, 1}}, {10, {0, 1}}, {20, {0, 1}}, {30, {0, 1}}, {40, {1, 1}},
        {50, {1, 1}}, {60, {1, 1}}, {70, {2, 1}}, {80, {2, 1}}, {90, {2, 1}}, {100, {3, 2}}, {110, {0, 1}}, {120, {-1, 1}}};
    for (const auto& [state, expected] : kRows)
    {
        const auto& [connection, wifi] = expected;
        const Device device = Described(Present("", Switches(true, true) + ", " + NetworkDevice("/1", 2, state)));
        EXPECT_EQ(std::make_pair(connection, wifi), std::make_pair(device.wifiConnectionState, device.wifiState)) << state;
        EXPECT_EQ(std::make_pair(1, wifi), std::make_pair(device.wifiDeviceState, device.wifiStatus)) << state;
    }
    const Device two = Described(Present("", Switches(true, true) + ", " + NetworkDevice("/1", 2, 120) + ", " +
                                                 NetworkDevice("/2", 2, 100) + ", " + NetworkDevice("/3", 2, 50)));
    EXPECT_EQ(WIFI_CONNECTION_STATE_CONNECTED, two.wifiConnectionState) << "the one that is furthest";
}

TEST(Network, SwitchesGiveFlightModeAndMobileData)
{
    const std::string modem = Modem("/modem", "'State': <8>", Registered(1));
    const std::string wifi = ", " + NetworkDevice("/1", 2, 30);
    const std::string off = "'/hci0': {'org.bluez.Adapter1': {'Powered': <false>}}";
    const std::string on = "'/hci0': {'org.bluez.Adapter1': {'Powered': <true>}}";
    const std::string blocked = // by switches of the hardware
        "'/org/freedesktop/NetworkManager': {'org.freedesktop.NetworkManager': {'WirelessEnabled': <true>, 'WwanEnabled': <true>}}";
    const struct
    {
        std::string modems, network, bluetooth;
        bool flightMode, mobileData;
        int cellular, wifi, bluetoothState;
    } kRows[] = {
        {modem, Switches(true, true) + wifi, off, false, true, 4, 1, 0},
        {modem, Switches(true, false) + wifi, off, false, false, 4, 1, 0},
        {modem, Switches(false, false) + wifi, off, true, false, 1, 0, 0},
        {modem, Switches(false, false) + wifi, on, false, false, 4, 0, 1},
        {modem, Switches(false, true) + wifi, off, false, true, 4, 0, 0},
        {modem, blocked + wifi, off, true, false, 1, 0, 0},
        {"", Switches(false, false), "", false, false, 0, 0, 0}, // no radio at all
        {"", Switches(true, true), off, true, false, 1, 0, 0},   // the only radio
        {"", Switches(true, true) + ", " + NetworkDevice("/5", 5, 100), on, false, false, 0, 0, 2},
    };
    for (const auto& row : kRows)
    {
        const Device device = Described(Present(row.modems, row.network, row.bluetooth));
        EXPECT_EQ(std::tie(row.flightMode, row.mobileData, row.mobileData, row.cellular, row.wifi, row.bluetoothState),
            std::tie(device.flightMode, device.mobileData, device.packetData, device.cellularState, device.wifiState,
                device.bluetoothState))
            << row.modems << row.network << row.bluetooth;
    }
}

TEST(Network, DecidesWhetherAModemIsConnectedWhereItKnowsIt)
{
    const std::string connected = Modem("/modem", "'State': <11>", Registered(1));
    const auto cellular = [&](const std::string& network)
    { return Described(Present(connected, network.empty() ? "" : Switches(true, true) + network)).cellularState; };
    const std::string udi = ", 'Udi': <'/modem'>";
    EXPECT_EQ(CONNECTION_CELLULAR_STATE_CONNECTED, cellular(""));
    EXPECT_EQ(CONNECTION_CELLULAR_STATE_AVAILABLE, cellular(", " + NetworkDevice("/1", 8, 30, udi)));
    EXPECT_EQ(CONNECTION_CELLULAR_STATE_CONNECTED, cellular(", " + NetworkDevice("/1", 8, 100, udi)));
    EXPECT_EQ(CONNECTION_CELLULAR_STATE_CONNECTED, cellular(", " + NetworkDevice("/1", 8, 10, udi))) << "unmanaged";
    EXPECT_EQ(CONNECTION_CELLULAR_STATE_CONNECTED, cellular(", " + NetworkDevice("/1", 8, 30, ", 'Udi': <'/other'>")));
}

TEST(Network, ConnectionOfAModemGivesDataRoaming)
{
    const std::string network =
        Switches(true, true) + ", " +
        NetworkDevice(
            "/1", 8, 100, ", 'ActiveConnection': <objectpath '/active'>, 'AvailableConnections': <[objectpath '/other']>") +
        ", '/active': {'org.freedesktop.NetworkManager.Connection.Active': {'Connection': <objectpath '/mine'>}}";
    EXPECT_THAT(ConnectionsOf(Present("", network)), testing::ElementsAre("/mine"));
    EXPECT_THAT(ConnectionsOf(Present("", NetworkDevice("/1", 8, 30, ", 'AvailableConnections': <[objectpath '/other']>"))),
        testing::ElementsAre("/other"));
    const std::string wifi = NetworkDevice("/1", 2, 100, ", 'AvailableConnections': <[objectpath '/wifi']>");
    EXPECT_TRUE(ConnectionsOf(Present("", wifi + ", " + NetworkDevice("/2", 8, 30))).empty());
    for (const auto& [settings, roaming] : {std::pair("@a{sv} {}", true), std::pair("{'home-only': <true>}", false)})
    {
        const std::string connection = std::string(", '/mine': {'gsm': ") + settings + "}";
        EXPECT_EQ(roaming, Described(Present("", network + connection)).dataRoaming) << settings;
    }
    EXPECT_FALSE(Described(Present("", network)).dataRoaming) << "not read";
}

TEST(Reasons, SayWhichDaemonIsMissingOrRefuses)
{
    const auto reason = [](Presence modems, Presence network, const char* key)
    {
        Reports reports;
        reports.modemManager = modems;
        reports.networkManager = network;
        return Described(reports).reasons[key];
    };
    constexpr Presence kAbsent = Presence::Absent, kDenied = Presence::Denied, kPresent = Presence::Present;
    EXPECT_EQ("ModemManager does not run", reason(kAbsent, kPresent, "telephony.available"));
    EXPECT_EQ("not permitted", reason(kDenied, kPresent, "network.cellular"));
    EXPECT_EQ("no modem", reason(kPresent, kPresent, "settings.mobile-data"));
    EXPECT_EQ("NetworkManager does not run", reason(kPresent, kAbsent, "network.wifi"));
    EXPECT_EQ("not permitted", reason(kPresent, kDenied, "runtime.flight-mode"));
    const std::string wired = Switches(true, true, ", 'PrimaryConnectionType': <'802-3-ethernet'>");
    EXPECT_EQ("a wired connection carries the traffic, and does not count here", Described(Present("", wired)).reasons["network"]);
}

/// Files of a machine, below a folder of the test's.
struct Files : testing::Test
{
    ~Files() override { std::filesystem::remove_all(root); }

    void Write(const std::string& path, const std::string& text)
    {
        std::filesystem::create_directories(std::filesystem::path(root + path).parent_path());
        std::ofstream(root + path) << text;
    }

    const std::string root = mkdtemp((std::filesystem::temp_directory_path() / "kiv-host-XXXXXX").string().data());
    HostFiles files{root};
};

TEST_F(Files, TellNamesModelPlatformAndLanguage)
{
    g_setenv("LANG", "C.UTF-8", TRUE);
    const struct
    {
        Text Device::*text;
        const char *path, *contents, *expected;
    } kRows[] = {
        // each after those before it
        {&Device::deviceName, "/proc/sys/kernel/hostname", "workbench\n", "workbench"},
        {&Device::deviceName, "/etc/machine-info", "ICON=x\nPRETTY_HOSTNAME=\"My \\\"Phone\\\"\"\n", "My \"Phone\""},
        {&Device::modelName, "/sys/firmware/devicetree/base/model", "Board 3\0", "Board 3"},
        {&Device::modelName, "/sys/class/dmi/id/product_name", "Laptop 5\n", "Laptop 5"},
        {&Device::modelName, "/sys/class/dmi/id/product_name", "\n", "Board 3"},
        {&Device::serial, "/sys/class/dmi/id/product_serial", "S1\n", "S1"},
        {&Device::platformName, "/usr/lib/os-release", "NAME='Example OS'\nVERSION_ID=7\n", "Example OS"},
        {&Device::platformVersion, "/etc/os-release", "VERSION=9\nVERSION_ID=8\n", "8"},
        {&Device::tizenId, "/etc/machine-id", "0123456789abcdef0123456789abcdef\n", "bc35f410f569b843596dded89bfeb3e3"},
        {&Device::language, "/etc/default/locale", "LANG=C.UTF-8\n", "missing"},
        {&Device::language, "/etc/default/locale", "LANGUAGE=x\nLANG=\"ko_KR.UTF-8\"\n", "ko_KR"},
        {&Device::language, "/etc/locale.conf", "LANG=de_AT@euro\n", "de_AT"},
        {&Device::language, "/etc/locale.conf", "LANG=POSIX\n", "missing"},
        {&Device::salesCode, "/etc/csc", "KIV\n", "missing"},
    };
    for (const auto& row : kRows)
    {
        Write(row.path, row.contents);
        Device device;
        device.*row.text = "before";
        files.Refresh(device, row.text);
        EXPECT_EQ(row.expected, (device.*row.text).value_or("missing")) << row.path;
        EXPECT_EQ(device.*row.text ? 0U : 1U, device.reasons.size()) << row.path;
    }
}

TEST_F(Files, ThatAreMissingLeaveTextsMissingWithAReason)
{
    g_setenv("LANG", "fr_FR.UTF-8", TRUE);
    Device device;
    files.ReadAll(device);
    EXPECT_EQ("fr_FR", device.language) << "the environment's";
    EXPECT_FALSE(device.deviceName || device.modelName || device.platformName || device.platformVersion || device.tizenId ||
                 device.serial || device.salesCode || device.fontSize);
    EXPECT_EQ("not available on this machine", device.reasons["settings.font-size"]);
    EXPECT_EQ(8U, device.reasons.size());
    Write("/proc/sys/kernel/hostname", "workbench");
    files.Refresh(device, &Device::deviceName);
    EXPECT_EQ(0U, device.reasons.count("settings.device-name")) << "there is one now";
    if (geteuid() != 0) // who may read everything
    {
        Write("/sys/class/dmi/id/product_serial", "S1");
        std::filesystem::permissions(root + "/sys/class/dmi/id/product_serial", std::filesystem::perms::none);
        files.Refresh(device, &Device::serial);
        EXPECT_EQ("not permitted", device.reasons["device.serial"]);
    }
}

TEST_F(Files, OfDpkgTellWhichPackagesAreInstalled)
{
    Device device;
    EXPECT_FALSE(files.RefreshPackage(device, "one")) << "no dpkg";
    Write("/var/lib/dpkg/status", "Package: one\nStatus: install ok installed\nVersion: 1:2.3-4\n\n"
                                  "Package: two\nStatus: deinstall ok config-files\nVersion: 1\n\n"
                                  "Package: three\nDescription: see\n Package: four\nStatus: install ok installed\nVersion: 3\n");
    device.packages["two"] = "0";
    for (const char* id : {"one", "two", "three", "four", "on"})
        EXPECT_TRUE(files.RefreshPackage(device, id));
    EXPECT_EQ((std::map<std::string, std::string>{{"one", "1:2.3-4"}, {"three", "3"}}), device.packages);
}

TEST_F(Files, OfTheUsersShareTheirFreeSpace)
{
    Device device;
    device.blocksAvailable = 0;
    files.RefreshStorage(device);
    EXPECT_NE(0U, device.blocksAvailable);
    EXPECT_GE(device.blockSize, 512U);
}

} // namespace
