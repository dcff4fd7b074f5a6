#ifndef BUSPARTY_H
#define BUSPARTY_H

#include "BusCall.h"

#include <functional>
#include <memory>
#include <stdexcept>
#include <string>

namespace kiv
{

/// The bus cannot be reached, or refuses a request of a party.
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

/// Thrown by a handler to answer a call with a bus error.
class CallError : public std::runtime_error
{
public:
    CallError(GDBusError why, const std::string& text) : std::runtime_error(text), code(why) {}

    const GDBusError code;
};

/// Answers calls on the system bus. It has its own connection, one object on it, and optionally a well-known name.
/// Calls are answered in the default main context, which the owner iterates.
class BusParty
{
public:
    /// Answers a call. @return the reply's body, a tuple, consumed when floating; null for an empty one. May throw CallError.
    using Handler = std::function<GVariant*(const BusCall&)>;

    /// Connects and exports the object, which at first has only the connection's unique name.
    /// @param xml  introspection data of one node: its name is the object path, its first interface that of the object
    /// Throws BusError. Blocks while connecting.
    BusParty(const char* xml, Handler handler);
    BusParty(const BusParty&) = delete;
    BusParty& operator=(const BusParty&) = delete;
    virtual ~BusParty();

    /// Takes a well-known name while the party lives; does not queue for it.
    /// Throws BusError. Blocks on the bus.
    void OwnName(const std::string& name);

    /// Releases the well-known name. On return, calls that the bus has already sent here are in the main context.
    /// Blocks on the bus.
    void ReleaseName();

    /// Returns the well-known name if there is one, otherwise the connection's unique name.
    const std::string& Name() const { return name_; }
    const char* ObjectPath() const { return node_->path; }
    const char* Interface() const { return node_->interfaces[0]->name; }

    /// Whether the connection is still open.
    bool IsConnected() const { return !g_dbus_connection_is_closed(connection_.get()); }

    /// Does work that is due between two rounds of the main loop. @return whether to go on serving
    virtual bool GoOn() { return true; }

    /// Returns the party's own connection; borrowed.
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
