#ifndef KIV_TESTS_PRIVATEBUS_H
#define KIV_TESTS_PRIVATEBUS_H

#include "support/Test.h"

#include <BusDaemon.h>

namespace kiv::test
{

using bench::Connection;
using bench::Unref;
using Message = std::unique_ptr<GDBusMessage, Unref>;

/// The system bus of this process, from whose making on GLib has nothing to say: a warning of its fails the test.
struct PrivateBus : bench::BusDaemon
{
    /// @param configuration  as BusDaemon takes it
    explicit PrivateBus(std::string configuration = {});

    /// Lets GLib say this after all.
    static void Tolerate(const char* message);
};

} // namespace kiv::test

#endif
