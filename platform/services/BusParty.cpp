#include "BusParty.h"

#include <utility>

namespace kiv
{
namespace
{

/// Flags and replies of org.freedesktop.DBus.RequestName.
constexpr guint kDoNotQueue = 4;
constexpr guint kPrimaryOwner = 1;

/// Makes a private connection, because the shared one belongs to the library, which the same process may use.
GDBusConnection* Connect()
{
    g_autoptr(GError) error = nullptr;
    g_autofree char* address = g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SYSTEM, nullptr, &error);
    GDBusConnection* connection = nullptr;
    if (address != nullptr)
    {
        const auto flags = static_cast<GDBusConnectionFlags>(
            G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT | G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);
        connection = g_dbus_connection_new_for_address_sync(address, flags, nullptr, nullptr, &error);
    }
    if (connection == nullptr)
    {
        throw BusError(BusError::Reason::NoBus, std::string("the system bus at \"") + (address == nullptr ? "?" : address) +
                                                    "\" cannot be reached: " + error->message +
                                                    "; set DBUS_SYSTEM_BUS_ADDRESS to its address");
    }
    return connection;
}

} // namespace

BusParty::BusParty(const char* xml, Handler handler)
    : connection_(Connect()),
      node_(g_dbus_node_info_new_for_xml(xml, nullptr)),
      handler_(std::move(handler)),
      name_(g_dbus_connection_get_unique_name(connection_.get()))
{
    static const GDBusInterfaceVTable vtable = {Called, nullptr, nullptr, {}};
    registration_ =
        g_dbus_connection_register_object(connection_.get(), ObjectPath(), node_->interfaces[0], &vtable, this, nullptr, nullptr);
}

BusParty::~BusParty()
{
    g_dbus_connection_unregister_object(connection_.get(), registration_);
    g_dbus_connection_flush_sync(connection_.get(), nullptr, nullptr); // closing drops replies that are not written yet
    g_dbus_connection_close_sync(connection_.get(), nullptr, nullptr);
}

void BusParty::OwnName(const std::string& name)
{
    g_autoptr(GError) error = nullptr;
    const VariantPtr reply = CallBus("RequestName", g_variant_new("(su)", name.c_str(), kDoNotQueue), "(u)", &error);
    if (reply == nullptr)
    {
        g_dbus_error_strip_remote_error(error);
        throw BusError(BusError::Reason::NameRefused, "the bus refuses the name \"" + name + "\": " + error->message);
    }

    guint answer = 0;
    g_variant_get(reply.get(), "(u)", &answer);
    if (answer != kPrimaryOwner)
    {
        throw BusError(
            BusError::Reason::NameRefused, "the bus name \"" + name + "\" is taken; stop the process that owns it first");
    }
    name_ = name;
}

void BusParty::ReleaseName()
{
    CallBus("ReleaseName", g_variant_new("(s)", name_.c_str()), "(u)");
    name_ = g_dbus_connection_get_unique_name(connection_.get());
}

VariantPtr BusParty::CallBus(const char* method, GVariant* arguments, const char* replyType, GError** error) const
{
    return VariantPtr(g_dbus_connection_call_sync(connection_.get(), "org.freedesktop.DBus", "/org/freedesktop/DBus",
        "org.freedesktop.DBus", method, arguments, G_VARIANT_TYPE(replyType), G_DBUS_CALL_FLAGS_NONE, -1, nullptr, error));
}

void BusParty::Called(GDBusConnection*, const char* sender, const char*, const char*, const char*, GVariant* arguments,
    GDBusMethodInvocation* invocation, gpointer self)
{
    try
    {
        const BusCall call{*g_dbus_method_invocation_get_method_info(invocation), sender, arguments};
        g_dbus_method_invocation_return_value(invocation, static_cast<BusParty*>(self)->handler_(call));
    }
    catch (const CallError& error)
    {
        const g_autofree char* text = g_utf8_make_valid(error.what(), -1); // it may contain any file name
        g_dbus_method_invocation_return_error_literal(invocation, G_DBUS_ERROR, error.code, text);
    }
}

} // namespace kiv
