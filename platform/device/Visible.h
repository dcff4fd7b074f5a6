#ifndef KIV_DEVICE_VISIBLE_H
#define KIV_DEVICE_VISIBLE_H

#include <string>

#pragma GCC visibility push(default)

namespace kiv::platform
{

/// Returns a text that is safe for a terminal. It escapes everything that could move the cursor, forge a line or reorder the
/// output: control and format characters, Unicode line ends ("\n", "\x1b", "\u202e"), and bytes that are not UTF-8 ("\xff").
std::string Visible(const std::string& text);

} // namespace kiv::platform

#pragma GCC visibility pop

#endif
