#ifndef BUSPARTY_H
#define BUSPARTY_H

#include "BusCall.h"

#include <functional>
#include <memory>
#include <stdexcept>
#include <string>

namespace kiv
{

/// The bus can not be reached, or refuses what a party asks of it.
class BusError : public std::runtime_error
{
public:
    enum class Reason
    {
        NoBus,
        NameRefused
    };

    BusError(Reason why, const std::string& text) : std::runtime_error(text), reason(why) {}

    const Reason reason;
};

/// What a handler throws to answer a call with an error of the bus.
class CallError : public std::runtime_error
{
public:
    CallError(GDBusError why, const std::string& text) : std::runtime_error(text), code(why) {}

    const GDBusError code;
};

/// One who answers calls on the system bus: a connection of its own, one object on it, and a well-known name where wanted.
/// Calls are answered in the default main context, which the owner iterates.
class BusParty
{
public:
    /// Answers a call. @return the reply's body, a tuple, consumed when floating; null for an empty one. May throw CallError.
    using Handler = std::function<GVariant*(const BusCall&)>;

    /// Connects and exports the object; there is no name to call it by yet but the connection's own.
    /// @param xml  introspection data of one node: its name is the object path, its first interface the object's
    /// Throws BusError. Blocks while connecting.
    BusParty(const char* xml, Handler handler);
    BusParty(const BusParty&) = delete;
    BusParty& operator=(const BusParty&) = delete;
    virtual ~BusParty();

    /// Takes a well-known name for as long as the party lives; does not queue for it.
    /// Throws BusError. Blocks on the bus.
    void OwnName(const std::string& name);

    /// Gives the well-known name back. A call that the bus has sent here before is in the main context on return.
    /// Blocks on the bus.
    void ReleaseName();

    /// The well-known name taken, or else the connection's unique one.
    const std::string& Name() const { return name_; }
    const char* ObjectPath() const { return node_->path; }
    const char* Interface() const { return node_->interfaces[0]->name; }

    /// Whether the bus is still there.
    bool IsConnected() const { return !g_dbus_connection_is_closed(connection_.get()); }

    /// Does what is due between two rounds of the main loop. @return whether to go on serving
    virtual bool GoOn() { return true; }

    /// The party's own connection, by which others know it; borrowed.
    GDBusConnection* Connection() const { return connection_.get(); }

    /// Calls a method of the bus itself.
    /// @param arguments  tuple, consumed when floating; null for none
    /// @return the reply's body; null after an error
    /// Blocks on the bus.
    VariantPtr CallBus(const char* method, GVariant* arguments, const char* replyType, GError** error = nullptr) const;

private:
    struct Deleter
    {
        void operator()(GDBusConnection* connection) const { g_object_unref(connection); }
        void operator()(GDBusNodeInfo* node) const { g_dbus_node_info_unref(node); }
    };

    static void Called(GDBusConnection*, const char* sender, const char* path, const char* interface, const char* method,
        GVariant* arguments, GDBusMethodInvocation* invocation, gpointer self);

    std::unique_ptr<GDBusConnection, Deleter> connection_;
    std::unique_ptr<GDBusNodeInfo, Deleter> node_;
    Handler handler_;
    std::string name_;
    guint registration_ = 0;
};

} // namespace kiv

#endif
