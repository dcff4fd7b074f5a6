#ifndef KIV_TESTS_KIVCTLTEST_H
#define KIV_TESTS_KIVCTLTEST_H

#include "support/Deliveries.h"
#include "support/PrivateBus.h"
#include "support/Texts.h"

#include <csignal>
#include <regex>

namespace kiv::test
{

using testing::AllOf;
using testing::HasSubstr;

/// The text without what differs from run to run and from machine to machine: times, addresses, directories, widths of columns.
inline std::string Steady(const std::string& text)
{
    const std::regex passing(R"(\d{4}-\d\d-\d\d \d\d:\d\d:\d\d|waited seconds +\d+|\d+(?= s:)|unix:[^ "]*|[^ "]*/)");
    return std::regex_replace(std::regex_replace(text, passing, ""), std::regex(" +"), " ");
}

/// A program that runs beside the test, in its directory, and is killed with its owner.
struct Program
{
    /// @param command  as a shell takes it
    explicit Program(const std::string& command)
    {
        const std::string line = "exec " + command + " >" + name + ".out 2>" + name + ".err";
        process.reset(g_subprocess_new(G_SUBPROCESS_FLAGS_NONE, nullptr, "sh", "-c", line.c_str(), nullptr));
    }
    ~Program() { g_subprocess_force_exit(process.get()); }

    std::string Out() const { return Contents(name + ".out"); }
    std::string Err() const { return Contents(name + ".err"); }

    /// Waits until it printed that.
    void Await(const std::string& text) const
    {
        SCOPED_TRACE(text);
        IterateUntil([&] { return Out().find(text) != std::string::npos; });
    }

    /// Waits for its end, which the signal brings about if there is one. @return the exit code; -1 when a signal ended it
    int End(int signal = 0)
    {
        g_subprocess_send_signal(process.get(), signal);
        g_subprocess_wait(process.get(), nullptr, nullptr);
        return g_subprocess_get_if_exited(process.get()) ? g_subprocess_get_exit_status(process.get()) : -1;
    }

    static inline int count = 0;
    const std::string name = std::to_string(++count);
    std::unique_ptr<GSubprocess, Unref> process;
};

/// One that says when it is ready.
struct Service : Program
{
    explicit Service(const std::string& command) : Program(command) { Await("ready"); }
};

/// One that has ended.
struct Outcome : Program
{
    explicit Outcome(const std::string& command) : Program(command) {}

    const int exit = End();
    const std::string out = Out(), err = Err();
};

inline Outcome Kivctl(const std::string& arguments)
{
    return Outcome(KIVCTL " " + arguments);
}

/// A bus, a subscriber store and a directory of its own for each test.
struct KivctlTest : testing::Test
{
    KivctlTest()
    {
        std::filesystem::current_path(directory);
        g_setenv("KIV_SUBSCRIBERS", (directory + "/subscribers.db").c_str(), TRUE);
    }
    ~KivctlTest() override { std::filesystem::remove_all(directory); }

    const std::string directory = mkdtemp((std::filesystem::temp_directory_path() / "kivctl-XXXXXX").string().data());
    PrivateBus bus;
};

} // namespace kiv::test

#endif
