/// @file
/// Facts about the device and its platform.
#ifndef KIV_PLATFORM_SYSTEM_INFO_H
#define KIV_PLATFORM_SYSTEM_INFO_H

#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// Keys: "tizen.org/system/tizenid" (the platform's ID of this device), "tizen.org/system/platform.name",
/// "tizen.org/feature/platform.version", "tizen.org/system/model_name".
/// @param key    borrowed
/// @param value  receives the text; free() it. Untouched on failure
/// @return 0, else an error code
/// Any thread.
int system_info_get_platform_string(const char* key, char** value);

PLATFORM_END_DECLS

#endif
