/// @file
/// The rows of the country tables: CountryInfoTable of DASimManager and its copy in DASystem.
#ifndef KIV_COUNTRY_H
#define KIV_COUNTRY_H

namespace kiv
{

struct CountryInfo
{
    const char* mcc;         ///< mobile country code, ITU-T E.212
    const char* countryCode; ///< ISO 3166-1 alpha-2, lower case
    const char* countryName; ///< English
};

} // namespace kiv

#endif
