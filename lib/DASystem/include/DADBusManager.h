#ifndef DADBUSMANAGER_H
#define DADBUSMANAGER_H

#include "DATypes.h"

#include <gio/gio.h>

/// Reads the device unique ID over the system bus, and sends notifications and push messages.
///
/// Result codes: 0 success, 1 system bus unreachable, 2 no reply or an error reply, 3 connecting to the bus timed out, 4 invalid
/// argument, 5 no proxy for the service manager (_KIV_RESULT_E).
///
/// Texts sent on the bus must be valid UTF-8. A null or invalid one is refused before anything is sent: an error line and code 4 (0
/// for a push). Texts are borrowed for the call. Any thread; no lock is held while an operation waits.
///
/// Connecting takes at most 25 seconds, but has no time limit on a bus that accepts connections and never answers. A call works
/// even if the process's shared connection is dead. In a child made by fork, bus calls fail at once if the parent used the bus
/// through the library; if the parent used GDBus without the library, they wait forever.
class KIV_SYSTEM_API DADBusManager
{
public:
    /// Returns the single instance. The first call creates it, and it is never deleted. Null when there is no memory for it; then
    /// the next call tries again. Any thread; holds a separate lock.
    static DADBusManager* GetInstance();

    DADBusManager();          ///< holds nothing; use GetInstance() instead
    virtual ~DADBusManager(); ///< releases nothing

    /// Takes the process's shared system-bus connection, or a private one when that is dead or unavailable.
    /// @param error  receives 1 or 3 on failure; otherwise unchanged
    /// @return a new reference, released with g_object_unref(), or null. It does not end the process when the bus stops.
    /// Blocks while connecting.
    GDBusConnection* InitDbusConnection(int* error);

    /// Requests the board serial number from the device daemon.
    /// @param connection  borrowed
    /// @param error       receives 2 on failure; otherwise unchanged
    /// @return the reply, possibly an error message, released with g_object_unref(); or null
    /// Blocks until the daemon answers, at most 25 seconds.
    GDBusMessage* SendDbusMethodNReceiveDID(GDBusConnection* connection, int* error);

    /// Reads the serial number from the device daemon's reply.
    /// @param reply  borrowed
    /// @param error  receives 2 when the reply is an error message; otherwise unchanged
    /// @return a new text, released with g_free(); null when the reply contains none
    /// Does not block.
    char* ParseDeviceUniqueID(GDBusMessage* reply, int* error);

    /// Requests the device unique ID, which is the board serial number. Nothing is cached.
    /// @param uniqueId  receives a new text, released with g_free(), or null
    /// @return a result code; 0 with a null ID when the daemon's reply contains no text
    /// Blocks, once connected at most 25 seconds.
    int GetDeviceUniqueID(const char*& uniqueId);

    /// Notifies the platform's service manager, but does not start it.
    /// @param type        1 to 7
    /// @param imsi        subscriber identity of the SIM concerned
    /// @param service_id  for types 3, 4 and 5
    /// @param ServiceStatus,PolicyFeature,PolicyVersion,PolicyDocURL  for type 5 only, which requires all four
    /// @return a result code
    /// Blocks until the service manager answers or leaves the bus, without a time limit.
    int SendNotiToServiceManager(_KIV_NOTI_TYPE_E type, const char* imsi, int service_id, const char* ServiceStatus,
        const char* PolicyFeature, const char* PolicyVersion, const char* PolicyDocURL);

    /// @name Notifications to subscribers
    /// Each calls every subscriber of an event, one after the other. A subscriber that cannot be reached is logged and skipped,
    /// without a retry. Each returns 4 when a text is refused, and otherwise 0, even if calls failed. Each blocks until the last
    /// subscriber has answered or left the bus, without a time limit.
    /// @{

    /// Sends a new policy to the subscribers of "policy" for that service.
    int SendPolicyNotification(char* imsi, int service_id, const char* ServiceStatus, const char* PolicyFeature,
        const char* PolicyVersion, const char* PolicyDocURL);

    /// Sends a service's new status to the subscribers of "status" for that service.
    int SendStatusNotification(char* imsi, int service_id, const char* status);

    /// Sends the result of an authentication to the subscribers of "auth".
    int SendAuthNotification(char* imsi, int flag);

    /// Notifies the subscribers of "activated" that the agent was activated or deactivated.
    int SendActivatedNotification(char* imsi, int flag);

    /// Notifies the subscribers of "number_changed" of a new subscriber number; passes the four texts on in their order.
    int SendNumberChangedNotification(char* imsi, const char* first, const char* second, const char* third, const char* fourth);
    /// @}

    /// Starts to deliver a push message to every subscriber of that service's pushes, and returns.
    /// @param service_id          the service whose subscribers receive the message
    /// @param noti_data,noti_msg  content of the message, passed on unread
    /// @param noti_time           any 64-bit value, passed on unchanged
    /// @return 0, also when a text is refused; only the log shows how a delivery ended
    /// Blocks on the subscriber store; does not wait for the bus. The deliveries continue in the calling thread's thread-default
    /// main context, which must be iterated until they end. Until a push has connected, no connection that closes ends the process;
    /// if the context is destroyed before that, this remains so, and the push stays in memory.
    int DeliverPushMessage(const char* service_id, const char* noti_data, const char* noti_msg, long long noti_time);

    static DADBusManager* __pInstance; ///< the instance; null until it is made
};

#endif
