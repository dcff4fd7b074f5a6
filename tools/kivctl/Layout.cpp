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

/// Number of bytes up to and including the last of the marks within those that fit; 0 when there is none.
size_t EndAfter(const char* marks, const std::string& line, size_t fits)
{
    return line.find_last_of(marks, fits - 1) + 1;
}

/// Where the description in a line of help begins: after two or more blanks, or in the column of descriptions when the heading ends
/// right before it. Where a line without a description continues: below its beginning, a heading a little to the right.
size_t DescriptionBegin(const std::string& line, size_t column)
{
    const size_t heading = std::min(line.find_first_not_of(' '), line.size());
    const size_t gap = line.find("  ", heading);
    if (gap != line.npos)
        return std::min(line.find_first_not_of(' ', gap), line.size());
    if (heading == 0 || heading >= column)
        return heading;
    return line.size() > column && line[column - 1] == ' ' ? column : heading + 4;
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
    bool isSplit = false;                                 // the line begins with the rest of a word
    indent = width > 2 ? std::min(indent, width / 2) : 0; // a wide character fits behind it
    while (Width(line) > width)
    {
        const size_t begin = std::min(line.find_first_not_of(' '), line.size());
        const size_t fits = BytesThatFit(line, width);
        const size_t blank = line.find_last_of(' ', fits);
        const bool hasBlank = blank != line.npos && blank > begin;
        const size_t word = hasBlank ? std::min(line.find_first_not_of(' ', blank), line.size()) : begin; // that does not fit
        const size_t columns = Width(line.substr(word, line.find(' ', word) - word));
        const bool staysWhole = columns <= width && (hasBlank || !isSplit);
        size_t end = hasBlank ? blank : 0;
        const size_t mark = EndAfter(staysWhole ? ",|" : ",|/", line, fits);
        if (mark > word + 1 && !(hasBlank && staysWhole))
            end = mark;
        if (end == 0 && staysWhole && begin > 0)
        {
            line.erase(0, begin + columns - width); // the word begins further left
            continue;
        }
        end = end == 0 ? fits : end;
        isSplit = line[end] != ' ';
        lines.push_back(line.substr(0, line.find_last_not_of(' ', end - 1) + 1));
        line.replace(0, std::min(line.find_first_not_of(' ', end), line.size()), indent, ' ');
    }
    lines.push_back(std::move(line));
    return lines;
}

std::vector<std::string> WrappedBehindHeading(const std::string& text, size_t width, size_t indent)
{
    constexpr size_t kReadable = 20; // columns
    constexpr size_t kNarrowIndent = 4;
    const bool hasHeading = indent > 0 && indent <= text.size() && text[indent - 1] == ' ';
    if (Width(text) <= width || !hasHeading || indent + kReadable <= width)
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
