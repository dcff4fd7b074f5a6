// The bus calls of an agent, made with GDBus alone, or with the subscriber store and the platform as well.
#include "../BareBus.h"
#include "Peak.h"

#include <gio/gio.h>

#ifdef KIV_BENCH_WITH_STORE
#include <DASubscriberStore.h>
#include <system_settings.h>

#include <cstdlib>
#endif

using namespace kiv::bench;

int main()
{
    [[maybe_unused]] g_autoptr(GDBusConnection) connection = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
    [[maybe_unused]] g_autoptr(GVariant) serial =
        g_dbus_connection_call_sync(connection, "org.tizen.system.deviced", "/Org/Tizen/System/DeviceD/Board",
            "org.tizen.system.deviced.Board", "GetSerial", nullptr, nullptr, G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
#ifdef KIV_BENCH_WITH_STORE
    char* language = nullptr;
    system_settings_get_value_string(SYSTEM_SETTINGS_KEY_LOCALE_LANGUAGE, &language);
    std::free(language);
    std::list<_SubscriberInfo> subscribers;
    std::string reason;
    DASubscriberStore().Find("status", "1", subscribers, reason);
#endif
    const std::vector<std::string> paths = SubscriberPaths(1);
    NotifyBare(paths, 1);
    PushBare(paths, "1");
    Drain();
    PrintPeak();
}
