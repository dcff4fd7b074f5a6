/// @file
/// Names for the numbers that members return which have no other documented set of codes.
#ifndef KIV_RESULTCODE_H
#define KIV_RESULTCODE_H

/// Result codes of DADBusManager. Members of DASystem and DASimManager return 0 and 4 of them; a member that passes a platform
/// service's own code through says so.
enum _KIV_RESULT_E : int
{
    KIV_RESULT_SUCCESS = 0,          ///< done
    KIV_RESULT_NO_BUS = 1,           ///< the system bus cannot be reached
    KIV_RESULT_NO_REPLY = 2,         ///< no reply, or an error reply
    KIV_RESULT_BUS_TIMED_OUT = 3,    ///< connecting to the system bus timed out
    KIV_RESULT_INVALID_ARGUMENT = 4, ///< an argument is refused, or no SIM slot gave an answer
    KIV_RESULT_NO_PROXY = 5          ///< the service cannot be addressed
};

/// What GetCellularNetworkState(), GetWifiNetworkState() and GetBTNetworkState() return when the state cannot be read. Every state
/// of the platform is 0 or greater.
constexpr int KIV_CONNECTION_STATE_UNKNOWN = -1;

#endif
