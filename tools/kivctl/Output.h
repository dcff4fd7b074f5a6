#ifndef OUTPUT_H
#define OUTPUT_H

#include <cstdint>
#include <string>
#include <variant>
#include <vector>

/// How data is printed.
struct Form
{
    enum class Notation
    {
        Text,
        Terse, ///< values only, one record per line; values are separated by ":", and "\\" escapes ":" and "\\"
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

/// Whether numbers that identify a person or a device are shown in full.
enum class Identifiers
{
    Masked,
    Shown
};

/// The value of a field; std::monostate when it is missing.
using Value = std::variant<std::monostate, bool, std::int64_t, double, std::string, std::vector<std::string>>;

/// How a value is coloured.
enum class Tone
{
    Plain,
    Good,
    Bad
};

/// One value and its name. The name is the JSON key; text output shows it with blanks for underscores. The note of a missing value
/// says why it is missing; other values may have a note too.
struct Field
{
    std::string name;
    Value value;
    std::string note = {};
    Tone tone = Tone::Plain;
    bool isMasked = false; ///< the value has stars in it; JSON says so in "notes"
};
using Record = std::vector<Field>;

/// A field whose value is missing.
Field Missing(std::string name, std::string reason);

/// A field with a text; a missing one, with that reason, when `text` is null.
Field TextOr(std::string name, const char* text, std::string reason);

/// Ends the verb with Exit::Usage when the form asks for a field that is not one of these. Printing a record checks its own fields.
void RequireFields(const std::vector<std::string>& known, const Form& form);

/// Prints one record: a field per line, or one JSON object, in which "notes" holds the notes by field name.
void Print(const Record& record, const Form& form);

/// Prints records with the same fields: one row per record below a heading, or an array of JSON objects. When the terminal is too
/// narrow for the rows, they become columns, or one block of lines per record.
void PrintTable(const std::vector<Record>& records, const Form& form);

/// Prints one record of a stream on one line and flushes it: the first value alone and the others as name=value, or a JSON object.
/// Any thread; lines are never mixed.
void PrintLine(const Record& record, const Form& form);

/// Replaces all but the first and last bytes of a text by stars.
/// @param first  number of bytes to keep at the beginning
/// @param last   number of bytes to keep at the end; nothing is kept of a text that would otherwise stay complete
std::string Masked(std::string text, size_t first, size_t last);

/// Masks the text of a field in this way, unless identifiers are shown.
Field Masked(Field field, size_t first, size_t last, Identifiers identifiers);

#endif
