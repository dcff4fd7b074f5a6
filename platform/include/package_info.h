/// @file
/// Facts about one package. Every function returns 0, else an error code, and then leaves its out-parameter untouched. Any thread.
#ifndef KIV_PLATFORM_PACKAGE_INFO_H
#define KIV_PLATFORM_PACKAGE_INFO_H

#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// The open record of one package.
typedef struct package_info* package_info_h;

/// Opens the record of a package. Returns PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE for an unknown package.
/// @param package_id    borrowed
/// @param package_info  receives a handle, which the caller releases with package_info_destroy()
int package_info_create(const char* package_id, package_info_h* package_info);

/// Releases a handle.
int package_info_destroy(package_info_h package_info);

/// @param package_info  open handle
/// @param version  receives the version text; free() it
int package_info_get_version(package_info_h package_info, char** version);

PLATFORM_END_DECLS

#endif
