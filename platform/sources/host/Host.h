/// @file
/// The machine itself as the source of the device: its modems, its connections and its files.
#ifndef KIV_SOURCES_HOST_H
#define KIV_SOURCES_HOST_H

#include "Source.h"

namespace kiv::platform
{

constexpr char kHostDescription[] = "the machine itself: its modems, connections and files";

/// Waits until everything was read, but at most two seconds. A service that has not answered by then counts as absent until it
/// does.
Origin OpenHost();

} // namespace kiv::platform

#endif
