#include "SharedConnection.h"

#include <atomic>
#include <unistd.h>

namespace
{

constexpr auto kBusClient = static_cast<GDBusConnectionFlags>(
    G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT | G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);

/// The number of connections being taken.
std::atomic<int> takers{0};

/// Runs before all other handlers of "closed". GDBus makes the shared connection so that it ends the process when it closes, and it
/// may close before its taker can change that.
gboolean OutliveBus(GSignalInvocationHint*, guint, const GValue* values, gpointer)
{
    if (takers > 0)
        g_dbus_connection_set_exit_on_close(G_DBUS_CONNECTION(g_value_get_object(values)), FALSE);
    return TRUE;
}

void BeginTaking()
{
    static const auto type = static_cast<GTypeClass*>(g_type_class_ref(G_TYPE_DBUS_CONNECTION)); // registers its signals
    static const gulong hook =
        g_signal_add_emission_hook(g_signal_lookup("closed", G_TYPE_FROM_CLASS(type)), 0, OutliveBus, nullptr, nullptr);
    static_cast<void>(hook);
    ++takers;
}

/// Whether this process lacks GDBus's thread, because a parent of the process took a connection.
bool IsForked(GError** error)
{
    static std::atomic<pid_t> user{0};
    pid_t first = 0;
    const pid_t self = getpid();
    if (user.compare_exchange_strong(first, self) || first == self)
        return false;
    g_set_error_literal(error, G_IO_ERROR, G_IO_ERROR_CLOSED, "The bus was used before the process was forked");
    return true;
}

/// Keeps a shared connection from ending the process when it closes.
/// @return whether not to try a private one: the shared one is alive, or timed out, or failed without a reason
bool IsSettled(GDBusConnection* shared, const GError* error)
{
    if (shared == nullptr)
        return error == nullptr || g_error_matches(error, G_IO_ERROR, G_IO_ERROR_TIMED_OUT);
    g_dbus_connection_set_exit_on_close(shared, FALSE);
    return !g_dbus_connection_is_closed(shared);
}

char* BusAddress()
{
    return g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr); // never null for the system bus
}

void EndRequest(GTask* task, GDBusConnection* connection, GError* error)
{
    if (connection == nullptr)
        g_task_return_error(task, error);
    else
        g_task_return_pointer(task, connection, g_object_unref);
}

void OwnMade(GObject*, GAsyncResult* result, gpointer data)
{
    g_autoptr(GTask) task = G_TASK(data);
    GError* error = nullptr;
    GDBusConnection* const own = g_dbus_connection_new_for_address_finish(result, &error);
    EndRequest(task, own, error);
}

void SharedTaken(GObject*, GAsyncResult* result, gpointer data)
{
    g_autoptr(GTask) task = G_TASK(data);
    g_autoptr(GError) error = nullptr;
    g_autoptr(GDBusConnection) shared = g_bus_get_finish(result, &error);
    if (IsSettled(shared, error))
        return EndRequest(
            task, static_cast<GDBusConnection*>(g_steal_pointer(&shared)), static_cast<GError*>(g_steal_pointer(&error)));
    g_autofree char* address = BusAddress();
    g_dbus_connection_new_for_address(address, kBusClient, nullptr, nullptr, OwnMade, g_steal_pointer(&task));
}

} // namespace

GDBusConnection* kiv::TakeConnection(GError** error)
{
    if (IsForked(error))
        return nullptr;
    BeginTaking();
    g_autoptr(GDBusConnection) shared = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, error);
    const bool isSettled = IsSettled(shared, *error);
    --takers;
    if (isSettled)
        return static_cast<GDBusConnection*>(g_steal_pointer(&shared));

    g_autofree char* address = BusAddress();
    GDBusConnection* const own =
        g_dbus_connection_new_for_address_sync(address, kBusClient, nullptr, nullptr, *error == nullptr ? error : nullptr);
    if (own != nullptr)
        g_clear_error(error);
    return own;
}

void kiv::RequestConnection(GAsyncReadyCallback callback, gpointer data)
{
    g_autoptr(GTask) task = g_task_new(nullptr, nullptr, callback, data);
    BeginTaking();
    GError* error = nullptr;
    if (IsForked(&error))
        return g_task_return_error(task, error);
    g_bus_get(G_BUS_TYPE_SYSTEM, nullptr, SharedTaken, g_steal_pointer(&task));
}

GDBusConnection* kiv::FinishConnection(GAsyncResult* result, GError** error)
{
    --takers;
    return static_cast<GDBusConnection*>(g_task_propagate_pointer(G_TASK(result), error));
}
