#include "Handles.h"

#include <algorithm>
#include <cxxabi.h>
#include <dlfcn.h>
#include <glib.h>
#include <utility>

namespace kiv::platform
{

namespace
{

const char* NameOf(HandleKind kind)
{
    constexpr const char* kKinds[] = {"handle list", "telephony handle", "TAPI handle", "package handle", "connection handle"};
    return kKinds[static_cast<std::size_t>(kind)];
}

/// Returns "libx.so+0x1f2 (near Function)", for addr2line and for readers.
std::string Place(const void* address)
{
    Dl_info info{};
    if (dladdr(address, &info) == 0 || info.dli_fname == nullptr)
        return "an unknown place";

    const auto offset = static_cast<const char*>(address) - static_cast<const char*>(info.dli_fbase);
    const std::unique_ptr<char, decltype(&g_free)> module(g_path_get_basename(info.dli_fname), g_free);
    const std::unique_ptr<char, decltype(&g_free)> where(
        g_strdup_printf("%s+%#" G_GINT64_MODIFIER "x", module.get(), static_cast<gint64>(offset)), g_free);
    if (info.dli_sname == nullptr)
        return where.get();
    const std::unique_ptr<char, decltype(&free)> plain(abi::__cxa_demangle(info.dli_sname, nullptr, nullptr, nullptr), free);
    return std::string(where.get()) + " (near " + (plain != nullptr ? plain.get() : info.dli_sname) + ')';
}

std::string Describe(HandleKind kind, int slot, const Opening& opening)
{
    std::string text = NameOf(kind);
    if (slot != kNoSlot)
        text += " of slot " + std::to_string(slot);
    return text + ", opened by " + platform::NameOf(opening.by) + " call " + std::to_string(opening.number) + " from " +
           Place(opening.caller);
}

} // namespace

void* Handles::AddObject(OpenHandle handle)
{
    auto owned = std::make_unique<OpenHandle>(std::move(handle));
    void* const address = owned->list.empty() ? static_cast<void*>(owned.get()) : owned->list.data();
    open_[address] = std::move(owned);
    return address;
}

const OpenHandle* Handles::Find(HandleKind kind, const void* handle, Call user)
{
    const auto found = open_.find(handle);
    if (found != open_.end() && found->second->kind == kind)
        return found->second.get();
    NoteMisuse(kind, handle, user, "used after closing");
    return nullptr;
}

bool Handles::Close(HandleKind kind, const void* handle, Call user)
{
    const auto found = open_.find(handle);
    if (found == open_.end() || found->second->kind != kind)
    {
        NoteMisuse(kind, handle, user, "closed twice");
        return false;
    }

    const std::unique_ptr<OpenHandle> owned = std::move(found->second);
    open_.erase(found);
    closed_[closedCount_++ % closed_.size()] = {handle, kind, owned->slot, owned->opening};
    for (const telephony_h each : owned->list)
        Close(HandleKind::Telephony, each, user);
    return true;
}

int Handles::SlotOf(const void* handle) const
{
    const auto found = open_.find(handle);
    return found == open_.end() ? kNoSlot : found->second->slot;
}

std::vector<std::string> Handles::Describe() const
{
    std::vector<std::string> all;
    for (const auto& [address, handle] : open_)
        if (handle->kind != HandleKind::Telephony) // closed with its list
            all.push_back(platform::Describe(handle->kind, handle->slot, handle->opening));
    return all;
}

std::vector<std::string> Handles::TakeMisuses()
{
    return std::exchange(misuses_, {});
}

void Handles::NoteMisuse(HandleKind kind, const void* handle, Call user, const char* whenClosed)
{
    const std::string start = std::string(platform::NameOf(user)) + ": ";
    const std::string wanted = NameOf(kind);
    if (const auto found = open_.find(handle); found != open_.end())
    {
        const OpenHandle& other = *found->second;
        misuses_.push_back(start + "needs a " + wanted + ", got a " + platform::Describe(other.kind, other.slot, other.opening));
        return;
    }

    const Closed* last = nullptr; // several handles may have had the address
    for (std::size_t i = closedCount_; i > 0 && closedCount_ - i < closed_.size() && last == nullptr; --i)
        if (closed_[(i - 1) % closed_.size()].handle == handle)
            last = &closed_[(i - 1) % closed_.size()];
    if (last != nullptr && handle != nullptr)
        misuses_.push_back(start + whenClosed + ": " + platform::Describe(last->kind, last->slot, last->opening));
    else
        misuses_.push_back(
            start + "needs a " + wanted + ", got " + (handle != nullptr ? "a pointer that was never a handle" : "null"));
}

} // namespace kiv::platform
