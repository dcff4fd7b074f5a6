#ifndef OUTPUT_H
#define OUTPUT_H

#include <cstdint>
#include <string>
#include <variant>
#include <vector>

/// How data goes to standard output.
enum class Form
{
    Text,
    Json
};

/// Whether numbers that identify a person or a device are shown whole.
enum class Identifiers
{
    Masked,
    Shown
};

/// What a field may hold; std::monostate where a value is missing.
using Value = std::variant<std::monostate, bool, std::int64_t, double, std::string, std::vector<std::string>>;

/// How a value is coloured on a terminal, unless NO_COLOR is set.
enum class Tone
{
    Plain,
    Good,
    Bad
};

/// One thing to tell. Its name is the JSON key; text shows it with blanks for underscores. A value that is missing has its reason
/// as the note, if there is one; a value that is there may have a note too.
struct Field
{
    std::string name;
    Value value;
    std::string note = {};
    Tone tone = Tone::Plain;
};
using Record = std::vector<Field>;

/// A field that is missing.
Field Missing(std::string name, std::string reason);

/// A field with a text; one that is missing for that reason where `text` is null.
Field TextOr(std::string name, const char* text, std::string reason);

/// One record, complete: a field a line, or one JSON object, in which "notes" holds the notes by field name.
void Print(const Record& record, Form form);

/// Records with the same fields: a row each under a heading, or an array of JSON objects. On a terminal that is too
/// narrow for the rows they are columns, if that fits.
void PrintTable(const std::vector<Record>& records, Form form);

/// One record of a stream, on one line, flushed: the values, the first one bare and the others as name=value, or a JSON object.
/// Any thread; lines stay whole.
void PrintLine(const Record& record, Form form);

/// The text with all but its first and last characters starred.
/// @param first  number of bytes that stay at the beginning
/// @param last   number of bytes that stay at the end; a text that would stay whole is starred completely
std::string Mask(std::string text, size_t first, size_t last, Identifiers identifiers);

#endif
