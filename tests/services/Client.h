#ifndef KIV_TESTS_CLIENT_H
#define KIV_TESTS_CLIENT_H

#include "support/Deliveries.h"
#include "support/Peer.h"

#include <DASubscriberStore.h>

#include <glib/gstdio.h>
#include <unistd.h>

namespace kiv::test
{

constexpr char kPath[] = "/org/example/Client";
constexpr char kInterface[] = "org.example.Client";
constexpr char kMail[] = "org.example.Mail"; ///< a well-known name

/// Returns the bus names of the store's records, in their order.
inline std::vector<std::string> Stored()
{
    std::vector<DASubscription> records;
    std::string reason;
    EXPECT_EQ(DASubscriberStore::Outcome::Done, DASubscriberStore().List(records, reason)) << reason;
    std::vector<std::string> names;
    for (const DASubscription& record : records)
        names.push_back(record.subscriber.busname);
    return names;
}

inline void AwaitStored(const std::vector<std::string>& names)
{
    IterateUntil([&] { return Stored() == names; });
}

/// A folder with the subscriber store in use while it lives; in memory if possible.
struct StoreFolder
{
    StoreFolder() { g_setenv("KIV_SUBSCRIBERS", (path / "subscribers.db").c_str(), TRUE); }
    StoreFolder(const StoreFolder&) = delete;
    StoreFolder& operator=(const StoreFolder&) = delete;
    ~StoreFolder() { std::filesystem::remove_all(path); }

    const std::filesystem::path path =
        g_mkdtemp(((g_access("/dev/shm", W_OK) == 0 ? std::filesystem::path("/dev/shm") : std::filesystem::temp_directory_path()) /
                   "kiv-services-XXXXXX")
                      .string()
                      .data());
};

/// A client service that subscribes over the bus, with its own connection.
class Client : public Peer
{
public:
    explicit Client(const PrivateBus& bus) : Peer(bus) {}

    std::string UniqueName() const { return g_dbus_connection_get_unique_name(Bus()); }

    /// Calls the subscription service.
    /// @return the reply's body as text, or the error's name without the common prefix; `reason` keeps its text
    std::string Call(const char* method, GVariant* arguments = nullptr)
    {
        GError* error = nullptr;
        g_autoptr(GVariant) reply = g_dbus_connection_call_sync(Bus(), "org.kiv.Subscriptions", "/org/kiv/Subscriptions",
            "org.kiv.Subscriptions1", method, arguments, nullptr, G_DBUS_CALL_FLAGS_NONE, 60'000, nullptr, &error);
        if (reply != nullptr)
        {
            const g_autofree char* text = g_variant_print(reply, FALSE);
            return text;
        }
        const g_autofree char* name = g_dbus_error_get_remote_error(error);
        reason = error->message;
        g_error_free(error);
        return name == nullptr ? reason : std::string(g_strrstr(name, ".") + 1);
    }

    std::string Change(const char* method, const std::string& name, const char* kind = "auth", const char* key = "all",
        const char* path = kPath, const char* interface = kInterface)
    {
        return Call(method, g_variant_new("(sssos)", kind, key, name.c_str(), path, interface));
    }

    std::string reason; ///< of the last error
};

} // namespace kiv::test

#endif
