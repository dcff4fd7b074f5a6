/// @file
/// The machine itself as the source of the device: its modems, its connections and its files.
#ifndef KIV_SOURCES_HOST_H
#define KIV_SOURCES_HOST_H

#include "HostFiles.h"
#include "LoopThread.h"
#include "RemoteObjects.h"
#include "Source.h"

#include <atomic>
#include <condition_variable>
#include <memory>
#include <mutex>

namespace kiv::platform
{

constexpr char kHostDescription[] = "the machine itself: its modems, connections and files";

/// Keeps the device as ModemManager, NetworkManager and BlueZ report it, on a thread of its own and over a bus connection of its
/// own. A child of fork() has no copy of the thread: it answers from the last snapshot before the fork.
class Host : public Source
{
public:
    /// Waits until everything was read, but at most two seconds. A service that has not answered by then counts as absent until
    /// it does.
    static Origin Open();

    Host();
    ~Host() override;

    void Settle() noexcept override;
    void Refresh(Device& device, Text Device::*text) override;
    void RefreshStorage(Device& device) override;
    bool RefreshPackage(Device& device, const std::string& id) override;

private:
    void Connect();
    void Disconnect();
    void Publish();
    static void OnClosed(GDBusConnection* connection, gboolean byPeer, GError* error, gpointer self);

    const HostFiles files_{""};
    std::shared_ptr<LoopThread> thread_;
    GCancellable* const cancellable_ = g_cancellable_new(); // of connecting

    std::atomic<bool> inUse_{false};

    // Only the thread uses these.
    GDBusConnection* connection_ = nullptr;
    Timer retry_;
    Reports reports_;
    std::unique_ptr<RemoteObjects> modems_, network_, bluetooth_;

    // These belong to the first snapshot.
    std::mutex mutex_;
    std::condition_variable isComplete_;
    Device latest_;
    bool complete_ = false;
    bool opened_ = false; ///< from then on, the thread puts the device in place itself
};

} // namespace kiv::platform

#endif
