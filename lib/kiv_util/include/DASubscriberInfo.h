#ifndef DASUBSCRIBERINFO_H
#define DASUBSCRIBERINFO_H

#include <string>

/// One client service that subscribed to an event: where on the system bus to call it.
struct _SubscriberInfo
{
    std::string busname;    ///< unique or well-known bus name
    std::string objectpath; ///< object to call
    std::string interface;  ///< interface that carries the notification methods
};

#endif
