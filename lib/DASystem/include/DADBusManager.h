#ifndef DADBUSMANAGER_H
#define DADBUSMANAGER_H

#include "DATypes.h"

#include <gio/gio.h>

/// What the library does on the system bus.
///
/// Result codes: 0 success, 1 system bus unreachable, 2 no reply or an error reply, 3 reaching the bus timed out, 4 invalid
/// argument, 5 no proxy for the service manager.
///
/// Texts that go on the bus must be valid UTF-8; one that is not, or that is null, is refused with an error line and code 4
/// before anything is sent (a push gives 0 for it). Texts are borrowed for the call. Any thread; no lock is held while an operation
/// waits.
///
/// To connect takes 25 seconds at most, but has no time limit on a bus that accepts connections and says nothing at all. A call
/// finds the bus whether or not the process's shared connection is dead. In a child made by fork, each call that goes on the bus
/// fails at once if the parent used the bus.
class KIV_SYSTEM_API DADBusManager
{
public:
    /// The one instance, made on first use, never deleted; null when there is no memory for it, and the next call tries again.
    /// Any thread; holds a lock of its own.
    static DADBusManager* GetInstance();

    DADBusManager();          ///< holds nothing; GetInstance() gives the one to ask
    virtual ~DADBusManager(); ///< releases nothing

    /// Takes the process's shared system-bus connection; one for the caller alone when that is dead or cannot be had.
    /// @param error  receives 1 or 3 on failure, else left as it is
    /// @return a new reference, released with g_object_unref(), or null. It does not end the process when the bus goes away.
    /// Blocks while connecting.
    GDBusConnection* InitDbusConnection(int* error);

    /// Asks the device daemon for the board serial number.
    /// @param connection  borrowed
    /// @param error       receives 2 on failure, else left as it is
    /// @return the reply, which may be an error message, released with g_object_unref(); or null
    /// Blocks until the daemon answers, 25 seconds at most.
    GDBusMessage* SendDbusMethodNReceiveDID(GDBusConnection* connection, int* error);

    /// Reads the serial number out of the device daemon's reply.
    /// @param reply  borrowed
    /// @param error  receives 2 when the reply is an error message, else left as it is
    /// @return a new text released with g_free(); null when the reply holds none
    /// Does not block.
    char* ParseDeviceUniqueID(GDBusMessage* reply, int* error);

    /// Asks for the device unique ID, the board serial number, afresh on each call.
    /// @param uniqueId  receives a new text released with g_free(), or null
    /// @return a result code; 0 with a null ID when the daemon's reply holds no text
    /// Blocks, 25 seconds at most once connected.
    int GetDeviceUniqueID(const char*& uniqueId);

    /// Tells the platform's service manager, which is not started when it does not run.
    /// @param type        1 to 7
    /// @param imsi        subscriber identity of the SIM concerned
    /// @param service_id  of types 3, 4 and 5
    /// @param ServiceStatus,PolicyFeature,PolicyVersion,PolicyDocURL  of type 5 only, where all four are required
    /// @return a result code
    /// Blocks until the service manager answers or leaves the bus, without a time limit.
    int SendNotiToServiceManager(_KIV_NOTI_TYPE_E type, const char* imsi, int service_id, const char* ServiceStatus,
        const char* PolicyFeature, const char* PolicyVersion, const char* PolicyDocURL);

    /// @name Notifications to subscribers
    /// Each calls every subscriber of an event, one after the other. One that can not be reached is logged and passed over; there
    /// is no retry. The result is 4 when a text is refused, else 0, whatever became of the calls. Each blocks until the last
    /// subscriber answered or left the bus, without a time limit.
    /// @{

    /// A new policy, to the subscribers of "policy" for that service.
    int SendPolicyNotification(char* imsi, int service_id, const char* ServiceStatus, const char* PolicyFeature,
        const char* PolicyVersion, const char* PolicyDocURL);

    /// A service was switched, to the subscribers of "status" for that service.
    int SendStatusNotification(char* imsi, int service_id, const char* status);

    /// The result of an authentication, to the subscribers of "auth".
    int SendAuthNotification(char* imsi, int flag);

    /// The agent was activated or deactivated, to the subscribers of "activated".
    int SendActivatedNotification(char* imsi, int flag);

    /// A subscriber number changed, to the subscribers of "number_changed"; the four texts go through in their order.
    int SendNumberChangedNotification(char* imsi, const char* first, const char* second, const char* third, const char* fourth);
    /// @}

    /// Starts the delivery of a push message to every subscriber of that service's pushes and returns.
    /// @param service_id          the service whose subscribers are told
    /// @param noti_data,noti_msg  what the message carries; not read here
    /// @param noti_time           any 64-bit value; delivered as it is
    /// @return 0, also when a text is refused; what became of a delivery stands in the log only
    /// Blocks on the subscriber store; does not wait for the bus. The deliveries go on in the thread-default main context of the
    /// calling thread, which must be iterated.
    int DeliverPushMessage(const char* service_id, const char* noti_data, const char* noti_msg, long long noti_time);

    static DADBusManager* __pInstance; ///< the instance, null until it is made
};

#endif
