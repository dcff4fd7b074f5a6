#ifndef SIMCARD_H
#define SIMCARD_H

#include <ITapiSim.h>

#include <string>
#include <vector>

/// A card status in a few words, such as "PIN required".
std::string CardStatusWord(TelSimCardStatus_t status);

/// The card of one slot at one moment.
struct CardAnswer
{
    int slot;
    bool isUsable;
    bool mayBecomeUsable;
    std::string text; ///< card status in words
};

/// Reads the card status of a slot. Blocks on the modem.
CardAnswer ReadCard(int slot);

/// The CP names of the modems, by slot. Ends the verb when the device has no modem.
std::vector<std::string> RequireCpNames();

/// The slots to use: the one given, or all when it is negative. Ends the verb when there is no such slot.
std::vector<int> RequireSlots(int asked, size_t count);

#endif
