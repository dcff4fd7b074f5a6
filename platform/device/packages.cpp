#include "Calls.h"
#include "package_info.h"
#include "package_manager.h"

using namespace kiv::platform;

PLATFORM_API int package_manager_get_package_size_info(
    const char* package_id, package_manager_size_info_receive_cb callback, void* /*user_data*/)
{
    return Answer(Call::package_manager_get_package_size_info, {},
        [&](State& state)
        {
            if (package_id == nullptr)
                return -EINVAL;
            if (callback) // packages have no sizes here
                return -ENOTSUP;
            return static_cast<int>(
                state.device.packages.count(package_id) != 0 ? PACKAGE_MANAGER_ERROR_NONE : PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE);
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
            if (state.device.packages.count(package_id) == 0)
                return static_cast<int>(PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE);
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
            const auto found = state.device.packages.find(handle->package);
            return found == state.device.packages.end() ? static_cast<int>(PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE)
                                                        : GiveText(version, found->second);
        });
}
