#ifndef NAMEBOOK_H
#define NAMEBOOK_H

#include <gio/gio.h>

#include <functional>
#include <memory>
#include <string>

namespace kiv
{

/// The subscription service's notes on the bus names in the subscriber store: the bus of the unique names, and the user who
/// subscribed with each name. They must outlive the service and the store has no place for them, so they are in a small file next
/// to the store. A book that cannot be read counts as empty.
class NameBook
{
public:
    /// Opens the book next to that store.
    explicit NameBook(const std::string& storePath);

    /// Returns the id of the bus of the unique names; empty if unknown.
    std::string Bus() const;

    /// Records the id of the bus. Throws CallError.
    void SetBus(const std::string& id);

    /// Whether this user was the last to subscribe with that name.
    bool IsOf(const std::string& name, guint32 user) const;

    /// Records that the user subscribed with the name, unless that is recorded. Throws CallError.
    /// @param isInUse  whether a name has subscriptions; names without any are removed
    void SetUser(const std::string& name, guint32 user, const std::function<bool(const std::string&)>& isInUse);

private:
    struct Deleter
    {
        void operator()(GKeyFile* file) const { g_key_file_unref(file); }
    };

    void Save() const;

    std::string path_;
    std::unique_ptr<GKeyFile, Deleter> file_;
};

} // namespace kiv

#endif
