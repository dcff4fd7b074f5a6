/// @file
/// What a service on the bus reports of its objects, kept current by its signals.
#ifndef KIV_SOURCES_REMOTEOBJECTS_H
#define KIV_SOURCES_REMOTEOBJECTS_H

#include "Reports.h"

#include <functional>
#include <gio/gio.h>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace kiv::platform
{

/// A service with an org.freedesktop.DBus.ObjectManager.
struct ServiceName
{
    const char* name;          ///< on the bus
    const char* manager;       ///< path of the object manager
    const char* interfaces[5]; ///< those whose properties matter, and a null
};

/// Of one service, over one connection; for one thread, whose thread-default main context it uses. Never blocks, and never starts
/// the service. (GDBusObjectManagerClient reads the objects of a service that came back in a call that blocks, for up to 25
/// seconds, and prints a warning when that fails.)
class RemoteObjects
{
public:
    /// @param service  a constant
    /// @param report   filled and kept current; `changed` runs after each change
    RemoteObjects(GDBusConnection* connection, const ServiceName& service, ServiceReport& report, std::function<void()> changed);
    RemoteObjects(const RemoteObjects&) = delete;
    RemoteObjects& operator=(const RemoteObjects&) = delete;
    ~RemoteObjects();

    /// Whether everything was read that there is to read now.
    bool IsComplete() const { return isKnown_ && pending_ == 0; }

    /// Objects beside those of the object manager, read by a method call each.
    using Calls = std::map<std::string, DetailCall>;

    /// Reads the objects that are not there yet, and forgets those that were wanted and no longer are.
    void Want(Calls details);

private:
    struct Question;

    static void OnAppeared(GDBusConnection* connection, const char* name, const char* owner, gpointer self);
    static void OnVanished(GDBusConnection* connection, const char* name, gpointer self);
    static void OnSignal(GDBusConnection* connection, const char* sender, const char* path, const char* interface,
        const char* signal, GVariant* arguments, gpointer self);
    static void OnReply(GObject* connection, GAsyncResult* result, gpointer question);
    static gboolean AskAgain(gpointer self);

    void Subscribe(const char* interface, const char* signal, const char* path, const char* argument);
    void Ask(const std::string& path, const DetailCall& call);
    void Take(const std::string& path, GVariant* reply);
    void TakeProperties(const std::string& path, const char* interface, GVariant* properties);
    void Forget();
    bool Matters(const char* interface) const;

    GDBusConnection* const connection_;
    const ServiceName& service_;
    ServiceReport& report_;
    const std::function<void()> changed_;

    std::string owner_; // unique name on the bus; empty while there is none
    bool isKnown_ = false;
    unsigned pending_ = 0;
    Calls wanted_;
    GCancellable* cancellable_ = nullptr; // of the questions to the owner
    GSource* retry_ = nullptr;
    std::vector<guint> subscriptions_;
    guint watch_ = 0;
};

} // namespace kiv::platform

#endif
