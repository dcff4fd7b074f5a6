#ifndef BUSCALL_H
#define BUSCALL_H

#include <gio/gio.h>

#include <memory>
#include <string>
#include <vector>

namespace kiv
{

struct VariantDeleter
{
    void operator()(GVariant* variant) const { g_variant_unref(variant); }
};
using VariantPtr = std::unique_ptr<GVariant, VariantDeleter>;

/// A method call that arrived at a BusParty; valid until it is answered.
struct BusCall
{
    struct Value
    {
        std::string name;
        VariantPtr value;
    };

    const GDBusMethodInfo& method; ///< from the party's interface description
    const char* sender;            ///< unique name of the caller, set by the bus
    GVariant* arguments;           ///< tuple of the call's arguments; borrowed

    /// Returns the arguments with their names from the interface description. For a method with one structure as its argument,
    /// returns the members of the structure.
    std::vector<Value> Values() const;

    /// Returns the event's kind as in the subscriber store, or the method's name for a call without a kind.
    std::string Event() const;

    /// Returns the call on one line: event, then name=value with values in GVariant text form, so that no value breaks the line.
    /// Characters that could harm a terminal are escaped.
    std::string Line() const;
};

} // namespace kiv

#endif
