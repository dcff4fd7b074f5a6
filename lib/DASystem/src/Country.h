/// @file
/// The row of the country tables: CountryInfoTable and MoSupportMccTable of DASimManager, and DASystem's copy of the first.
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
