#include "Calls.h"
#include "package_info.h"
#include "package_manager.h"

using namespace kiv::platform;

namespace
{

/// Reads the version of a package; returns an error code if it is not installed.
int FindPackage(State& state, const std::string& id, const std::string*& version)
{
    if (state.source != nullptr && !state.source->RefreshPackage(state.device, id))
        return -ENOTSUP;
    const auto found = state.device.packages.find(id);
    if (found == state.device.packages.end())
        return static_cast<int>(PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE);
    version = &found->second;
    return PACKAGE_MANAGER_ERROR_NONE;
}

} // namespace

PLATFORM_API int package_manager_get_package_size_info(
    const char* package_id, package_manager_size_info_receive_cb callback, void* /*user_data*/)
{
    return Answer(Call::package_manager_get_package_size_info, {},
        [&](State& state)
        {
            if (package_id == nullptr)
                return -EINVAL;
            if (callback) // packages have no sizes on this device
                return -ENOTSUP;
            const std::string* version = nullptr;
            return FindPackage(state, package_id, version);
        });
}

PLATFORM_API int package_info_create(const char* package_id, package_info_h* package_info)
{
    const void* const caller = __builtin_return_address(0);
    return Answer(Call::package_info_create, {},
        [&](State& state)
        {
            if (package_id == nullptr || package_info == nullptr)
                return -EINVAL;
            const std::string* version = nullptr;
            if (const int code = FindPackage(state, package_id, version); code != 0)
                return code;
            const Opening opening = state.handles.Open(Call::package_info_create, caller);
            *package_info = state.handles.Add<package_info_h>({HandleKind::PackageInfo, kNoSlot, opening, package_id, {}});
            return 0;
        });
}

PLATFORM_API int package_info_destroy(package_info_h package_info)
{
    return Answer(Call::package_info_destroy, {},
        [&](State& state)
        { return state.handles.Close(HandleKind::PackageInfo, package_info, Call::package_info_destroy) ? 0 : -EINVAL; });
}

PLATFORM_API int package_info_get_version(package_info_h package_info, char** version)
{
    return Answer(Call::package_info_get_version, {},
        [&](State& state)
        {
            const auto* const handle = state.handles.Find(HandleKind::PackageInfo, package_info, Call::package_info_get_version);
            if (handle == nullptr)
                return -EINVAL;
            const std::string* text = nullptr;
            const int code = FindPackage(state, handle->subject, text);
            return code == 0 ? GiveText(version, *text) : code;
        });
}
