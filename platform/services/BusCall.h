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

/// A method call as it arrived at a BusParty; good for as long as it is being answered.
struct BusCall
{
    struct Value
    {
        std::string name;
        VariantPtr value;
    };

    const GDBusMethodInfo& method; ///< from the party's interface description
    const char* sender;            ///< unique name of the caller, which the bus vouches for
    GVariant* arguments;           ///< tuple of the call's arguments; borrowed

    /// The arguments with the names that the interface description gives them. The one argument of a method that takes a
    /// structure is told by the members of that structure.
    std::vector<Value> Values() const;

    /// The kind of event that the call is about, as the subscriber store names it; the method's name for a call without a kind.
    std::string Event() const;

    /// The call on one line: event, then name=value with values in GVariant text form, so that no value breaks the line; what a
    /// terminal should not see is escaped.
    std::string Line() const;
};

} // namespace kiv

#endif
