#ifndef KIV_TESTS_SUBSCRIBERS_H
#define KIV_TESTS_SUBSCRIBERS_H

#include "support/Test.h"

#include <DASubscriberInfo.h>

namespace kiv::test
{

/// A subscriber store in memory, which knows one list for every kind and key. It stands in front of the support library's in every
/// program that is linked with it, and holds records that the real one would refuse.
struct Subscribers
{
    Subscribers() { current = this; }
    ~Subscribers() { current = nullptr; }

    std::vector<_SubscriberInfo> records;
    std::vector<std::string> asked; ///< what the library asked for: "kind key"

    std::mutex mutex; ///< of `asked`
    static inline Subscribers* current = nullptr;
};

} // namespace kiv::test

#endif
