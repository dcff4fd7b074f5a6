#include "RemoteObjects.h"

#include <utility>

namespace kiv::platform
{

namespace
{

constexpr char kBus[] = "org.freedesktop.DBus";
constexpr guint kRetryMs = 250;
constexpr int kPatienceMs = 10000; // with an answer

Variant Child(GVariant* container, gsize index)
{
    return {g_variant_get_child_value(container, index), g_variant_unref};
}

const char* StringOf(const Variant& variant)
{
    return g_variant_get_string(variant.get(), nullptr);
}

} // namespace

Timer StartTimer(guint milliseconds, GSourceFunc function, gpointer data)
{
    Timer timer(g_timeout_source_new(milliseconds));
    g_source_set_callback(timer.get(), function, data, nullptr);
    g_source_attach(timer.get(), g_main_context_get_thread_default());
    return timer;
}

// One call that is under way. Its caller may be gone when it was cancelled.
struct RemoteObjects::Question
{
    RemoteObjects* self;
    std::string path;
    TakeReply take;
};

// GDBus would print a critical message when the bus dies before it can send a match rule. Here the failure is ignored.
RemoteObjects::RemoteObjects(
    GDBusConnection* connection, const ServiceName& service, ServiceReport& report, std::function<void()> changed)
    : connection_(connection),
      service_(service),
      report_(report),
      changed_(std::move(changed)),
      subscription_(g_dbus_connection_signal_subscribe(
          connection, nullptr, nullptr, nullptr, nullptr, nullptr, G_DBUS_SIGNAL_FLAGS_NO_MATCH_RULE, OnSignal, this, nullptr)),
      cancellable_(g_cancellable_new())
{
    const std::string sender = std::string("sender='") + service_.name + "',";
    for (const char* const* interface = service_.interfaces; *interface != nullptr; ++interface)
        Match(sender + "member='PropertiesChanged',arg0='" + *interface + "'");
    Match(sender + "interface='org.freedesktop.DBus.ObjectManager'");
    Match(sender + "member='Updated'"); // settings of a connection
    Match(std::string("sender='org.freedesktop.DBus',member='NameOwnerChanged',arg0='") + service_.name + "'");
    Ask(kBus, "/", {kBus, "GetNameOwner", service_.name}, &RemoteObjects::TakeOwner);
}

RemoteObjects::~RemoteObjects()
{
    g_dbus_connection_signal_unsubscribe(connection_, subscription_);
    Forget();
    g_object_unref(cancellable_);
}

void RemoteObjects::Match(const std::string& rule)
{
    g_dbus_connection_call(connection_, kBus, "/org/freedesktop/DBus", kBus, "AddMatch",
        g_variant_new("(s)", ("type='signal'," + rule).c_str()), nullptr, G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr, nullptr);
}

void RemoteObjects::Ask(const char* destination, const std::string& path, const DetailCall& call, TakeReply take)
{
    ++pending_;
    GVariant* const arguments = call.argument != nullptr ? g_variant_new("(s)", call.argument) : nullptr;
    g_dbus_connection_call(connection_, destination, path.c_str(), call.interface, call.method, arguments, nullptr,
        G_DBUS_CALL_FLAGS_NO_AUTO_START, kPatienceMs, cancellable_, OnReply, new Question{this, path, take});
}

void RemoteObjects::OnReply(GObject* connection, GAsyncResult* result, gpointer asked)
{
    const std::unique_ptr<Question> question(static_cast<Question*>(asked));
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) reply = g_dbus_connection_call_finish(G_DBUS_CONNECTION(connection), result, &error);
    if (g_error_matches(error, G_IO_ERROR, G_IO_ERROR_CANCELLED) != FALSE)
        return;
    --question->self->pending_;
    (question->self->*question->take)(question->path, reply, error);
}

void RemoteObjects::TakeOwner(const std::string& /*path*/, GVariant* reply, const GError* /*error*/)
{
    SetOwner(reply != nullptr ? StringOf(Child(reply, 0)) : "");
}

void RemoteObjects::SetOwner(const std::string& owner)
{
    Forget();
    owner_ = owner;
    if (!owner_.empty())
        return AskForObjects();
    isKnown_ = true;
    changed_();
}

void RemoteObjects::AskForObjects()
{
    Ask(owner_.c_str(), service_.manager, {"org.freedesktop.DBus.ObjectManager", "GetManagedObjects", nullptr},
        &RemoteObjects::TakeObjects);
}

void RemoteObjects::TakeObjects(const std::string& /*path*/, GVariant* reply, const GError* error)
{
    const bool isDenied = g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_ACCESS_DENIED) != FALSE;
    if (reply == nullptr && !isDenied) // from one that is about to be there, or is stuck
    {
        const auto askAgain = [](gpointer self) -> gboolean
        {
            static_cast<RemoteObjects*>(self)->AskForObjects();
            return G_SOURCE_REMOVE;
        };
        retry_ = StartTimer(kRetryMs, askAgain, this);
        return;
    }
    isKnown_ = true;
    report_.presence = isDenied ? Presence::Denied : Presence::Present;
    const Variant objects = isDenied ? nullptr : Child(reply, 0);
    for (gsize i = 0; objects != nullptr && i < g_variant_n_children(objects.get()); ++i)
    {
        const Variant object = Child(objects.get(), i);
        TakeInterfaces(StringOf(Child(object.get(), 0)), Child(object.get(), 1).get());
    }
    changed_();
}

void RemoteObjects::TakeDetail(const std::string& path, GVariant* reply, const GError* /*error*/)
{
    const auto call = wanted_.find(path);
    if (call == wanted_.end())
        return;
    report_.objects[path]; // it was read, though perhaps with nothing in it
    if (reply != nullptr && call->second.argument != nullptr)
        TakeProperties(path, call->second.argument, Child(reply, 0).get());
    else if (reply != nullptr)
        TakeInterfaces(path, Child(reply, 0).get());
    changed_();
}

void RemoteObjects::TakeInterfaces(const std::string& path, GVariant* interfaces)
{
    for (gsize i = 0; i < g_variant_n_children(interfaces); ++i)
    {
        const Variant entry = Child(interfaces, i);
        const Variant name = Child(entry.get(), 0);
        if (g_strv_contains(service_.interfaces, StringOf(name)) != FALSE)
            TakeProperties(path, StringOf(name), Child(entry.get(), 1).get());
    }
}

void RemoteObjects::TakeProperties(const std::string& path, const char* interface, GVariant* properties)
{
    Properties& known = report_.objects[path][interface];
    for (gsize i = 0; i < g_variant_n_children(properties); ++i)
    {
        const Variant entry = Child(properties, i);
        const Variant name = Child(entry.get(), 0);
        if (g_strv_contains(kUsedProperties, StringOf(name)) != FALSE)
            known[StringOf(name)] = Variant(g_variant_get_variant(Child(entry.get(), 1).get()), g_variant_unref);
    }
}

void RemoteObjects::OnSignal(GDBusConnection* /*connection*/, const char* sender, const char* path, const char* /*interface*/,
    const char* signal, GVariant* arguments, gpointer self)
{
    auto& objects = *static_cast<RemoteObjects*>(self);
    if (sender == objects.owner_)
        return objects.TakeSignal(signal, path, arguments);
    const bool isOfBus = g_str_equal(sender, kBus) && g_str_equal(signal, "NameOwnerChanged");
    if (isOfBus && g_str_equal(StringOf(Child(arguments, 0)), objects.service_.name))
        objects.SetOwner(StringOf(Child(arguments, 2)));
}

void RemoteObjects::TakeSignal(const std::string& signal, const std::string& path, GVariant* arguments)
{
    const auto hasType = [arguments](const char* type) { return g_variant_is_of_type(arguments, G_VARIANT_TYPE(type)) != FALSE; };
    Objects& objects = report_.objects;
    if (report_.presence != Presence::Present) // what changed is in the answer that is on its way
        return;
    if (signal == "PropertiesChanged" && hasType("(sa{sv}as)") && objects.count(path) != 0)
    {
        TakeProperties(path, StringOf(Child(arguments, 0)), Child(arguments, 1).get());
    }
    else if (signal == "InterfacesAdded" && hasType("(oa{sa{sv}})"))
    {
        TakeInterfaces(StringOf(Child(arguments, 0)), Child(arguments, 1).get());
    }
    else if (signal == "InterfacesRemoved" && hasType("(oas)"))
    {
        const auto object = objects.find(StringOf(Child(arguments, 0)));
        const Variant interfaces = Child(arguments, 1);
        for (gsize i = 0; object != objects.end() && i < g_variant_n_children(interfaces.get()); ++i)
            object->second.erase(StringOf(Child(interfaces.get(), i)));
        if (object != objects.end() && object->second.empty())
            objects.erase(object);
    }
    else if (const auto call = wanted_.find(path); signal == "Updated" && call != wanted_.end())
    {
        return Ask(owner_.c_str(), path, call->second, &RemoteObjects::TakeDetail);
    }
    changed_();
}

void RemoteObjects::Want(Calls details)
{
    const Calls before = std::exchange(wanted_, std::move(details));
    for (const auto& [path, call] : before)
        if (wanted_.count(path) == 0)
            report_.objects.erase(path);
    for (const auto& [path, call] : wanted_)
        if (before.count(path) == 0)
            Ask(owner_.c_str(), path, call, &RemoteObjects::TakeDetail);
}

void RemoteObjects::Forget()
{
    g_cancellable_cancel(cancellable_);
    g_object_unref(std::exchange(cancellable_, g_cancellable_new()));
    retry_.reset();
    report_ = {};
    wanted_.clear();
    isKnown_ = false;
    pending_ = 0;
}

} // namespace kiv::platform
