/// @file
/// The constant tables of countries and languages. If several rows have the same key, a lookup uses the first unless documented
/// otherwise.
#ifndef KIV_COUNTRYTABLES_H
#define KIV_COUNTRYTABLES_H

#include "Lookup.h"

namespace kiv
{

/// The rows as written. Only the compiler reads them; the library contains the columns below.
namespace listed
{

struct CountryInfo
{
    const char* mcc;         ///< mobile country code, ITU-T E.212
    const char* countryCode; ///< ISO 3166-1 alpha-2, lower case
    const char* countryName; ///< English
};

struct ServiceCountryCode
{
    const char* mcc;
    const char* serviceCountryCode; ///< such as "en_GB"
};

struct CountryCallingCode
{
    const char* mcc;
    const char* countryCallingCode; ///< digits, ITU-T E.164
};

struct Alpha3CountryCode
{
    const char* mcc;
    const char* alpha3CountryCode; ///< ISO 3166-1 alpha-3, upper case
};

struct ISO639LangCode
{
    const char* iso639LangCode; ///< ISO 639-2
    const char* deviceLangCode; ///< ISO 639-1, upper case
};

#define KIV_COUNTRY(mcc, countryCode, countryName) {mcc, countryCode, countryName},
#define KIV_COUNTRY_MO KIV_COUNTRY
inline constexpr CountryInfo kCountryInfo[] = {
#include "tables/CountryInfo.inc"
};
static_assert(std::size(kCountryInfo) == 236);
#undef KIV_COUNTRY_MO
#undef KIV_COUNTRY

#define KIV_COUNTRY(mcc, countryCode, countryName)
#define KIV_COUNTRY_MO(mcc, countryCode, countryName) {mcc, countryCode, countryName},
inline constexpr CountryInfo kMoSupportMcc[] = {
#include "tables/CountryInfo.inc"
};
static_assert(std::size(kMoSupportMcc) == 48);
#undef KIV_COUNTRY_MO
#undef KIV_COUNTRY

inline constexpr ServiceCountryCode kServiceCountryCode[] = {
#include "tables/ServiceCountryCode.inc"
};
static_assert(std::size(kServiceCountryCode) == 134);

#define KIV_COUNTRY_CODE(mcc, alpha3CountryCode, countryCallingCode) {mcc, countryCallingCode},
#define KIV_ALPHA3_ONLY(mcc, alpha3CountryCode)
inline constexpr CountryCallingCode kCountryCallingCode[] = {
#include "tables/CountryCodes.inc"
};
static_assert(std::size(kCountryCallingCode) == 236);
#undef KIV_ALPHA3_ONLY
#undef KIV_COUNTRY_CODE

#define KIV_COUNTRY_CODE(mcc, alpha3CountryCode, countryCallingCode) {mcc, alpha3CountryCode},
#define KIV_ALPHA3_ONLY(mcc, alpha3CountryCode) {mcc, alpha3CountryCode},
inline constexpr Alpha3CountryCode kAlpha3CountryCode[] = {
#include "tables/CountryCodes.inc"
};
static_assert(std::size(kAlpha3CountryCode) == 237);
#undef KIV_ALPHA3_ONLY
#undef KIV_COUNTRY_CODE

inline constexpr ISO639LangCode kISO639LangCode[] = {
#include "tables/ISO639LangCode.inc"
};
static_assert(std::size(kISO639LangCode) == 160);

} // namespace listed

/// DASimManager and DASystem search it.
struct CountryInfoTable
{
    static constexpr KeyColumn<listed::kCountryInfo, &listed::CountryInfo::mcc> mcc{};
    static constexpr KeyColumn<listed::kCountryInfo, &listed::CountryInfo::countryCode> countryCode{};
    static constexpr TextColumn<listed::kCountryInfo, &listed::CountryInfo::countryName> countryName{};
};

/// The countries whose operators support mobile-originated messages. Only the MCCs are read.
struct MoSupportMccTable
{
    static constexpr KeyColumn<listed::kMoSupportMcc, &listed::CountryInfo::mcc> mcc{};
};

struct ServiceCountryCodeTable
{
    static constexpr KeyColumn<listed::kServiceCountryCode, &listed::ServiceCountryCode::mcc> mcc{};
    static constexpr KeyColumn<listed::kServiceCountryCode, &listed::ServiceCountryCode::serviceCountryCode> serviceCountryCode{};
};

struct CountryCallingCodeTable
{
    static constexpr KeyColumn<listed::kCountryCallingCode, &listed::CountryCallingCode::mcc> mcc{};
    static constexpr KeyColumn<listed::kCountryCallingCode, &listed::CountryCallingCode::countryCallingCode> countryCallingCode{};
};

struct Alpha3CountryCodeTable
{
    static constexpr KeyColumn<listed::kAlpha3CountryCode, &listed::Alpha3CountryCode::mcc> mcc{};
    static constexpr KeyColumn<listed::kAlpha3CountryCode, &listed::Alpha3CountryCode::alpha3CountryCode> alpha3CountryCode{};
};

struct ISO639LangCodeTable
{
    static constexpr KeyColumn<listed::kISO639LangCode, &listed::ISO639LangCode::iso639LangCode> iso639LangCode{};
    static constexpr KeyColumn<listed::kISO639LangCode, &listed::ISO639LangCode::deviceLangCode> deviceLangCode{};
};

} // namespace kiv

#endif
