#include "BusMonitor.h"

#include <algorithm>
#include <chrono>
#include <condition_variable>
#include <mutex>
#include <stdexcept>
#include <utility>

namespace kiv::bench
{

namespace
{

constexpr char kMarker[] = "org.example.Marker";

std::string OrNothing(const char* text)
{
    return text == nullptr ? "-" : text;
}

std::string Line(GDBusMessage* message)
{
    std::string line =
        std::to_string(g_dbus_message_get_message_type(message)) + ' ' + std::to_string(g_dbus_message_get_flags(message));
    for (const char* const field :
        {g_dbus_message_get_sender(message), g_dbus_message_get_destination(message), g_dbus_message_get_path(message),
            g_dbus_message_get_interface(message), g_dbus_message_get_member(message), g_dbus_message_get_error_name(message)})
        line += ' ' + OrNothing(field);
    if (GVariant* const body = g_dbus_message_get_body(message))
    {
        const g_autofree char* text = g_variant_print(body, TRUE);
        line.append(" ").append(text);
    }
    static GRegex* const uniqueName = g_regex_new(":1\\.[0-9]+", G_REGEX_OPTIMIZE, static_cast<GRegexMatchFlags>(0), nullptr);
    const g_autofree char* same =
        g_regex_replace_literal(uniqueName, line.c_str(), -1, 0, ":1.*", static_cast<GRegexMatchFlags>(0), nullptr);
    return same;
}

} // namespace

struct BusMonitor::Seen
{
    std::mutex mutex;
    std::condition_variable marked;
    bool isMarked = false;
    std::vector<std::string> lines;
};

BusMonitor::BusMonitor(const PrivateSystemBus& bus)
    : shared_(bus.Shared()), seen_(std::make_shared<Seen>()), connection_(bus.Connect())
{
    g_dbus_connection_add_filter(connection_.get(), Filter, new std::shared_ptr<Seen>(seen_),
        [](gpointer seen) { delete static_cast<std::shared_ptr<Seen>*>(seen); });
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) reply = g_dbus_connection_call_sync(connection_.get(), "org.freedesktop.DBus", "/org/freedesktop/DBus",
        "org.freedesktop.DBus.Monitoring", "BecomeMonitor", g_variant_new("(asu)", nullptr, 0U), nullptr, G_DBUS_CALL_FLAGS_NONE,
        -1, nullptr, &error);
    if (reply == nullptr)
        throw std::runtime_error(error->message);
    AwaitMarker();
}

BusMonitor::~BusMonitor()
{
    g_dbus_connection_close_sync(connection_.get(), nullptr, nullptr);
}

/// Runs on the thread that reads the connection. A monitor answers nothing of what it sees, so GDBus gets none of it but the reply
/// to its own call.
GDBusMessage* BusMonitor::Filter(GDBusConnection* connection, GDBusMessage* message, gboolean incoming, gpointer data)
{
    Seen& seen = **static_cast<std::shared_ptr<Seen>*>(data);
    const char* const destination = g_dbus_message_get_destination(message);
    if (incoming == FALSE || g_strcmp0(destination, g_dbus_connection_get_unique_name(connection)) == 0)
        return message;
    const std::lock_guard<std::mutex> lock(seen.mutex);
    if (g_strcmp0(g_dbus_message_get_interface(message), kMarker) == 0)
    {
        seen.isMarked = true;
        seen.marked.notify_all();
    }
    else
        seen.lines.push_back(Line(message));
    g_object_unref(message);
    return nullptr;
}

/// What was sent before the marker has been seen when the marker is.
void BusMonitor::AwaitMarker()
{
    g_dbus_connection_emit_signal(shared_, nullptr, "/", kMarker, "Marker", nullptr, nullptr);
    std::unique_lock<std::mutex> lock(seen_->mutex);
    if (!seen_->marked.wait_for(lock, std::chrono::seconds(30), [&] { return seen_->isMarked; }))
        throw std::runtime_error("the monitor sees nothing");
    seen_->isMarked = false;
}

std::vector<std::string> BusMonitor::During(const std::function<void()>& operation)
{
    AwaitMarker();
    seen_->lines.clear();
    operation();
    AwaitMarker();
    const std::lock_guard<std::mutex> lock(seen_->mutex);
    return std::exchange(seen_->lines, {});
}

void CompareMessages(Table& table, const PrivateSystemBus& bus, const std::string& item, Order order,
    const std::function<void()>& library, const std::function<void()>& bare)
{
    if (!table.Wants(item))
        return;
    BusMonitor monitor(bus);
    std::vector<std::string> ours = monitor.During(library), theirs = monitor.During(bare);
    if (order == Order::Any)
    {
        std::sort(ours.begin(), ours.end());
        std::sort(theirs.begin(), theirs.end());
    }
    const auto [left, right] = std::mismatch(ours.begin(), ours.end(), theirs.begin(), theirs.end());
    const bool isEqual = left == ours.end() && right == theirs.end();
    std::string remark = "bare " + std::to_string(theirs.size());
    if (!isEqual)
        remark += "; first difference: " + (left == ours.end() ? "nothing" : *left) + " | " +
                  (right == theirs.end() ? "nothing" : *right);
    const auto count = static_cast<double>(ours.size());
    table.Add({item, "equal", isEqual ? Outcome::Met : Outcome::Missed, count, count, count, " msgs", remark});
}

} // namespace kiv::bench
