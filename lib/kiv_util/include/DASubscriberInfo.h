#ifndef DASUBSCRIBERINFO_H
#define DASUBSCRIBERINFO_H

#include <string>

/// The address on the system bus of one client service that subscribed to an event.
struct _SubscriberInfo
{
    std::string busname;    ///< unique or well-known bus name
    std::string objectpath; ///< object to call
    std::string interface;  ///< interface with the notification methods
};

#endif
