/// @file
/// Installed packages.
#ifndef KIV_PLATFORM_PACKAGE_MANAGER_H
#define KIV_PLATFORM_PACKAGE_MANAGER_H

#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// Results of the package services. Other negative values are errors without a name in this header.
typedef enum PLATFORM_OPEN_ENUM
{
    PACKAGE_MANAGER_ERROR_NONE = 0,
    PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE = -18153359 ///< 0xFEEB0071
} package_manager_error_e;

/// The sizes of a package, valid while the callback runs.
typedef struct package_size_info* package_size_info_h;

/// Receives the sizes of a package.
typedef void (*package_manager_size_info_receive_cb)(const char* package_id, const package_size_info_h size_info, void* user_data);

/// @param user_data  passed to the callback
/// Requests the sizes of a package. The result says whether the package is known.
/// @param package_id  borrowed
/// @param callback    receives the sizes; null when only the result matters
/// @return PACKAGE_MANAGER_ERROR_NONE, PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE, or another error code
/// Any thread.
int package_manager_get_package_size_info(const char* package_id, package_manager_size_info_receive_cb callback, void* user_data);

PLATFORM_END_DECLS

#endif
