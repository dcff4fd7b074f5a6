#ifndef KIV_TESTS_FUZZ_BUS_H
#define KIV_TESTS_FUZZ_BUS_H

#include "Fuzz.h"
#include "bus/Subscribers.h"
#include "support/Peer.h"

#include <DADBusManager.h>

namespace kiv::fuzz
{

/// A bus, whose shared connection is held as by an agent, a subscriber store, and somebody who does something with each call.
struct Bus
{
    explicit Bus(const std::function<void(GDBusMessage* call)>& onCall)
        : peer(bus, "org.tizen.servicemanager.service",
              [onCall](GDBusMessage* call)
              {
                  onCall(call);
                  return g_dbus_message_new_method_reply(call);
              })
    {
        peer.Forget();
    }

    DADBusManager& manager = *DADBusManager::GetInstance();
    test::PrivateBus bus;
    test::Subscribers store;
    test::Peer peer;
    int error = 0;
    GDBusConnection* const connection = manager.InitDbusConnection(&error);
};

} // namespace kiv::fuzz

#endif
