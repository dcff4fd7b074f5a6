/// @file
/// Configuration values of the platform, by key.
#ifndef KIV_PLATFORM_VCONF_H
#define KIV_PLATFORM_VCONF_H

#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// @param in_key  such as "db/csc/salescode", the sales code of the device; borrowed
/// @return the text, which the caller frees with free(), or null when there is no such text
/// Any thread.
char* vconf_get_str(const char* in_key);

PLATFORM_END_DECLS

#endif
