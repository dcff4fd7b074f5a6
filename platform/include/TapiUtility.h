/// @file
/// The lower telephony layer: modems, known by their CP names, and one handle to a modem.
/// Functions with an int result give 0 on success, else an error code and untouched out-parameters. All block on the modem;
/// any thread.
#ifndef KIV_PLATFORM_TAPIUTILITY_H
#define KIV_PLATFORM_TAPIUTILITY_H

#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// An open modem.
typedef struct tapi_handle TapiHandle;

/// The service the modem has: 0 unknown, 1 none, 2 emergency only, 3 searching, 4 and above of increasing generation.
#define TAPI_PROP_NETWORK_SERVICE_TYPE "org.tizen.telephony.Network:service_type"

/// @return the CP names, one a slot in the order of the slots, a new null-terminated array on each call that is released with
/// g_strfreev(); null when there is no modem service
char** tel_get_cp_name_list(void);

/// @param cp_name  one of tel_get_cp_name_list(); borrowed
/// @return a handle that is released with tel_deinit(), or null when the modem does not answer or is not known
TapiHandle* tel_init(const char* cp_name);

/// Closes a handle.
int tel_deinit(TapiHandle* handle);

/// @param property  "INTERFACE:PROPERTY"; borrowed
/// @param result    receives the value
int tel_get_property_int(TapiHandle* handle, const char* property, int* result);

PLATFORM_END_DECLS

#endif
