#include "Host.h"

#include "HostFiles.h"
#include "Locked.h"
#include "LoopThread.h"
#include "Services.h"
#include "State.h"

#include <chrono>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <utility>

namespace kiv::platform
{

namespace
{

constexpr std::chrono::seconds kPatience{2};
constexpr guint kRetryMs = 500;

// Keeps the device as the services on the bus report it, on a thread of its own and over a bus connection of its own. A child of
// fork() has no copy of the thread: it answers from the last snapshot before the fork.
class Host : public HostFiles
{
public:
    Host()
    {
        files_.description = kHostDescription;
        ReadAll(files_);
        latest_ = files_;
        Describe({}, latest_);
    }

    ~Host() override { g_object_unref(cancellable_); }

    static Origin Open()
    {
        const auto host = std::make_shared<Host>();
        host->thread_ = LoopThread::Start({[host] { host->Connect(); }, [host] { host->Disconnect(); }});
        std::unique_lock lock(host->mutex_);
        host->isComplete_.wait_for(lock, kPatience, [&] { return host->complete_; });
        host->opened_ = true;
        return {host->latest_, host};
    }

    void Settle() noexcept override
    {
        if (!thread_->IsHere() || Locked(TheState())->source.get() == this)
            return;
        g_cancellable_cancel(cancellable_);
        thread_->End();
    }

private:
    void Connect()
    {
        constexpr auto kFlags = static_cast<GDBusConnectionFlags>(
            G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT | G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);
        g_autofree char* address = g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
        connection_ = g_dbus_connection_new_for_address_sync(address, kFlags, nullptr, cancellable_, nullptr);
        if (connection_ == nullptr)
        {
            TryAgain();
            return Publish(true);
        }
        g_signal_connect(connection_, "closed", G_CALLBACK(OnClosed), this);
        services_ = FollowServices(connection_, reports_, [this](bool isComplete) { Publish(isComplete); });
    }

    void Disconnect()
    {
        services_.reset();
        g_clear_object(&connection_);
    }

    static void OnClosed(GDBusConnection* /*connection*/, gboolean /*byPeer*/, GError* /*error*/, Host* self)
    {
        self->Disconnect();
        self->Connect();
    }

    // In half a second. When the thread ends, nothing comes of it.
    void TryAgain()
    {
        const auto again = [](gpointer data) -> gboolean
        {
            auto& self = *static_cast<Host*>(data);
            self.connection_ == nullptr ? self.Connect() : self.Publish(true);
            return G_SOURCE_REMOVE;
        };
        g_autoptr(GSource) timer = g_timeout_source_new(kRetryMs);
        g_source_set_callback(timer, again, this, nullptr);
        g_source_attach(timer, g_main_context_get_thread_default());
    }

    void Publish(bool isComplete)
    {
        Device next = files_;
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
            if (state.source.get() != this) // which it is about to be, or no longer is
                return TryAgain();
            changes = state.Replace(std::move(next));
        }
        state.notifier.Deliver(changes);
    }

    std::shared_ptr<LoopThread> thread_;
    GCancellable* const cancellable_ = g_cancellable_new(); // of connecting
    Device files_;                                          // without what services report

    // Only the thread uses these.
    GDBusConnection* connection_ = nullptr;
    Reports reports_;
    std::shared_ptr<void> services_;

    // These belong to the first snapshot.
    std::mutex mutex_;
    std::condition_variable isComplete_;
    Device latest_;
    bool complete_ = false;
    bool opened_ = false; // from then on, the thread puts the device in place itself
};

} // namespace

Origin OpenHost()
{
    return Host::Open();
}

} // namespace kiv::platform
