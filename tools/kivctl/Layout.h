#ifndef LAYOUT_H
#define LAYOUT_H

#include <cstddef>
#include <limits>
#include <string>
#include <vector>

/// @file
/// Text on a terminal: how wide it is, and where its lines end. All text here is UTF-8 without control characters.

/// The width where there is no terminal: lines are not wrapped.
inline constexpr size_t kUnlimited = std::numeric_limits<size_t>::max();

/// Columns of the terminal that a file descriptor refers to; kUnlimited when it is no terminal.
size_t TerminalWidth(int descriptor);

/// Number of columns of a text on a terminal.
size_t Width(const std::string& text);

/// Pads a text with blanks to a width.
std::string Padded(const std::string& text, size_t width);

/// Breaks a text into lines of at most `width` columns: at blanks, or else after a comma or "|". A word that is longer than the
/// room in a line begins further left. Only a word that is longer than a line is split, after a slash if there is one.
/// @param indent  number of blanks before each line but the first; less than `width`
std::vector<std::string> Wrapped(const std::string& text, size_t width, size_t indent = 0);

/// Like Wrapped(), for a text that begins with a heading of `indent` columns, including its padding. The lines continue to the
/// right of the heading. If there is too little space for that, the heading is on a separate line.
std::vector<std::string> WrappedBehindHeading(const std::string& text, size_t width, size_t indent);

/// Wraps each line of a help text. A description continues below its beginning.
/// @param column  where the descriptions begin that are next to a heading
std::string WrappedHelp(const std::string& text, size_t width, size_t column);

#endif
