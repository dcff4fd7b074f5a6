#include "Layout.h"

#include <glib.h>

#include <sys/ioctl.h>

#include <algorithm>
#include <sstream>
#include <utility>

namespace
{

size_t Columns(gunichar character)
{
    return g_unichar_iszerowidth(character) ? 0 : g_unichar_iswide(character) ? 2 : 1;
}

/// Number of bytes of the text that fit into `width` columns; at least one character.
size_t BytesThatFit(const std::string& text, size_t width)
{
    const char* const begin = text.c_str();
    const char* at = begin;
    for (size_t columns = 0; *at != '\0'; at = g_utf8_next_char(at))
    {
        columns += Columns(g_utf8_get_char(at));
        if (columns > width && at != begin)
            break;
    }
    return static_cast<size_t>(at - begin);
}

/// Where the description in a line of help begins: after two or more blanks, or in the column of descriptions when the heading ends
/// right before it. The line's indentation when there is no description.
size_t DescriptionBegin(const std::string& line, size_t column)
{
    const size_t heading = std::min(line.find_first_not_of(' '), line.size());
    const size_t gap = line.find("  ", heading);
    if (gap != line.npos)
        return std::min(line.find_first_not_of(' ', gap), line.size());
    const bool isFullHeading = heading > 0 && heading < column && line.size() > column && line[column - 1] == ' ';
    return isFullHeading ? column : heading;
}

} // namespace

size_t TerminalWidth(int descriptor)
{
    winsize size{};
    const bool isTerminal = ioctl(descriptor, TIOCGWINSZ, &size) == 0 && size.ws_col > 0;
    return isTerminal ? size.ws_col : kUnlimited;
}

size_t Width(const std::string& text)
{
    size_t columns = 0;
    for (const char* at = text.c_str(); *at != '\0'; at = g_utf8_next_char(at))
        columns += Columns(g_utf8_get_char(at));
    return columns;
}

std::string Padded(const std::string& text, size_t width)
{
    return text + std::string(width - std::min(width, Width(text)), ' ');
}

std::vector<std::string> Wrapped(const std::string& text, size_t width, size_t indent)
{
    std::vector<std::string> lines;
    std::string line = text;
    indent = std::min(indent, width / 2);
    while (Width(line) > width)
    {
        const size_t fits = BytesThatFit(line, width);
        size_t end = line.rfind(' ', fits);
        if (end == line.npos || end <= std::max(indent, line.find_first_not_of(' ')))
            end = fits;
        const size_t next = std::min(line.find_first_not_of(' ', end), line.size());
        lines.push_back(line.substr(0, end));
        line = std::string(indent, ' ') + line.substr(next);
    }
    lines.push_back(std::move(line));
    return lines;
}

std::vector<std::string> WrappedBehindHeading(const std::string& text, size_t width, size_t indent)
{
    constexpr size_t kReadable = 20; // columns
    constexpr size_t kNarrowIndent = 4;
    if (Width(text) <= width || indent == 0 || indent + kReadable <= width)
        return Wrapped(text, width, indent);
    const std::string heading = text.substr(0, text.find_last_not_of(' ', indent - 1) + 1);
    std::vector<std::string> lines = heading.empty() ? std::vector<std::string>() : Wrapped(heading, width, kNarrowIndent);
    for (std::string& line : Wrapped(std::string(kNarrowIndent, ' ') + text.substr(indent), width, kNarrowIndent))
        lines.push_back(std::move(line));
    return lines;
}

std::string WrappedHelp(const std::string& text, size_t width, size_t column)
{
    std::string wrapped;
    std::istringstream lines(text);
    for (std::string line; std::getline(lines, line);)
    {
        for (const std::string& piece : WrappedBehindHeading(line, width, DescriptionBegin(line, column)))
            wrapped += piece + '\n';
    }
    return wrapped;
}
