#include "Host.h"

#include "Locked.h"
#include "State.h"
#include "dlog.h"

#include <chrono>
#include <exception>
#include <utility>

namespace kiv::platform
{

namespace
{

constexpr std::chrono::seconds kPatience{2};
constexpr guint kReconnectMs = 500;

constexpr ServiceName kModemManager{"org.freedesktop.ModemManager1", "/org/freedesktop/ModemManager1",
    {"org.freedesktop.ModemManager1.Modem", "org.freedesktop.ModemManager1.Modem.Modem3gpp",
        "org.freedesktop.ModemManager1.Modem.Messaging", "org.freedesktop.ModemManager1.Sim"}};
constexpr ServiceName kNetworkManager{"org.freedesktop.NetworkManager", "/org/freedesktop",
    {"org.freedesktop.NetworkManager", "org.freedesktop.NetworkManager.Device", "org.freedesktop.NetworkManager.Connection.Active",
        "gsm"}};
constexpr ServiceName kBluez{"org.bluez", "/", {"org.bluez.Adapter1"}};

} // namespace

Host::Host() = default;

Host::~Host()
{
    g_object_unref(cancellable_);
}

Origin Host::Open()
{
    const auto host = std::make_shared<Host>();
    host->files_.Read(host->latest_);
    Describe({}, host->latest_);
    host->thread_ = LoopThread::Start({[host] { host->Connect(); }, [host] { host->Disconnect(); }, [host] { host->Publish(); }});

    std::unique_lock lock(host->mutex_);
    host->isComplete_.wait_for(lock, kPatience, [&] { return host->complete_; });
    host->opened_ = true;
    return {host->latest_, host};
}

void Host::Settle() noexcept
try
{
    if (!thread_->IsHere())
        return;
    if (Locked(TheState())->source.get() == this)
    {
        if (!inUse_.exchange(true)) // what changed before that has not been put in place
            thread_->Poke();
        return;
    }
    g_cancellable_cancel(cancellable_);
    thread_->End();
}
catch (const std::exception& error)
{
    __dlog_print(LOG_ID_SYSTEM, DLOG_ERROR, "KIV_PLATFORM", "the machine is not followed: %s\n", error.what());
}

void Host::Refresh(Device& device, Text Device::*text)
{
    files_.Read(device, text);
}

void Host::RefreshStorage(Device& device)
{
    files_.ReadStorage(device);
}

bool Host::RefreshPackage(Device& device, const std::string& id)
{
    return files_.ReadPackage(device, id);
}

void Host::Connect()
{
    constexpr auto kFlags = static_cast<GDBusConnectionFlags>(
        G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT | G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);
    g_autofree char* address = g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SYSTEM, cancellable_, nullptr);
    connection_ =
        address == nullptr ? nullptr : g_dbus_connection_new_for_address_sync(address, kFlags, nullptr, cancellable_, nullptr);
    if (connection_ != nullptr)
    {
        g_dbus_connection_set_exit_on_close(connection_, FALSE);
        g_signal_connect(connection_, "closed", G_CALLBACK(OnClosed), this);
        const auto publish = [this] { Publish(); };
        modems_ = std::make_unique<RemoteObjects>(connection_, kModemManager, reports_.modems, publish);
        network_ = std::make_unique<RemoteObjects>(connection_, kNetworkManager, reports_.network, publish);
        bluetooth_ = std::make_unique<RemoteObjects>(connection_, kBluez, reports_.bluetooth, publish);
        return;
    }
    const auto connect = [](gpointer self) -> gboolean
    {
        static_cast<Host*>(self)->Connect();
        return G_SOURCE_REMOVE;
    };
    retry_ = StartTimer(kReconnectMs, connect, this);
    Publish();
}

void Host::Disconnect()
{
    retry_.reset();
    if (connection_ == nullptr)
        return;
    modems_.reset();
    network_.reset();
    bluetooth_.reset();
    g_signal_handlers_disconnect_by_data(connection_, this);
    g_dbus_connection_close_sync(connection_, nullptr, nullptr);
    g_clear_object(&connection_);
}

void Host::OnClosed(GDBusConnection* /*connection*/, gboolean /*byPeer*/, GError* /*error*/, gpointer self)
{
    auto& host = *static_cast<Host*>(self);
    host.Disconnect();
    host.Connect();
}

void Host::Publish()
{
    const bool isComplete = connection_ == nullptr || [this]
    {
        modems_->Want(DetailsOfModems(reports_.modems.objects));
        network_->Want(DetailsOfNetwork(reports_.network.objects));
        return modems_->IsComplete() && network_->IsComplete() && bluetooth_->IsComplete();
    }();
    Device next;
    next.description = kHostDescription;
    files_.Read(next);
    Describe(reports_, next);
    {
        const std::lock_guard lock(mutex_);
        complete_ = isComplete;
        latest_ = next;
        if (!opened_)
            return isComplete_.notify_all();
    }

    State& state = TheState();
    Changes changes;
    {
        const Locked lock(state);
        if (state.source.get() != this)
            return;
        changes = state.Replace(std::move(next));
    }
    state.notifier.Deliver(changes);
}

} // namespace kiv::platform
