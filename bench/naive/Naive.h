#ifndef KIV_NAIVE_H
#define KIV_NAIVE_H

#pragma GCC visibility push(default)

/// The creation frame and a lookup as one would write them first: the lock's name is printed on each call and looked up in a map
/// under a mutex of its own, and the key is compared with one row after the other.
namespace naive
{

struct Manager
{
    static Manager* GetInstance();
    void GetCountryNameFromMcc(const char* mcc, char** countryName);
};

/// The facade's lookup: guard, manager, search, copy.
void GetCountryNameFromMcc(const char* mcc, char** countryName);

} // namespace naive

#pragma GCC visibility pop

#endif
