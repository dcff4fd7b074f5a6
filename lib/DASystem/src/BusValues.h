/// @file
/// The values of a call's body, and checks of what may be sent on the bus.
#ifndef KIV_BUSVALUES_H
#define KIV_BUSVALUES_H

#include "Log.h"

#include <gio/gio.h>

#include <initializer_list>

namespace kiv
{

/// One value of a body: a named text or a number.
struct Value
{
    Value(const char* textName, const char* value) : name(textName), text(value) {}
    Value(int value) : number(value) {}
    Value(gint64 value) : number(value), isWide(true) {}

    const char* name = nullptr; ///< null for a number
    const char* text = nullptr;
    gint64 number = 0;
    bool isWide = false; ///< "x" instead of "i"
};
using Values = std::initializer_list<Value>;

/// Whether no text is null; logs the first that is.
inline bool HaveTexts(const Place& here, Values values)
{
    for (const Value& value : values)
    {
        if (value.name != nullptr && value.text == nullptr)
        {
            KIV_ERROR_AT(here, "%s is null", value.name);
            return false;
        }
    }
    return true;
}

/// Whether every text is null or valid UTF-8; logs the first that is not. GLib would replace an invalid text by another.
inline bool AreUtf8(const Place& here, Values values)
{
    for (const Value& value : values)
    {
        if (value.text != nullptr && !g_utf8_validate(value.text, -1, nullptr))
        {
            KIV_ERROR_AT(here, "%s is not valid UTF-8", value.name);
            return false;
        }
    }
    return true;
}

/// Returns the values as a tuple, floating.
inline GVariant* Tuple(Values values)
{
    GVariantBuilder builder;
    g_variant_builder_init(&builder, G_VARIANT_TYPE_TUPLE);
    for (const Value& value : values)
    {
        if (value.name != nullptr)
            g_variant_builder_add(&builder, "s", value.text);
        else if (value.isWide)
            g_variant_builder_add(&builder, "x", value.number);
        else
            g_variant_builder_add(&builder, "i", static_cast<gint32>(value.number));
    }
    return g_variant_builder_end(&builder);
}

/// Returns the values as the one structure argument of the subscribers' methods, floating.
inline GVariant* StructureArgument(Values values)
{
    GVariant* const structure = Tuple(values);
    return g_variant_new_tuple(&structure, 1);
}

/// Returns the reason for a failure as text. GDBus sets no GError when a name, path or interface is malformed.
inline const char* Reason(const GError* error)
{
    return error == nullptr || error->message == nullptr ? "no reason given" : error->message;
}

} // namespace kiv

#endif
