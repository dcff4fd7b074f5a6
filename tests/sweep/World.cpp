#include "sweep/World.h"

#include <DASubscriberStore.h>
#include <DeviceControl.h>
#include <SourceControl.h>

namespace kiv::test
{

bool IsLong()
{
    return std::getenv("KIV_TEST_LONG") != nullptr;
}

Session::Session()
{
    telephony_init(&given);
}

Session::~Session()
{
    telephony_deinit(&given);
    telephony_deinit(&left);
}

World::World()
    : directory(mkdtemp((std::filesystem::temp_directory_path() / "kiv-sweep-XXXXXX").string().data())),
      board(bus, "org.tizen.system.deviced", Peer::Reply("('KIV0123456789',)")),
      serviceManager(bus, "org.tizen.servicemanager.service"),
      client(bus, "org.example.client")
{
    for (Peer* const peer : {&board, &serviceManager, &client})
        peer->Forget();
    setenv("KIV_SUBSCRIBERS", (directory + "/subscribers.db").c_str(), 1);
    std::string reason;
    const std::pair<const char*, const char*> events[] = {
        {"policy", "5"}, {"status", "5"}, {"auth", "all"}, {"activated", "all"}, {"number_changed", "all"}, {"push", "5"}};
    for (const auto& [kind, key] : events)
        DASubscriberStore().Add({kind, key, {client.Name(), "/client", "org.example.Client"}}, reason);
    setenv("TZ", "UTC", 1);
    tzset();
    Use("dual");
}

World::~World()
{
    platform::ResetDevice();
    std::filesystem::remove_all(directory);
}

void World::Use(const std::string& profile)
{
    platform::ResetDevice();
    platform::UseProfile(profile);
    platform::ChangeDevice(
        [](platform::Device& device)
        {
            device.currentTime = 4'000'000'000; // later than 32 bits reach
            device.flightMode = device.dataRoaming = true;
            device.bluetoothState = 2;
        });
}

} // namespace kiv::test
