#ifndef KIV_TESTS_MEMBERS_H
#define KIV_TESTS_MEMBERS_H

// Calls any member: makes its arguments and describes its results, from their types only.
#include "sweep/World.h"

#include <ITapiSim.h>

namespace kiv::test
{

using Text = const char*;
using Slots = telephony_handle_list_s;
using Status = TelSimCardStatus_t;

/// The texts and numbers for the parameters of an operation.
struct Given
{
    Text text = "";
    double number = 0;
    bool keepsTexts = false; ///< the returned texts belong to the library
};

template <class... Values>
std::string Tell(const Values&... values)
{
    std::ostringstream text;
    text << std::boolalpha;
    ((text << ' ' << values), ...);
    return text.str();
}

inline char before[] = "before"; ///< value of a text before it is written

/// Describes a returned text, and frees it.
inline std::string Take(Text text)
{
    const std::string told = text == nullptr ? "null" : text;
    if (text != before)
        std::free(const_cast<char*>(text));
    return ' ' + told;
}

template <class Type, class... Others>
constexpr bool kIsOneOf = (std::is_same_v<Type, Others> || ...);
template <class Type>
constexpr bool kIsNumber = std::is_arithmetic_v<Type> || std::is_enum_v<Type>;
template <class Type>
constexpr bool kIsTextIn = kIsOneOf<Type, std::string, Text, char*>;
template <class Type>
constexpr bool kIsTextOut = kIsOneOf<Type, char**, Text*, Text&>;
template <class Type>
constexpr bool kIsHandles = kIsOneOf<Type, Slots, telephony_data**>;
template <class Type>
using Target = std::conditional_t<std::is_reference_v<Type>, std::remove_reference_t<Type>, std::remove_pointer_t<Type>>;
template <class Type>
using Held = std::conditional_t<kIsTextIn<Type>, std::string, std::conditional_t<kIsHandles<Type>, Slots, Target<Type>>>;

/// The argument for a parameter.
template <class Type>
struct Argument
{
    Argument(const Given& given, const Session& session) : keepsTexts(given.keepsTexts)
    {
        if constexpr (kIsNumber<Type>)
            value = static_cast<Type>(given.number);
        else if constexpr (kIsTextIn<Type>)
            value = given.text;
        else if constexpr (kIsHandles<Type>)
            value = session.given;
        else if constexpr (kIsTextOut<Type> || kIsOneOf<Type, std::string*>)
            value = before;
        else if constexpr (kIsOneOf<Type, std::vector<char*>*>)
            value = {before};
        else if constexpr (kIsOneOf<Type, bool*>)
            value = true;
        else if constexpr (kIsOneOf<Type, tm*>)
            value.tm_year = 1;
    }

    Type Pass()
    {
        if constexpr (kIsOneOf<Type, Text, char*>)
            return value.data();
        else if constexpr (kIsOneOf<Type, telephony_data**>)
            return value.handle;
        else if constexpr (std::is_pointer_v<Type>)
            return &value;
        else
            return value;
    }

    /// Describes the result. A number written by the platform counts only after a success.
    std::string TellOut(bool isDone) const
    {
        std::string told;
        if constexpr (kIsTextOut<Type>)
            told = keepsTexts ? Tell(value == nullptr ? "null" : value) : Take(value);
        else if constexpr (kIsOneOf<Type, tm*>)
            told = Tell(value.tm_year, value.tm_mon, value.tm_mday, value.tm_hour, value.tm_min, value.tm_sec, value.tm_wday,
                value.tm_yday);
        else if constexpr (kIsOneOf<Type, std::vector<char*>*>)
            for (char* const text : value)
                told += Take(text);
        else if constexpr (std::is_pointer_v<Type> && !kIsTextIn<Type> && !kIsHandles<Type>)
            told = isDone || kIsOneOf<Type, bool*, std::string*> ? Tell(value) : "";
        return told;
    }

    Held<Type> value{};
    bool keepsTexts;
};

template <class Result>
std::string TellResult(const Result& result)
{
    if constexpr (kIsOneOf<Result, char*>)
        return Take(result);
    if constexpr (!kIsOneOf<Result, char*, char**>)
        return Tell(result);
    if constexpr (kIsOneOf<Result, char**>)
    {
        g_auto(GStrv) names = result;
        g_autofree char* told = names == nullptr ? g_strdup("null") : g_strjoinv(" ", names);
        return Tell(told);
    }
}

/// Calls a member with arguments made for its parameters. @return its result and its out-parameters, a blank before each
template <class Class, class Result, class... Parameters>
std::string CallMember(Result (Class::*member)(Parameters...), const Given& given, const Session& session)
{
    std::tuple<Argument<Parameters>...> arguments{Argument<Parameters>(given, session)...};
    const auto call = [&](auto&... each) -> std::string
    {
        if constexpr (std::is_void_v<Result>)
        {
            (Class::GetInstance()->*member)(each.Pass()...);
            return ("" + ... + each.TellOut(true));
        }
        else
        {
            const Result result = (Class::GetInstance()->*member)(each.Pass()...);
            const bool isDone = kIsOneOf<Result, bool> ? result != Result{} : result == Result{};
            return (TellResult(result) + ... + each.TellOut(isDone));
        }
    };
    return std::apply(call, arguments);
}

template <class Class, class Result, class... Parameters>
constexpr bool TakesHandle(Result (Class::*)(Parameters...))
{
    return kIsOneOf<telephony_data**, Parameters...>;
}

} // namespace kiv::test

#endif
