#ifndef CALLRECORD_H
#define CALLRECORD_H

#include "Output.h"

#include <BusCall.h>

/// A call from the bus as a record: its kind as "event", then its values by name.
Record CallRecord(const kiv::BusCall& call);

#endif
