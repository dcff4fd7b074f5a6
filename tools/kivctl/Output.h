#ifndef OUTPUT_H
#define OUTPUT_H

#include <cstdint>
#include <string>
#include <variant>
#include <vector>

/// How data goes to standard output.
struct Form
{
    enum class Notation
    {
        Text,
        Terse, ///< values only, a record per line, ":" between the values, "\\" before ":" and "\\" in them
        Json
    };
    enum class Colour
    {
        Auto, ///< on a terminal, unless NO_COLOR is set
        Always,
        Never
    };

    Notation notation = Notation::Text;
    Colour colour = Colour::Auto;
    std::vector<std::string> fields; ///< names of the fields to print, in this order; empty for all
};

/// Whether numbers that identify a person or a device are shown whole.
enum class Identifiers
{
    Masked,
    Shown
};

/// What a field may hold; std::monostate where a value is missing.
using Value = std::variant<std::monostate, bool, std::int64_t, double, std::string, std::vector<std::string>>;

/// How a value is coloured.
enum class Tone
{
    Plain,
    Good,
    Bad
};

/// One value with its name, which is the JSON key; text shows it with blanks for underscores. A missing value may have its reason
/// as the note; a value that is there may have a note too.
struct Field
{
    std::string name;
    Value value;
    std::string note = {};
    Tone tone = Tone::Plain;
    bool isMasked = false; ///< the value has stars in it, which JSON notes
};
using Record = std::vector<Field>;

/// A field whose value is missing.
Field Missing(std::string name, std::string reason);

/// A field with a text; one that is missing for that reason where `text` is null.
Field TextOr(std::string name, const char* text, std::string reason);

/// Ends the verb with Exit::Usage when the form asks for a field that the record lacks. Printing the record does the same.
void RequireFields(const Record& record, const Form& form);

/// One record: a field per line, or one JSON object, in which "notes" holds the notes by field name.
void Print(const Record& record, const Form& form);

/// Records with the same fields: a row each under a heading, or an array of JSON objects. Where the terminal is too narrow for
/// the rows they become columns, or one block of lines per record.
void PrintTable(const std::vector<Record>& records, const Form& form);

/// One record of a stream, on one line, flushed: the values, the first one bare and the others as name=value, or a JSON object.
/// Any thread; lines stay whole.
void PrintLine(const Record& record, const Form& form);

/// Writes a text to standard output as it is.
void Write(const std::string& text);

/// Writes out what is buffered. @return the errno of the first failure to write since the start; 0 when all is written
int WriteError();

/// Ends a stream of lines: a reader that went away has ended it, which is no failure.
void EndStream();

/// The text with all but its first and last characters starred.
/// @param first  number of bytes that stay at the beginning
/// @param last   number of bytes that stay at the end; a text that would stay whole is starred completely
std::string Masked(std::string text, size_t first, size_t last);

/// The field with its text starred in this way, unless identifiers are shown.
Field Masked(Field field, size_t first, size_t last, Identifiers identifiers);

#endif
