/// @file
/// The lower telephony layer: modems, identified by their CP names, and handles to one modem.
/// Functions with an int result return 0 on success, else an error code, and then leave out-parameters untouched. All block on the
/// modem. Any thread.
#ifndef KIV_PLATFORM_TAPIUTILITY_H
#define KIV_PLATFORM_TAPIUTILITY_H

#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// An open modem.
typedef struct tapi_handle TapiHandle;

/// The service of the modem: 0 unknown, 1 none, 2 emergency only, 3 searching, 4 and above service of increasing generation.
#define TAPI_PROP_NETWORK_SERVICE_TYPE "org.tizen.telephony.Network:service_type"

/// @return the CP names, one per slot in the order of the slots: a new null-terminated array, which the caller releases with
/// g_strfreev(); null when there is no modem service
char** tel_get_cp_name_list(void);

/// @param cp_name  one of tel_get_cp_name_list(); borrowed
/// @return a handle, which the caller releases with tel_deinit(); null when the modem is unknown or does not answer
TapiHandle* tel_init(const char* cp_name);

/// Closes a handle.
int tel_deinit(TapiHandle* handle);

/// @param handle  open handle
/// @param property  "INTERFACE:PROPERTY"; borrowed
/// @param result    receives the value
int tel_get_property_int(TapiHandle* handle, const char* property, int* result);

PLATFORM_END_DECLS

#endif
