#ifndef SIMCARD_H
#define SIMCARD_H

#include <ITapiSim.h>

#include <string>
#include <vector>

/// A card status in a few words, such as "PIN required".
std::string CardStatusWord(TelSimCardStatus_t status);

/// The card of one slot, as one question found it.
struct CardAnswer
{
    int slot;
    bool isUsable;
    bool mayBecomeUsable;
    std::string text; ///< card status in words
};

/// Asks for the card in a slot. Blocks on the modem.
CardAnswer AskForCard(int slot);

/// CP names of the modems, by slot. Ends the verb when the device has none.
std::vector<std::string> RequireCpNames();

/// The slots to look at: the one asked for, all when that is below 0. Ends the verb when there is no such slot.
std::vector<int> RequireSlots(int asked, size_t count);

#endif
