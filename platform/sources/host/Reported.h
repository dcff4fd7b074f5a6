#ifndef KIV_SOURCES_REPORTED_H
#define KIV_SOURCES_REPORTED_H

#include "Reports.h"

namespace kiv::platform
{

/// One interface of one object. What was not reported, or is of another type, is the fallback.
class Reported
{
public:
    Reported(const Objects& objects, const std::string& path, const char* interface)
    {
        const auto object = objects.find(path);
        if (object == objects.end())
            return;
        const auto found = object->second.find(interface);
        properties_ = found == object->second.end() ? nullptr : &found->second;
    }

    explicit operator bool() const { return properties_ != nullptr; }

    int Number(const char* name, int fallback = 0) const
    {
        GVariant* const value = Find(name);
        if (value != nullptr && g_variant_is_of_type(value, G_VARIANT_TYPE_INT32) != FALSE)
            return g_variant_get_int32(value);
        if (value != nullptr && g_variant_is_of_type(value, G_VARIANT_TYPE_UINT32) != FALSE)
            return static_cast<int>(g_variant_get_uint32(value));
        return fallback;
    }

    bool Flag(const char* name) const
    {
        GVariant* const value = Find(name);
        return value != nullptr && g_variant_is_of_type(value, G_VARIANT_TYPE_BOOLEAN) != FALSE &&
               g_variant_get_boolean(value) != FALSE;
    }

    /// A text or path, or the first of an array of those; empty when there is none.
    std::string Text(const char* name) const
    {
        GVariant* const value = Find(name);
        if (value == nullptr)
            return {};
        if (g_variant_is_of_type(value, G_VARIANT_TYPE_STRING) != FALSE ||
            g_variant_is_of_type(value, G_VARIANT_TYPE_OBJECT_PATH) != FALSE)
            return g_variant_get_string(value, nullptr);
        const bool isList = g_variant_is_of_type(value, G_VARIANT_TYPE_STRING_ARRAY) != FALSE ||
                            g_variant_is_of_type(value, G_VARIANT_TYPE_OBJECT_PATH_ARRAY) != FALSE;
        if (!isList || g_variant_n_children(value) == 0)
            return {};
        const Variant first(g_variant_get_child_value(value, 0), g_variant_unref);
        return g_variant_get_string(first.get(), nullptr);
    }

private:
    GVariant* Find(const char* name) const
    {
        if (properties_ == nullptr)
            return nullptr;
        const auto found = properties_->find(name);
        return found == properties_->end() ? nullptr : found->second.get();
    }

    const Properties* properties_ = nullptr;
};

} // namespace kiv::platform

#endif
