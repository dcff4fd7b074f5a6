#ifndef KIV_NAIVE_H
#define KIV_NAIVE_H

#pragma GCC visibility push(default)

/// Straightforward versions of GetInstance() and of a lookup: each call formats the lock's name and looks it up in a map under
/// another mutex, and compares the key with one row after the other.
namespace naive
{

struct Manager
{
    static Manager* GetInstance();
    void GetCountryNameFromMcc(const char* mcc, char** countryName);
};

/// The facade's lookup: check of the key, manager, search, copy.
void GetCountryNameFromMcc(const char* mcc, char** countryName);

} // namespace naive

#pragma GCC visibility pop

#endif
