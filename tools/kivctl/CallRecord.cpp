#include "CallRecord.h"

namespace
{

Value ToValue(GVariant* value)
{
    if (g_variant_is_of_type(value, G_VARIANT_TYPE_STRING))
        return std::string(g_variant_get_string(value, nullptr));
    if (g_variant_is_of_type(value, G_VARIANT_TYPE_INT32))
        return std::int64_t{g_variant_get_int32(value)};
    if (g_variant_is_of_type(value, G_VARIANT_TYPE_INT64))
        return std::int64_t{g_variant_get_int64(value)};
    g_autofree char* text = g_variant_print(value, TRUE);
    return std::string(text);
}

} // namespace

Record CallRecord(const kiv::BusCall& call)
{
    Record record{{"event", call.Event()}};
    for (const auto& [name, value] : call.Values())
        record.push_back({name, ToValue(value.get())});
    return record;
}
