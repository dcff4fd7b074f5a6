/// @file
/// Text messages. Results and threads as in TapiUtility.h.
#ifndef KIV_PLATFORM_ITAPINETTEXT_H
#define KIV_PLATFORM_ITAPINETTEXT_H

#include "TapiUtility.h"
#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// @param handle  open handle
/// @param ready_status  receives 0 while the modem is not ready for text messages, else another value
int tel_check_sms_device_status(TapiHandle* handle, int* ready_status);

PLATFORM_END_DECLS

#endif
