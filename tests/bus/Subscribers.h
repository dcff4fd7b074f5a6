#ifndef KIV_TESTS_SUBSCRIBERS_H
#define KIV_TESTS_SUBSCRIBERS_H

#include "support/Test.h"

#include <DASubscriberInfo.h>

namespace kiv::test
{

/// A subscriber store in memory, with one list for every kind and key. It replaces the support library's in every program that
/// links it, and accepts records that the real one refuses.
struct Subscribers
{
    Subscribers() { current = this; }
    ~Subscribers() { current = nullptr; }

    std::vector<_SubscriberInfo> records;
    std::vector<std::string> asked; ///< the library's queries: "kind key"

    std::mutex mutex; ///< guards `asked`
    static inline Subscribers* current = nullptr;
};

} // namespace kiv::test

#endif
