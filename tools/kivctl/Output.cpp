#include "Output.h"

#include <glib.h>
#include <nlohmann/json.hpp>

#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <numeric>
#include <type_traits>
#include <utility>

namespace
{

using Json = nlohmann::ordered_json;

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
        if (!field.note.empty())
            notes[field.name] = field.note;
    }
    if (!notes.empty())
        object["notes"] = notes;
    return object;
}

/// JSON is UTF-8; what the platform gives may be anything.
std::string Dump(const Json& json, int indent)
{
    return json.dump(indent, ' ', false, Json::error_handler_t::replace);
}

std::string Label(std::string name)
{
    std::replace(name.begin(), name.end(), '_', ' ');
    return name;
}

std::string ToText(const Value& value)
{
    if (const auto* text = std::get_if<std::string>(&value))
        return text->empty() ? "(empty)" : *text;
    if (const auto* yes = std::get_if<bool>(&value))
        return *yes ? "yes" : "no";
    if (const auto* list = std::get_if<std::vector<std::string>>(&value))
    {
        std::string joined;
        for (const std::string& item : *list)
            joined += (joined.empty() ? "" : ",") + item;
        return joined.empty() ? "none" : joined;
    }
    if (const auto* number = std::get_if<double>(&value))
    {
        g_autofree char* text = g_strdup_printf("%g", *number);
        return text;
    }
    return Dump(ToJson(value), -1);
}

std::string CellText(const Field& field)
{
    if (std::holds_alternative<std::monostate>(field.value))
        return field.note.empty() ? "-" : "(" + field.note + ")";
    return ToText(field.value) + (field.note.empty() ? "" : " (" + field.note + ")");
}

constexpr char kBold[] = "\033[1m";
constexpr char kFaint[] = "\033[2m";
constexpr char kGreen[] = "\033[32m";
constexpr char kRed[] = "\033[31m";

/// How a field's value looks on a terminal.
const char* Style(const Field& field)
{
    if (field.tone != Tone::Plain)
        return field.tone == Tone::Good ? kGreen : kRed;
    return std::holds_alternative<std::monostate>(field.value) ? kFaint : "";
}

bool UsesColour()
{
    const char* const refusal = std::getenv("NO_COLOR");
    const char* const terminal = std::getenv("TERM");
    return isatty(STDOUT_FILENO) == 1 && !(refusal && *refusal) && terminal && std::strcmp(terminal, "dumb") != 0;
}

std::string Painted(const std::string& text, const char* style)
{
    static const bool usesColour = UsesColour();
    return usesColour && *style ? style + text + "\033[0m" : text;
}

/// Characters, not bytes; what is no UTF-8 counts by its bytes.
size_t Width(const std::string& text)
{
    return g_utf8_validate(text.c_str(), -1, nullptr) ? static_cast<size_t>(g_utf8_strlen(text.c_str(), -1)) : text.size();
}

std::string Padded(const std::string& text, size_t width)
{
    return text + std::string(width - std::min(width, Width(text)), ' ');
}

/// Columns of the terminal that standard output is; more than any line has if it is none.
size_t TerminalWidth()
{
    winsize size{};
    const bool isTerminal = ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0;
    return isTerminal ? size.ws_col : std::numeric_limits<size_t>::max();
}

/// The value in a line of name=value: texts quoted and escaped, so that none breaks the line.
std::string LineText(const Value& value)
{
    const auto* text = std::get_if<std::string>(&value);
    if (!text)
        return ToText(value);
    g_autofree char* valid = g_utf8_make_valid(text->c_str(), -1);
    g_autoptr(GVariant) variant = g_variant_ref_sink(g_variant_new_string(valid));
    g_autofree char* quoted = g_variant_print(variant, FALSE);
    return quoted;
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

bool Fits(const std::vector<size_t>& widths)
{
    return std::accumulate(widths.begin(), widths.end(), kGap * (widths.size() - 1)) <= TerminalWidth();
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

void PrintRow(const std::vector<Cell>& cells, const std::vector<size_t>& widths)
{
    std::string line;
    for (size_t i = 0; i < cells.size(); ++i)
        line += Painted(i + 1 == cells.size() ? cells[i].text : Padded(cells[i].text, widths[i] + kGap), cells[i].style);
    std::puts(line.c_str());
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

void Print(const Record& record, Form form)
{
    if (form == Form::Json)
    {
        std::puts(Dump(ToJson(record), 2).c_str());
        return;
    }
    size_t width = 0;
    for (const Field& field : record)
        width = std::max(width, field.name.size());
    for (const Field& field : record)
        std::puts((Padded(Label(field.name), width + 2) + Painted(CellText(field), Style(field))).c_str());
}

void PrintTable(const std::vector<Record>& records, Form form)
{
    if (form == Form::Json)
    {
        Json array = Json::array();
        for (const Record& record : records)
            array.push_back(ToJson(record));
        std::puts(Dump(array, 2).c_str());
        return;
    }
    if (records.empty())
        return;

    Cells rows(1);
    for (const Field& field : records.front())
        rows.front().push_back({Label(field.name), kBold});
    for (const Record& record : records)
    {
        rows.emplace_back();
        for (const Field& field : record)
            rows.back().push_back({CellText(field), Style(field)});
    }
    if (!Fits(ColumnWidths(rows)) && Fits(ColumnWidths(Transposed(rows))))
        rows = Transposed(rows);
    const std::vector<size_t> widths = ColumnWidths(rows);
    for (const auto& row : rows)
        PrintRow(row, widths);
}

void PrintLine(const Record& record, Form form)
{
    std::string line;
    if (form == Form::Json)
        line = Dump(ToJson(record), -1);
    else
        for (const Field& field : record)
            line += line.empty() ? CellText(field) : " " + field.name + "=" + LineText(field.value);
    std::puts(line.c_str());
    if (std::fflush(stdout) != 0)
        g_main_context_wakeup(nullptr); // whoever waits for what is printed here sees that nobody reads it any more
}

std::string Mask(std::string text, size_t first, size_t last, Identifiers identifiers)
{
    if (identifiers == Identifiers::Shown)
        return text;
    if (first + last >= text.size())
        first = last = 0;
    std::fill(text.begin() + static_cast<std::ptrdiff_t>(first), text.end() - static_cast<std::ptrdiff_t>(last), '*');
    return text;
}
