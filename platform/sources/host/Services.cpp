#include "Services.h"

#include "ReportTables.h"

#include <list>

namespace kiv::platform
{

namespace
{

constexpr char kBus[] = "org.freedesktop.DBus";

// A service with an org.freedesktop.DBus.ObjectManager. Objects that this does not list are read by a method call each.
struct ServiceInfo
{
    const char* name;
    const char* manager; // path of the object manager
    Presence Reports::*presence;
    Objects Reports::*details;                             // the objects that it does not list
    std::set<std::string> (*find)(const Reports& reports); // their paths
    const char *interface, *method, *argument;             // of the call; null for a method without arguments
} kServices[] = {
    {kModemManager, "/org/freedesktop/ModemManager1", &Reports::modemManager, &Reports::sims, SimsOf,
        "org.freedesktop.DBus.Properties", "GetAll", "org.freedesktop.ModemManager1.Sim"},
    {kNetworkManager, "/org/freedesktop", &Reports::networkManager, &Reports::settings, ConnectionsOf,
        "org.freedesktop.NetworkManager.Settings.Connection", "GetSettings", nullptr},
    {kBluez, "/", &Reports::bluez, &Reports::adapters, [](const Reports&) { return std::set<std::string>(); }, nullptr, nullptr,
        nullptr},
};

// Also an unsigned number, or a flag.
void Read(GVariant* properties, const char* name, int& number)
{
    for (const char* const type : {"i", "u", "b"})
        g_variant_lookup(properties, name, type, &number);
}

void Read(GVariant* properties, const char* name, std::string& text)
{
    const char* value = nullptr;
    g_autofree const char** list = nullptr;
    if (g_variant_lookup(properties, name, "&s", &value) != FALSE || g_variant_lookup(properties, name, "&o", &value) != FALSE)
        text = value;
    if (g_variant_lookup(properties, name, "^a&s", &list) != FALSE || g_variant_lookup(properties, name, "^a&o", &list) != FALSE)
        text = *list != nullptr ? *list : "";
    if (text == "/") // path of an object that is not there
        text.clear();
}

void ReadProperties(GVariant* properties, const Interface& interface, Object& object)
{
    for (const auto& [name, member] : interface.properties)
        if (name != nullptr)
            std::visit([&, name = name](auto target) { Read(properties, name, object.*target); }, member);
}

// The objects of one service. (GDBusObjectManagerClient reads the objects of a service that came back in a call that blocks for up
// to 25 seconds, and prints a warning when that fails or the bus is gone.)
class Service
{
public:
    // GDBus would print a critical message when the bus dies before it can send a match rule. Here the failure is ignored.
    Service(GDBusConnection* connection, const ServiceInfo& info, Reports& reports, std::function<void()> changed)
        : connection_(connection),
          info_(info),
          reports_(reports),
          changed_(std::move(changed)),
          subscription_(g_dbus_connection_signal_subscribe(
              connection, nullptr, nullptr, nullptr, nullptr, nullptr, G_DBUS_SIGNAL_FLAGS_NO_MATCH_RULE, OnSignal, this, nullptr))
    {
        const std::string sender = std::string("sender='") + info.name + "',";
        Match(sender + "interface='org.freedesktop.DBus.ObjectManager'");
        Match(sender + "member='Updated'"); // settings of a connection
        Match(std::string("sender='org.freedesktop.DBus',member='NameOwnerChanged',arg0='") + info.name + "'");
        for (const Interface& interface : kInterfaces)
            if (g_str_equal(interface.service, info.name))
                Match(sender + "member='PropertiesChanged',arg0='" + interface.name + "'");
        Ask(kBus, "/", kBus, "GetNameOwner", info.name);
    }

    Service(const Service&) = delete;
    Service& operator=(const Service&) = delete;

    ~Service()
    {
        g_dbus_connection_signal_unsubscribe(connection_, subscription_);
        SetOwner("");
        g_object_unref(cancellable_);
    }

    bool IsComplete() const { return pending_ == 0; }

private:
    using Question = std::pair<Service*, std::string>;

    void Match(const std::string& rule)
    {
        g_dbus_connection_call(connection_, kBus, "/", kBus, "AddMatch", g_variant_new("(s)", ("type='signal'," + rule).c_str()),
            nullptr, G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr, nullptr);
    }

    // Forgets what the owner before reported, and what was asked of it.
    void SetOwner(const char* owner)
    {
        owner_ = owner;
        g_cancellable_cancel(cancellable_);
        g_object_unref(std::exchange(cancellable_, g_cancellable_new()));
        pending_ = 0;
        reports_.*info_.presence = Presence::Absent;
        for (const Interface& interface : kInterfaces)
            if (g_str_equal(interface.service, info_.name))
                (reports_.*interface.objects).clear();
        if (!owner_.empty())
            Ask(owner, info_.manager, "org.freedesktop.DBus.ObjectManager", "GetManagedObjects", nullptr);
    }

    // Waits without a limit: a service that is stuck answers when it goes on, and for one that dies the bus does.
    void Ask(const char* destination, const std::string& path, const char* interface, const char* method, const char* argument)
    {
        GVariant* const arguments = argument != nullptr ? g_variant_new("(s)", argument) : nullptr;
        g_dbus_connection_call(connection_, destination, path.c_str(), interface, method, arguments, nullptr,
            G_DBUS_CALL_FLAGS_NO_AUTO_START, G_MAXINT, cancellable_, OnReply, new Question(this, path));
        ++pending_;
    }

    static void OnReply(GObject* connection, GAsyncResult* result, gpointer data)
    {
        const std::unique_ptr<Question> question(static_cast<Question*>(data));
        const auto& [self, path] = *question;
        g_autoptr(GError) error = nullptr;
        g_autoptr(GVariant) reply = g_dbus_connection_call_finish(G_DBUS_CONNECTION(connection), result, &error);
        if (g_error_matches(error, G_IO_ERROR, G_IO_ERROR_CANCELLED) != FALSE) // and what asked may be gone
            return;
        --self->pending_;
        Presence& presence = self->reports_.*self->info_.presence;
        const bool isDenied = g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_ACCESS_DENIED) != FALSE;
        if (isDenied && presence == Presence::Absent)
            presence = Presence::Denied;
        if (isDenied && self->info_.details == &Reports::sims && self->asked_.count(path) != 0)
            self->reports_.sims[path] = Object(); // ready, although this user cannot learn whose it is
        if (reply != nullptr)
            self->Take(path, reply);
        self->Change();
    }

    static void OnSignal(GDBusConnection* /*connection*/, const char* sender, const char* path, const char* /*interface*/,
        const char* signal, GVariant* arguments, gpointer data)
    {
        auto& self = *static_cast<Service*>(data);
        const bool isOfBus = g_str_equal(sender, kBus) && g_str_equal(signal, "NameOwnerChanged");
        // What changes before the objects were read is in the answer that is on its way.
        const bool isOfOwner = sender == self.owner_ && self.reports_.*self.info_.presence == Presence::Present;
        if (!isOfBus && !isOfOwner)
            return;
        self.Take(path, arguments);
        self.Change();
    }

    // Takes over the body of a reply or a signal. Each has a type of its own.
    void Take(const std::string& path, GVariant* body)
    {
        const auto is = [body](const char* type) { return g_variant_is_of_type(body, G_VARIANT_TYPE(type)) != FALSE; };
        const char *name = nullptr, *owner = nullptr;
        g_autoptr(GVariant) values = nullptr;
        g_autoptr(GVariantIter) objects = nullptr;
        g_autofree const char** interfaces = nullptr;
        if (is("(s)") && owner_.empty()) // GetNameOwner
        {
            g_variant_get(body, "(&s)", &owner);
            SetOwner(owner);
        }
        else if (is("(sss)")) // NameOwnerChanged
        {
            g_variant_get(body, "(&s&s&s)", &name, nullptr, &owner);
            if (g_str_equal(name, info_.name))
                SetOwner(owner);
        }
        else if (is("(a{oa{sa{sv}}})")) // GetManagedObjects
        {
            reports_.*info_.presence = Presence::Present;
            g_variant_get(body, "(a{oa{sa{sv}}})", &objects);
            while (g_variant_iter_loop(objects, "{&o@a{sa{sv}}}", &name, &values) != FALSE)
                ReadObject(name, values, reports_);
        }
        else if (is("(oa{sa{sv}})")) // InterfacesAdded
        {
            g_variant_get(body, "(&o@a{sa{sv}})", &name, &values);
            ReadObject(name, values, reports_);
        }
        else if (is("(oas)")) // InterfacesRemoved
        {
            g_variant_get(body, "(&o^a&s)", &name, &interfaces);
            for (const Interface& interface : kInterfaces)
                if (g_strv_contains(interfaces, interface.name) != FALSE)
                    (reports_.*interface.objects).erase(name);
        }
        else if (is("(sa{sv}as)")) // PropertiesChanged
        {
            g_variant_get(body, "(&s@a{sv}as)", &name, &values, nullptr);
            for (const Interface& interface : kInterfaces)
                if (Objects& all = reports_.*interface.objects; g_str_equal(interface.name, name) && all.count(path) != 0)
                    ReadProperties(values, interface, all[path]);
        }
        else if (is("()")) // Updated
        {
            asked_.erase(path);
        }
        else if (is("(a{sv})") && asked_.count(path) != 0) // GetAll
        {
            g_variant_get(body, "(@a{sv})", &values);
            for (const Interface& interface : kInterfaces)
                if (interface.objects == info_.details)
                    ReadProperties(values, interface, (reports_.*info_.details)[path] = Object());
        }
        else if (is("(a{sa{sv}})") && asked_.count(path) != 0) // GetSettings, which leaves out what has its default
        {
            g_variant_get(body, "(@a{sa{sv}})", &values);
            (reports_.*info_.details).erase(path);
            ReadObject(path, values, reports_);
        }
    }

    // Reads the details that are not there yet, and forgets those that are no longer used.
    void Change()
    {
        const std::set<std::string> used = info_.find(reports_);
        for (const std::string& path : asked_)
            if (used.count(path) == 0)
                (reports_.*info_.details).erase(path);
        for (const std::string& path : used)
            if (asked_.count(path) == 0 && g_variant_is_object_path(path.c_str()) != FALSE)
                Ask(owner_.c_str(), path, info_.interface, info_.method, info_.argument);
        asked_ = used;
        changed_();
    }

    GDBusConnection* const connection_;
    const ServiceInfo& info_;
    Reports& reports_;
    const std::function<void()> changed_;
    const guint subscription_;

    std::string owner_;                               // unique name on the bus; empty while there is none
    GCancellable* cancellable_ = g_cancellable_new(); // of what was asked of the owner
    unsigned pending_ = 0;                            // answers
    std::set<std::string> asked_;                     // paths of details
};

} // namespace

void ReadObject(const std::string& path, GVariant* interfaces, Reports& reports)
{
    for (const Interface& interface : kInterfaces)
    {
        g_autoptr(GVariant) properties = nullptr;
        if (g_variant_lookup(interfaces, interface.name, "@a{sv}", &properties) != FALSE)
            ReadProperties(properties, interface, (reports.*interface.objects)[path]);
    }
}

std::shared_ptr<void> FollowServices(
    GDBusConnection* connection, Reports& reports, const std::function<void(bool isComplete)>& changed)
{
    const auto services = std::make_shared<std::list<Service>>();
    const auto tell = [&all = *services, changed]
    { changed(std::all_of(all.begin(), all.end(), [](const Service& service) { return service.IsComplete(); })); };
    for (const ServiceInfo& info : kServices)
        services->emplace_back(connection, info, reports, tell);
    return services;
}

} // namespace kiv::platform
