#include "Output.h"

#include "Kivctl.h"
#include "Layout.h"
#include "Nearest.h"

#include <StandardOutput.h>
#include <Visible.h>
#include <glib.h>
#include <nlohmann/json.hpp>

#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <numeric>
#include <type_traits>
#include <utility>

namespace
{

using Json = nlohmann::ordered_json;
using kiv::platform::Visible;
using kiv::StandardOutput::Write;

Json ToJson(const Value& value)
{
    return std::visit(
        [](const auto& held) -> Json
        {
            if constexpr (std::is_same_v<std::decay_t<decltype(held)>, std::monostate>)
                return nullptr;
            else
                return held;
        },
        value);
}

Json ToJson(const Record& record)
{
    Json object = Json::object();
    Json notes = Json::object();
    for (const Field& field : record)
    {
        object[field.name] = ToJson(field.value);
        if (field.isMasked)
            notes[field.name] = "masked; --show-ids shows all of it";
        else if (!field.note.empty())
            notes[field.name] = field.note;
    }
    if (!notes.empty())
        object["notes"] = notes;
    return object;
}

/// The values may be invalid UTF-8; JSON must not be. Where a character must not reach a terminal, all but ASCII is escaped.
std::string Dump(const Json& json, int indent)
{
    const std::string line = json.dump(-1, ' ', false, Json::error_handler_t::replace);
    const bool isPlain = Visible(line) == line;
    return json.dump(indent, ' ', !isPlain, Json::error_handler_t::replace);
}

std::string Label(std::string name)
{
    std::replace(name.begin(), name.end(), '_', ' ');
    return name;
}

/// A value as text; empty when it is missing.
std::string ToText(const Value& value)
{
    if (const auto* text = std::get_if<std::string>(&value))
        return *text;
    if (const auto* yes = std::get_if<bool>(&value))
        return *yes ? "yes" : "no";
    if (const auto* list = std::get_if<std::vector<std::string>>(&value))
        return Joined(*list, ",");
    if (const auto* number = std::get_if<double>(&value))
    {
        g_autofree char* text = g_strdup_printf("%g", *number);
        return text;
    }
    if (const auto* number = std::get_if<std::int64_t>(&value))
        return std::to_string(*number);
    return "";
}

std::string CellText(const Field& field)
{
    if (std::holds_alternative<std::monostate>(field.value))
        return field.note.empty() ? "-" : Visible("(" + field.note + ")");
    const std::string text = ToText(field.value);
    const bool isList = std::holds_alternative<std::vector<std::string>>(field.value);
    return Visible((!text.empty() ? text : isList ? "none" : "(empty)") + (field.note.empty() ? "" : " (" + field.note + ")"));
}

std::string TerseText(const Field& field)
{
    std::string text;
    for (const char letter : ToText(field.value))
    {
        if (letter == ':' || letter == '\\')
            text += '\\';
        text += letter;
    }
    return Visible(text);
}

std::string TerseLine(const Record& record)
{
    std::string line;
    for (const Field& field : record)
        line += (&field == &record.front() ? "" : ":") + TerseText(field);
    return line + '\n';
}

constexpr char kBold[] = "\033[1m";
constexpr char kFaint[] = "\033[2m";
constexpr char kGreen[] = "\033[32m";
constexpr char kRed[] = "\033[31m";

/// The style of a field's value on a terminal.
const char* Style(const Field& field)
{
    if (field.tone != Tone::Plain)
        return field.tone == Tone::Good ? kGreen : kRed;
    return std::holds_alternative<std::monostate>(field.value) ? kFaint : "";
}

bool IsColourTerminal()
{
    const char* const refusal = std::getenv("NO_COLOR");
    const char* const terminal = std::getenv("TERM");
    return isatty(STDOUT_FILENO) == 1 && (refusal == nullptr || *refusal == '\0') && terminal != nullptr &&
           std::strcmp(terminal, "dumb") != 0;
}

std::string Painted(const std::string& text, const char* style, const Form& form)
{
    static const bool isColourTerminal = IsColourTerminal();
    const bool usesColour = form.colour == Form::Colour::Auto ? isColourTerminal : form.colour == Form::Colour::Always;
    return usesColour && *style != '\0' && !text.empty() ? style + text + "\033[0m" : text;
}

/// The value in a line of name=value. Texts are quoted and escaped, so that they cannot break the line.
std::string LineText(const Value& value)
{
    const auto* text = std::get_if<std::string>(&value);
    if (text == nullptr)
        return Visible(ToText(value));
    g_autofree char* valid = g_utf8_make_valid(text->c_str(), -1);
    g_autoptr(GVariant) variant = g_variant_ref_sink(g_variant_new_string(valid));
    g_autofree char* quoted = g_variant_print(variant, FALSE);
    return Visible(quoted);
}

struct Cell
{
    std::string text;
    const char* style;
};
using Cells = std::vector<std::vector<Cell>>;

std::vector<size_t> ColumnWidths(const Cells& rows)
{
    std::vector<size_t> widths(rows.front().size());
    for (const auto& row : rows)
    {
        for (size_t i = 0; i < row.size(); ++i)
            widths[i] = std::max(widths[i], Width(row[i].text));
    }
    return widths;
}

constexpr size_t kGap = 2; ///< between two columns

bool Fits(const Cells& rows, size_t width)
{
    const std::vector<size_t> widths = ColumnWidths(rows);
    return std::accumulate(widths.begin(), widths.end(), kGap * (widths.size() - 1)) <= width;
}

Cells Transposed(const Cells& rows)
{
    Cells columns(rows.front().size());
    for (const auto& row : rows)
    {
        for (size_t i = 0; i < row.size(); ++i)
            columns[i].push_back(row[i]);
    }
    return columns;
}

void PrintRows(const Cells& rows, const Form& form)
{
    const std::vector<size_t> widths = ColumnWidths(rows);
    for (const auto& row : rows)
    {
        std::string line;
        for (size_t i = 0; i < row.size(); ++i)
            line += Painted(i + 1 == row.size() ? row[i].text : Padded(row[i].text, widths[i] + kGap), row[i].style, form);
        Write(line + '\n');
    }
}

/// Prints one field per line, wrapped at the terminal's width.
void PrintFields(const Record& record, const Form& form)
{
    size_t indent = 0;
    for (const Field& field : record)
        indent = std::max(indent, field.name.size() + kGap);
    for (const Field& field : record)
    {
        const std::string text = Padded(Label(field.name), indent) + CellText(field);
        size_t begin = indent; // of the value in a line
        for (const std::string& line : WrappedBehindHeading(text, TerminalWidth(STDOUT_FILENO), indent))
        {
            begin = std::min(begin, line.size());
            Write(line.substr(0, begin) + Painted(line.substr(begin), Style(field), form) + '\n');
            begin = 0;
        }
    }
}

/// The fields of a record that the form selects.
Record Chosen(const Record& record, const Form& form)
{
    if (form.fields.empty())
        return record;
    std::vector<std::string> known;
    for (const Field& field : record)
        known.push_back(field.name);
    RequireFields(known, form);
    Record chosen;
    for (const std::string& name : form.fields)
        chosen.push_back(record[static_cast<size_t>(std::find(known.begin(), known.end(), name) - known.begin())]);
    return chosen;
}

} // namespace

Field Missing(std::string name, std::string reason)
{
    return {std::move(name), {}, std::move(reason)};
}

Field TextOr(std::string name, const char* text, std::string reason)
{
    return text ? Field{std::move(name), std::string(text)} : Missing(std::move(name), std::move(reason));
}

void RequireFields(const std::vector<std::string>& known, const Form& form)
{
    for (const std::string& name : form.fields)
    {
        if (std::find(known.begin(), known.end(), name) == known.end())
        {
            throw Failure(Exit::Usage,
                "there is no field \"" + name + '"' + DidYouMean(name, known) + "; the fields are " + Joined(known, ", "));
        }
    }
}

void Print(const Record& record, const Form& form)
{
    const Record chosen = Chosen(record, form);
    if (form.notation == Form::Notation::Json)
        Write(Dump(ToJson(chosen), 2) + '\n');
    else if (form.notation == Form::Notation::Terse)
        Write(TerseLine(chosen));
    else
        PrintFields(chosen, form);
}

void PrintTable(const std::vector<Record>& records, const Form& form)
{
    std::vector<Record> chosen;
    chosen.reserve(records.size());
    for (const Record& record : records)
        chosen.push_back(Chosen(record, form));
    if (form.notation == Form::Notation::Json)
    {
        Json array = Json::array();
        for (const Record& record : chosen)
            array.push_back(ToJson(record));
        return Write(Dump(array, 2) + '\n');
    }
    if (form.notation == Form::Notation::Terse)
    {
        for (const Record& record : chosen)
            Write(TerseLine(record));
        return;
    }
    if (chosen.empty())
        return;

    Cells rows(1);
    for (const Field& field : chosen.front())
        rows.front().push_back({Label(field.name), kBold});
    for (const Record& record : chosen)
    {
        rows.emplace_back();
        for (const Field& field : record)
            rows.back().push_back({CellText(field), Style(field)});
    }
    constexpr size_t kTableWidth = 60; // columns of the narrowest terminal that shows tables
    const size_t width = TerminalWidth(STDOUT_FILENO);
    if (width >= kTableWidth && Fits(rows, width))
        return PrintRows(rows, form);
    if (width >= kTableWidth && Fits(Transposed(rows), width))
        return PrintRows(Transposed(rows), form);
    for (const Record& record : chosen)
    {
        if (&record != &chosen.front())
            Write("\n");
        PrintFields(record, form);
    }
}

void PrintLine(const Record& record, const Form& form)
{
    std::string text;
    if (form.notation == Form::Notation::Json)
        text = Dump(ToJson(record), -1);
    else
    {
        for (const Field& field : record)
            text += text.empty() ? CellText(field) : " " + field.name + "=" + LineText(field.value);
        text = Joined(Wrapped(text, TerminalWidth(STDOUT_FILENO), 2), "\n");
    }
    Write(text + '\n');
    if (kiv::StandardOutput::Error() != 0)
        g_main_context_wakeup(nullptr); // a main loop that only serves the output then ends
}

std::string Masked(std::string text, size_t first, size_t last)
{
    if (first + last >= text.size())
        first = last = 0;
    std::fill(text.begin() + static_cast<std::ptrdiff_t>(first), text.end() - static_cast<std::ptrdiff_t>(last), '*');
    return text;
}

Field Masked(Field field, size_t first, size_t last, Identifiers identifiers)
{
    auto* const text = std::get_if<std::string>(&field.value);
    field.isMasked = text != nullptr && identifiers == Identifiers::Masked;
    if (field.isMasked)
        *text = Masked(*text, first, last);
    return field;
}
