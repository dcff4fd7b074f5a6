#ifndef NAMEBOOK_H
#define NAMEBOOK_H

#include <gio/gio.h>

#include <functional>
#include <memory>
#include <string>

namespace kiv
{

/// What the subscription service knows of the bus names in the subscriber store, in a small file beside the store: on which bus the
/// unique names are, and which user subscribed under each name. Both have to outlive the service, and the store has no place
/// for them. A book that cannot be read is an empty one.
class NameBook
{
public:
    /// Opens the book beside that store.
    explicit NameBook(const std::string& storePath);

    /// The id of the bus on which the unique names are; empty when unknown.
    std::string Bus() const;

    /// Writes the id of the bus down. Throws CallError.
    void SetBus(const std::string& id);

    /// Whether the name was last subscribed under by this user.
    bool IsOf(const std::string& name, guint32 user) const;

    /// Writes down that the user subscribed under the name, unless the book says so. Throws CallError.
    /// @param isInUse  whether a name has records; those that have none are crossed out
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
