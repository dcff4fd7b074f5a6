// The facade's members for the device language. They log nothing.
#include "DASystem.h"

#include "CountryTables.h"
#include "Handles.h"
#include "NoThrow.h"
#include "PlatformRead.h"

#include <system_settings.h>

using kiv::CString;

int DASystem::GetDeviceLanguageCode(char** languageCode, bool isISO639)
{
    char* value = nullptr;
    const int code = system_settings_get_value_string(SYSTEM_SETTINGS_KEY_LOCALE_LANGUAGE, &value);
    const CString owner(value);
    const char* const setting = code == 0 && value != nullptr ? value : "en_us";

    return kiv::NoThrow(code,
        [&]
        {
            const int end = GetTagStartPosition(setting, "_");
            std::string language = GetValueFromPosition(setting, 0, end - 1);
            for (char& ch : language)
                ch = To_Capital(ch);

            char* iso = nullptr;
            if (isISO639)
                GetISO639LangCodeFromDeviceLang(language, &iso);
            const char* const answer = isISO639 ? iso : language.c_str();
            if (answer != nullptr)
                kiv::CopyOut(answer, languageCode);
            return code;
        });
}

void DASystem::GetISO639LangCodeFromDeviceLang(std::string deviceLang, char** iso639LangCode)
{
    const std::size_t row = kiv::ISO639LangCodeTable::deviceLangCode.FirstRow(deviceLang.c_str());
    *iso639LangCode = row == kiv::kNoRow ? nullptr : const_cast<char*>(kiv::ISO639LangCodeTable::iso639LangCode[row]);
}

int DASystem::GetTagStartPosition(std::string source, std::string tag)
{
    const auto position = source.find(tag);
    return position == std::string::npos ? -1 : static_cast<int>(position);
}

std::string DASystem::GetValueFromPosition(std::string source, int startPosition, int endPosition)
{
    // Computed in a wider type. A negative length becomes a very large one and selects the text up to the end.
    const long long length = static_cast<long long>(endPosition) - startPosition + 1;
    return source.substr(static_cast<std::size_t>(startPosition), static_cast<std::size_t>(length));
}

char DASystem::To_Capital(char ch)
{
    return ch >= 'a' && ch <= 'z' ? static_cast<char>(ch - ('a' - 'A')) : ch;
}
