/// @file
/// Macros that every header of the platform uses.
#ifndef KIV_PLATFORM_DECLS_H
#define KIV_PLATFORM_DECLS_H

/// @def PLATFORM_BEGIN_DECLS
/// Begins C declarations.
/// @def PLATFORM_END_DECLS
/// Ends C declarations.
/// @def PLATFORM_OPEN_ENUM
/// Makes an enumeration an open one. Services may return values that its header does not name, so its underlying type in C++ is
/// int: any int may be stored in it and read from it.
#ifdef __cplusplus
#define PLATFORM_BEGIN_DECLS                                                                                                       \
    extern "C"                                                                                                                     \
    {
#define PLATFORM_END_DECLS }
#define PLATFORM_OPEN_ENUM : int
#else
#include <stdbool.h>
#define PLATFORM_BEGIN_DECLS
#define PLATFORM_END_DECLS
#define PLATFORM_OPEN_ENUM
#endif

#endif
