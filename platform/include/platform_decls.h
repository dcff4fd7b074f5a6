/// @file
/// What every header of the platform is framed with.
#ifndef KIV_PLATFORM_DECLS_H
#define KIV_PLATFORM_DECLS_H

/// PLATFORM_OPEN_ENUM makes an enumeration an open one: services may give values that its header does not name, so in C++ it
/// stands on int, and any int may be stored in it and read from it.
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
