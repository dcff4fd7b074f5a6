/// @file
/// The device's storage.
#ifndef KIV_PLATFORM_STORAGE_H
#define KIV_PLATFORM_STORAGE_H

#include "platform_decls.h"

#include <sys/statvfs.h>
#ifndef __cplusplus
#include <assert.h>
#endif

// The platform writes the record with 64-bit counts, on a processor of 32 bits too.
static_assert(sizeof(fsblkcnt_t) == 8, "compile with -D_FILE_OFFSET_BITS=64: storage.h needs 64-bit counts in struct statvfs");

PLATFORM_BEGIN_DECLS

/// Reads the statistics of the internal storage. Free bytes for the user are f_bsize, a 32-bit number, times f_bavail, a 64-bit
/// one.
/// @param buf  receives the statistics; untouched on failure
/// @return 0 or more, or a negative error code
/// Any thread.
int storage_get_internal_memory_size64(struct statvfs* buf);

PLATFORM_END_DECLS

#endif
