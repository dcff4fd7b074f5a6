#ifndef SIMCARD_H
#define SIMCARD_H

#include <ITapiSim.h>

#include <string>
#include <vector>

/// A card status in a few words, such as "PIN required".
std::string CardStatusWord(TelSimCardStatus_t status);

/// CP names of the modems, by slot. Ends the verb when the device has none.
std::vector<std::string> RequireCpNames();

/// The slots to look at: the one asked for, all when that is below 0. Ends the verb when there is no such slot.
std::vector<int> RequireSlots(int asked, size_t count);

#endif
