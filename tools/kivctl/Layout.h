#ifndef LAYOUT_H
#define LAYOUT_H

#include <cstddef>
#include <limits>
#include <string>
#include <vector>

/// @file
/// Text on a terminal: how wide it is, and where its lines end. All text here is UTF-8 without control characters.

/// The width of what is no terminal: lines stay as long as they are.
inline constexpr size_t kUnlimited = std::numeric_limits<size_t>::max();

/// Columns of the terminal that a file descriptor refers to; kUnlimited when it is none.
size_t TerminalWidth(int descriptor);

/// Columns that a text takes.
size_t Width(const std::string& text);

/// The text with blanks behind it up to a width.
std::string Padded(const std::string& text, size_t width);

/// The text in lines of at most `width` columns, cut at blanks where possible.
/// @param indent  blanks before every line but the first; less than `width`
std::vector<std::string> Wrapped(const std::string& text, size_t width, size_t indent = 0);

/// The same for a text that begins with a heading of `indent` columns, its padding included, below which the lines continue. Where
/// the terminal leaves too little room for that, the heading is on a line of its own.
std::vector<std::string> WrappedBehindHeading(const std::string& text, size_t width, size_t indent);

/// Wraps each line of a help text; it continues below its description.
std::string WrappedHelp(const std::string& text, size_t width);

#endif
