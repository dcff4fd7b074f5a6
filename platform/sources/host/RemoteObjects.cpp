#include "RemoteObjects.h"

#include <utility>

namespace kiv::platform
{

namespace
{

constexpr char kManager[] = "org.freedesktop.DBus.ObjectManager";
constexpr char kProperties[] = "org.freedesktop.DBus.Properties";
constexpr guint kRetryMs = 250;
constexpr int kPatienceMs = 10000; // with an answer

Variant Own(GVariant* variant)
{
    return {variant, g_variant_unref};
}

} // namespace

// One call that is under way; the owner of the name that it was sent to may change meanwhile.
struct RemoteObjects::Question
{
    RemoteObjects* self;
    std::string path;
};

RemoteObjects::RemoteObjects(
    GDBusConnection* connection, const ServiceName& service, ServiceReport& report, std::function<void()> changed)
    : connection_(connection), service_(service), report_(report), changed_(std::move(changed))
{
    watch_ = g_bus_watch_name_on_connection(
        connection_, service_.name, G_BUS_NAME_WATCHER_FLAGS_NONE, OnAppeared, OnVanished, this, nullptr);
}

RemoteObjects::~RemoteObjects()
{
    g_bus_unwatch_name(watch_);
    Forget();
}

void RemoteObjects::OnAppeared(GDBusConnection* /*connection*/, const char* /*name*/, const char* owner, gpointer self)
{
    auto& objects = *static_cast<RemoteObjects*>(self);
    objects.Forget();
    objects.owner_ = owner;
    objects.cancellable_ = g_cancellable_new();
    for (const char* const* interface = objects.service_.interfaces; *interface != nullptr; ++interface)
        objects.Subscribe(kProperties, "PropertiesChanged", nullptr, *interface);
    objects.Subscribe(kManager, "InterfacesAdded", objects.service_.manager, nullptr);
    objects.Subscribe(kManager, "InterfacesRemoved", objects.service_.manager, nullptr);
    objects.Subscribe(nullptr, "Updated", nullptr, nullptr); // of a connection's settings
    objects.Ask(objects.service_.manager, {kManager, "GetManagedObjects", nullptr});
}

void RemoteObjects::OnVanished(GDBusConnection* /*connection*/, const char* /*name*/, gpointer self)
{
    auto& objects = *static_cast<RemoteObjects*>(self);
    objects.Forget();
    objects.isKnown_ = true;
    objects.changed_();
}

void RemoteObjects::Subscribe(const char* interface, const char* signal, const char* path, const char* argument)
{
    subscriptions_.push_back(g_dbus_connection_signal_subscribe(
        connection_, owner_.c_str(), interface, signal, path, argument, G_DBUS_SIGNAL_FLAGS_NONE, OnSignal, this, nullptr));
}

void RemoteObjects::Ask(const std::string& path, const DetailCall& call)
{
    ++pending_;
    GVariant* const arguments = call.argument != nullptr ? g_variant_new("(s)", call.argument) : nullptr;
    g_dbus_connection_call(connection_, owner_.c_str(), path.c_str(), call.interface, call.method, arguments, nullptr,
        G_DBUS_CALL_FLAGS_NO_AUTO_START, kPatienceMs, cancellable_, OnReply, new Question{this, path});
}

void RemoteObjects::OnReply(GObject* connection, GAsyncResult* result, gpointer asked)
{
    const std::unique_ptr<Question> question(static_cast<Question*>(asked));
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) reply = g_dbus_connection_call_finish(G_DBUS_CONNECTION(connection), result, &error);
    if (g_error_matches(error, G_IO_ERROR, G_IO_ERROR_CANCELLED) != FALSE) // and who asked may be gone
        return;

    RemoteObjects& self = *question->self;
    --self.pending_;
    if (question->path != self.service_.manager)
    {
        if (self.wanted_.count(question->path) == 0)
            return;
        self.report_.objects[question->path]; // it was read, though perhaps with nothing in it
        if (reply != nullptr)
            self.Take(question->path, reply);
    }
    else if (reply != nullptr)
    {
        self.isKnown_ = true;
        self.report_.presence = Presence::Present;
        self.Take(question->path, reply);
    }
    else if (g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_ACCESS_DENIED) != FALSE)
    {
        self.isKnown_ = true;
        self.report_.presence = Presence::Denied;
    }
    else // one that is about to be there, or to be gone
    {
        self.retry_ = g_timeout_source_new(kRetryMs);
        g_source_set_callback(self.retry_, AskAgain, &self, nullptr);
        g_source_attach(self.retry_, g_main_context_get_thread_default());
        return;
    }
    self.changed_();
}

gboolean RemoteObjects::AskAgain(gpointer self)
{
    auto& objects = *static_cast<RemoteObjects*>(self);
    g_source_unref(std::exchange(objects.retry_, nullptr));
    objects.Ask(objects.service_.manager, {kManager, "GetManagedObjects", nullptr});
    return G_SOURCE_REMOVE;
}

// Takes a reply over: the objects of a manager, the groups of a connection, or the properties of an interface.
void RemoteObjects::Take(const std::string& path, GVariant* reply)
{
    const Variant content = Own(g_variant_get_child_value(reply, 0));
    GVariantIter entries;
    const char* key = nullptr;
    GVariant* value = nullptr;
    g_variant_iter_init(&entries, content.get());
    if (g_variant_is_of_type(content.get(), G_VARIANT_TYPE("a{oa{sa{sv}}}")) != FALSE)
    {
        while (g_variant_iter_loop(&entries, "{&o@a{sa{sv}}}", &key, &value) != FALSE)
        {
            const Variant object = Own(g_variant_ref_sink(g_variant_new("(@a{sa{sv}})", value)));
            Take(key, object.get());
        }
    }
    else if (g_variant_is_of_type(content.get(), G_VARIANT_TYPE("a{sa{sv}}")) != FALSE)
    {
        while (g_variant_iter_loop(&entries, "{&s@a{sv}}", &key, &value) != FALSE)
            if (Matters(key))
                TakeProperties(path, key, value);
    }
    else if (const auto call = wanted_.find(path); call != wanted_.end())
    {
        TakeProperties(path, call->second.argument, content.get());
    }
}

void RemoteObjects::TakeProperties(const std::string& path, const char* interface, GVariant* properties)
{
    Properties& known = report_.objects[path][interface];
    GVariantIter entries;
    const char* name = nullptr;
    GVariant* value = nullptr;
    g_variant_iter_init(&entries, properties);
    while (g_variant_iter_next(&entries, "{&sv}", &name, &value) != FALSE)
        known[name] = Own(value);
}

void RemoteObjects::OnSignal(GDBusConnection* /*connection*/, const char* /*sender*/, const char* path, const char* /*interface*/,
    const char* name, GVariant* arguments, gpointer self)
{
    auto& objects = *static_cast<RemoteObjects*>(self);
    const std::string signal = name;
    const auto hasType = [arguments](const char* type) { return g_variant_is_of_type(arguments, G_VARIANT_TYPE(type)) != FALSE; };
    Objects& known = objects.report_.objects;
    const char* object = nullptr;
    if (objects.report_.presence != Presence::Present) // what changed is in the answer that is on its way
        return;

    if (signal == "PropertiesChanged" && hasType("(sa{sv}as)") && known.count(path) != 0)
    {
        const char* interface = nullptr;
        GVariant* changed = nullptr;
        g_autofree const char** invalidated = nullptr;
        g_variant_get(arguments, "(&s@a{sv}^a&s)", &interface, &changed, &invalidated);
        const Variant owner = Own(changed);
        objects.TakeProperties(path, interface, changed);
        for (const char** each = invalidated; *each != nullptr; ++each)
            known[path][interface].erase(*each);
    }
    else if (signal == "InterfacesAdded" && hasType("(oa{sa{sv}})"))
    {
        GVariant* interfaces = nullptr;
        g_variant_get(arguments, "(&o@a{sa{sv}})", &object, &interfaces);
        const Variant wrapped = Own(g_variant_ref_sink(g_variant_new("(@a{sa{sv}})", interfaces)));
        g_variant_unref(interfaces);
        objects.Take(object, wrapped.get());
    }
    else if (signal == "InterfacesRemoved" && hasType("(oas)"))
    {
        g_autofree const char** interfaces = nullptr;
        g_variant_get(arguments, "(&o^a&s)", &object, &interfaces);
        for (const char** each = interfaces; *each != nullptr; ++each)
            known[object].erase(*each);
        if (known[object].empty())
            known.erase(object);
    }
    else if (const auto call = objects.wanted_.find(path); signal == "Updated" && call != objects.wanted_.end())
    {
        objects.Ask(path, call->second);
        return;
    }
    objects.changed_();
}

void RemoteObjects::Want(Calls details)
{
    const Calls before = std::exchange(wanted_, std::move(details));
    for (const auto& [path, call] : before)
        if (wanted_.count(path) == 0)
            report_.objects.erase(path);
    for (const auto& [path, call] : wanted_)
        if (before.count(path) == 0)
            Ask(path, call);
}

void RemoteObjects::Forget()
{
    for (const guint subscription : std::exchange(subscriptions_, {}))
        g_dbus_connection_signal_unsubscribe(connection_, subscription);
    if (cancellable_ != nullptr)
        g_cancellable_cancel(cancellable_);
    g_clear_object(&cancellable_);
    if (retry_ != nullptr)
        g_source_destroy(retry_);
    g_clear_pointer(&retry_, g_source_unref);
    report_ = {};
    wanted_.clear();
    owner_.clear();
    isKnown_ = false;
    pending_ = 0;
}

bool RemoteObjects::Matters(const char* interface) const
{
    return g_strv_contains(service_.interfaces, interface) != FALSE;
}

} // namespace kiv::platform
