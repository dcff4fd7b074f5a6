/// @file
/// Names for the library's own result codes.
#ifndef KIV_RESULTCODE_H
#define KIV_RESULTCODE_H

/// Result codes of DADBusManager. DASystem and DASimManager use only 0 and 4. The comments of members that return platform codes
/// say so.
enum _KIV_RESULT_E : int
{
    KIV_RESULT_SUCCESS = 0,          ///< done
    KIV_RESULT_NO_BUS = 1,           ///< the system bus cannot be reached
    KIV_RESULT_NO_REPLY = 2,         ///< no reply, or an error reply
    KIV_RESULT_BUS_TIMED_OUT = 3,    ///< connecting to the system bus timed out
    KIV_RESULT_INVALID_ARGUMENT = 4, ///< an argument is refused, or no SIM answers
    KIV_RESULT_NO_PROXY = 5          ///< the service cannot be addressed
};

/// Returned by GetCellularNetworkState(), GetWifiNetworkState() and GetBTNetworkState() when the state cannot be read. The
/// platform's states are 0 or greater.
constexpr int KIV_CONNECTION_STATE_UNKNOWN = -1;

#endif
