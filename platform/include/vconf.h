/// @file
/// Configuration values of the platform, by key.
#ifndef KIV_PLATFORM_VCONF_H
#define KIV_PLATFORM_VCONF_H

#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// @param in_key  such as "db/csc/salescode", the sales code of the device; borrowed
/// @return the text, which the caller releases with free(); null when there is none
/// Any thread.
char* vconf_get_str(const char* in_key);

PLATFORM_END_DECLS

#endif
