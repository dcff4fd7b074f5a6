#include "Visible.h"

#include <glib.h>

namespace
{

bool IsPlain(gunichar character)
{
    const GUnicodeType type = g_unichar_type(character);
    return type != G_UNICODE_CONTROL && type != G_UNICODE_FORMAT && type != G_UNICODE_LINE_SEPARATOR &&
           type != G_UNICODE_PARAGRAPH_SEPARATOR;
}

std::string Hexadecimal(const char* format, guint number)
{
    g_autofree char* text = g_strdup_printf(format, number);
    return text;
}

std::string Escape(gunichar character)
{
    if (character == '\n')
        return "\\n";
    if (character == '\t')
        return "\\t";
    return Hexadecimal(character < 0x80 ? "\\x%02x" : character < 0x10000 ? "\\u%04x" : "\\U%08x", character);
}

} // namespace

std::string kiv::platform::Visible(const std::string& text)
{
    std::string visible;
    const char* const end = text.data() + text.size();
    for (const char* at = text.data(); at != end;)
    {
        const gunichar character = g_utf8_get_char_validated(at, end - at);
        if (character >= static_cast<gunichar>(-2)) // not UTF-8, or cut off
        {
            visible += Hexadecimal("\\x%02x", static_cast<unsigned char>(*at++));
            continue;
        }
        const char* const next = g_utf8_next_char(at);
        visible += IsPlain(character) ? std::string(at, next) : Escape(character);
        at = next;
    }
    return visible;
}
