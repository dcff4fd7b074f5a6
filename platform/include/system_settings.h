/// @file
/// The user's settings. Every function returns 0, else an error code, and then leaves its out-parameter untouched. A key of
/// another type is an error. Any thread.
#ifndef KIV_PLATFORM_SYSTEM_SETTINGS_H
#define KIV_PLATFORM_SYSTEM_SETTINGS_H

#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// The settings, with their types.
typedef enum PLATFORM_OPEN_ENUM
{
    SYSTEM_SETTINGS_KEY_FONT_SIZE = 3,               ///< int: 0 small, 1 normal, 2 large, 3 huge, 4 giant
    SYSTEM_SETTINGS_KEY_3G_DATA_NETWORK_ENABLED = 8, ///< bool: mobile data
    SYSTEM_SETTINGS_KEY_LOCALE_LANGUAGE = 13,        ///< string: language, underscore, region, such as en_US
    SYSTEM_SETTINGS_KEY_DEVICE_NAME = 21             ///< string
} system_settings_key_e;

/// Results of this service.
typedef enum PLATFORM_OPEN_ENUM
{
    SYSTEM_SETTINGS_ERROR_NONE = 0
} system_settings_error_e;

/// Reads a number.
int system_settings_get_value_int(system_settings_key_e key, int* value);

/// Reads a switch.
int system_settings_get_value_bool(system_settings_key_e key, bool* value);

/// @param key  the value in question
/// @param value  receives the text; free() it
int system_settings_get_value_string(system_settings_key_e key, char** value);

PLATFORM_END_DECLS

#endif
