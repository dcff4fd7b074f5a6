/// @file
/// The objects of a service on the bus, kept current by its signals.
#ifndef KIV_SOURCES_REMOTEOBJECTS_H
#define KIV_SOURCES_REMOTEOBJECTS_H

#include "Reports.h"

#include <functional>
#include <gio/gio.h>
#include <map>
#include <memory>
#include <string>

namespace kiv::platform
{

/// A service with an org.freedesktop.DBus.ObjectManager.
struct ServiceName
{
    const char* name;          ///< on the bus
    const char* manager;       ///< path of the object manager
    const char* interfaces[5]; ///< those whose properties matter, and a null
};

struct EndOfTimer
{
    void operator()(GSource* source) const
    {
        g_source_destroy(source);
        g_source_unref(source);
    }
};
using Timer = std::unique_ptr<GSource, EndOfTimer>;

/// Calls the function once, from the thread's default context.
Timer StartTimer(guint milliseconds, GSourceFunc function, gpointer data);

/// The objects of one service, over one connection. For one thread, whose default context it uses. Never blocks, never starts the
/// service, and survives the end of the connection. (GDBusObjectManagerClient reads the objects of a service that came back in a
/// call that blocks for up to 25 seconds, and prints a warning when that fails or the bus is gone.)
class RemoteObjects
{
public:
    /// @param service  a constant
    /// @param report   filled and kept current; `changed` runs after each change
    RemoteObjects(GDBusConnection* connection, const ServiceName& service, ServiceReport& report, std::function<void()> changed);
    RemoteObjects(const RemoteObjects&) = delete;
    RemoteObjects& operator=(const RemoteObjects&) = delete;
    ~RemoteObjects();

    /// Whether everything was read.
    bool IsComplete() const { return isKnown_ && pending_ == 0; }

    /// Objects beside those of the object manager, read by a method call each.
    using Calls = std::map<std::string, DetailCall>;

    /// Reads the objects that are not there yet, and forgets those that were wanted and no longer are.
    void Want(Calls details);

private:
    using TakeReply = void (RemoteObjects::*)(const std::string& path, GVariant* reply, const GError* error);
    struct Question;

    static void OnSignal(GDBusConnection* connection, const char* sender, const char* path, const char* interface,
        const char* signal, GVariant* arguments, gpointer self);
    static void OnReply(GObject* connection, GAsyncResult* result, gpointer question);

    void Match(const std::string& rule);
    void Ask(const char* destination, const std::string& path, const DetailCall& call, TakeReply take);
    void AskForObjects();
    void SetOwner(const std::string& owner);
    void TakeOwner(const std::string& path, GVariant* reply, const GError* error);
    void TakeObjects(const std::string& path, GVariant* reply, const GError* error);
    void TakeDetail(const std::string& path, GVariant* reply, const GError* error);
    void TakeInterfaces(const std::string& path, GVariant* interfaces);
    void TakeProperties(const std::string& path, const char* interface, GVariant* properties);
    void TakeSignal(const std::string& signal, const std::string& path, GVariant* arguments);
    void Forget();

    GDBusConnection* const connection_;
    const ServiceName& service_;
    ServiceReport& report_;
    const std::function<void()> changed_;
    const guint subscription_;

    std::string owner_; // unique name on the bus; empty while there is none
    bool isKnown_ = false;
    unsigned pending_ = 0;
    Calls wanted_;
    GCancellable* cancellable_ = nullptr; // of what was asked of the owner
    Timer retry_;
};

} // namespace kiv::platform

#endif
