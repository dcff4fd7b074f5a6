#ifndef KIV_DEVICE_VISIBLE_H
#define KIV_DEVICE_VISIBLE_H

#include <string>

#pragma GCC visibility push(default)

namespace kiv::platform
{

/// The text as it may go to a terminal. Whatever could move the cursor, forge a line or reorder what is shown becomes an escape:
/// control and format characters and the Unicode line ends ("\n", "\x1b", "\u202e"), and each byte that is not UTF-8 ("\xff").
std::string Visible(const std::string& text);

} // namespace kiv::platform

#pragma GCC visibility pop

#endif
