/// @file
/// The device's storage.
#ifndef KIV_PLATFORM_STORAGE_H
#define KIV_PLATFORM_STORAGE_H

#include "platform_decls.h"

#include <sys/statvfs.h>

PLATFORM_BEGIN_DECLS

/// Reads the statistics of the internal storage. Free bytes for the user are f_bsize, a 32-bit number, times f_bavail, a 64-bit
/// one.
/// @param buf  receives the statistics; untouched on failure
/// @return 0 or more, or a negative error code
/// Any thread.
int storage_get_internal_memory_size64(struct statvfs* buf);

PLATFORM_END_DECLS

#endif
