#include "NameBook.h"

#include "BusParty.h"

namespace kiv
{
namespace
{

constexpr char kBusGroup[] = "bus";
constexpr char kIdKey[] = "id";
constexpr char kUsersGroup[] = "users";

} // namespace

NameBook::NameBook(const std::string& storePath) : path_(storePath + ".names"), file_(g_key_file_new())
{
    g_key_file_load_from_file(file_.get(), path_.c_str(), G_KEY_FILE_NONE, nullptr);
}

std::string NameBook::Bus() const
{
    const g_autofree char* id = g_key_file_get_string(file_.get(), kBusGroup, kIdKey, nullptr);
    return id == nullptr ? "" : id;
}

void NameBook::SetBus(const std::string& id)
{
    g_key_file_set_string(file_.get(), kBusGroup, kIdKey, id.c_str());
    Save();
}

bool NameBook::IsOf(const std::string& name, guint32 user) const
{
    g_autoptr(GError) error = nullptr;
    return g_key_file_get_uint64(file_.get(), kUsersGroup, name.c_str(), &error) == user && error == nullptr;
}

void NameBook::SetUser(const std::string& name, guint32 user, const std::function<bool(const std::string&)>& isInUse)
{
    if (IsOf(name, user))
        return;
    g_auto(GStrv) names = g_key_file_get_keys(file_.get(), kUsersGroup, nullptr, nullptr);
    for (char** known = names; known != nullptr && *known != nullptr; ++known)
    {
        if (!isInUse(*known))
            g_key_file_remove_key(file_.get(), kUsersGroup, *known, nullptr);
    }
    g_key_file_set_uint64(file_.get(), kUsersGroup, name.c_str(), user);
    Save();
}

void NameBook::Save() const
{
    gsize size = 0;
    g_autoptr(GError) error = nullptr;
    const g_autofree char* text = g_key_file_to_data(file_.get(), &size, nullptr);
    const g_autofree char* directory = g_path_get_dirname(path_.c_str());
    g_mkdir_with_parents(directory, 0700); // if this fails, writing the file fails with the reason
    constexpr int kForTheUserAlone = 0600;
    if (g_file_set_contents_full(
            path_.c_str(), text, static_cast<gssize>(size), G_FILE_SET_CONTENTS_CONSISTENT, kForTheUserAlone, &error) == FALSE)
        throw CallError(G_DBUS_ERROR_FAILED, error->message);
}

} // namespace kiv
