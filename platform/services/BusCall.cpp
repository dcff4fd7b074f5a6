#include "BusCall.h"

#include <Visible.h>

namespace kiv
{
namespace
{

/// An annotation of the argument contains the names of a structure's members, since introspection data has no other place for them.
constexpr char kMembersAnnotation[] = "org.kiv.Members";

std::vector<std::string> ArgumentNames(const GDBusMethodInfo& method)
{
    std::vector<std::string> names;
    for (GDBusArgInfo** argument = method.in_args; argument && *argument; ++argument)
        names.emplace_back((*argument)->name);
    return names;
}

std::vector<std::string> Words(const char* text)
{
    g_auto(GStrv) words = g_strsplit(text, " ", 0);
    return {words, words + g_strv_length(words)};
}

} // namespace

std::vector<BusCall::Value> BusCall::Values() const
{
    VariantPtr values(g_variant_ref(arguments));
    std::vector<std::string> names = ArgumentNames(method);
    if (names.size() == 1)
    {
        if (const char* members = g_dbus_annotation_info_lookup(method.in_args[0]->annotations, kMembersAnnotation))
        {
            values.reset(g_variant_get_child_value(arguments, 0));
            names = Words(members);
        }
    }

    std::vector<Value> named;
    for (gsize i = 0; i < names.size() && i < g_variant_n_children(values.get()); ++i)
        named.push_back({names[i], VariantPtr(g_variant_get_child_value(values.get(), i))});
    return named;
}

std::string BusCall::Event() const
{
    const std::string name = method.name;
    return name == "activate" ? "activated" : name == "number_change" ? "number_changed" : name;
}

std::string BusCall::Line() const
{
    std::string line = Event();
    for (const Value& value : Values())
    {
        g_autofree char* text = g_variant_print(value.value.get(), FALSE);
        line += ' ' + value.name + '=' + platform::Visible(text);
    }
    return line;
}

} // namespace kiv
