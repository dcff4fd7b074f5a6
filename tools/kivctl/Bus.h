#ifndef BUS_H
#define BUS_H

#include "Kivctl.h"

#include <gio/gio.h>

#include <memory>
#include <string>

/// What became of an attempt to connect to the system bus.
struct BusState
{
    int code; ///< as of DADBusManager
    std::string address;
    std::string trouble; ///< empty on success
};

/// Connects to the system bus, and disconnects. Waits a few seconds for an answer. A call of the library on a bus that accepts
/// connections and never answers would wait for ever.
BusState TryBus();

struct BusRelease
{
    void operator()(GDBusConnection* connection) const { g_object_unref(connection); }
};
using BusConnection = std::unique_ptr<GDBusConnection, BusRelease>;

/// Ends the verb when the system bus cannot be reached or does not answer.
/// @return the process's shared connection, which the library's calls use while it is kept
BusConnection RequireBus();

/// The reason when a bus name has no owner and is not started.
inline constexpr char kNoOwner[] = "no program owns the name, and the bus cannot start one";

/// The reason why a call on the bus failed, in plain words.
/// @param logged  the library's line about it
std::string ReasonOf(const std::string& logged);

#endif
