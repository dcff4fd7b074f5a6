#ifndef KIV_TESTS_PRIVATEBUS_H
#define KIV_TESTS_PRIVATEBUS_H

#include "support/Test.h"

#include <BusDaemon.h>

namespace kiv::test
{

using bench::Connection;
using bench::Unref;
using Message = std::unique_ptr<GDBusMessage, Unref>;

/// A private system bus of this process. While it exists, every warning of GLib fails the test.
struct PrivateBus : bench::BusDaemon
{
    /// @param configuration  passed to BusDaemon
    explicit PrivateBus(std::string configuration = {});

    /// Allows GLib to print this.
    static void Tolerate(const char* message);
};

} // namespace kiv::test

#endif
