#ifndef KIV_TESTS_KIVCTLTEST_H
#define KIV_TESTS_KIVCTLTEST_H

#include "support/Deliveries.h"
#include "support/PrivateBus.h"
#include "support/Texts.h"

#include <csignal>
#include <regex>
#include <sys/stat.h>

namespace kiv::test
{

using testing::AllOf;
using testing::HasSubstr;

/// Removes what differs between runs and machines: times, addresses, directories, widths of columns.
inline std::string Steady(const std::string& text)
{
    const std::regex passing(R"(\d{4}-\d\d-\d\d \d\d:\d\d:\d\d|waited seconds +\d+|\d+(?= s:)|unix:[^ "]*|[^ "]*/)");
    return std::regex_replace(std::regex_replace(text, passing, ""), std::regex(" +"), " ");
}

/// A program that runs in parallel to the test, in its directory. It is killed when its owner is destroyed.
struct Program
{
    /// @param command  for a shell
    explicit Program(const std::string& command)
    {
        const std::string line = "exec " + command + " >" + name + ".out 2>" + name + ".err";
        process.reset(g_subprocess_new(G_SUBPROCESS_FLAGS_NONE, nullptr, "sh", "-c", line.c_str(), nullptr));
    }
    ~Program() { g_subprocess_force_exit(process.get()); }

    std::string Out() const { return Contents(name + ".out"); }
    std::string Err() const { return Contents(name + ".err"); }

    /// Waits until it has printed the text.
    void Await(const std::string& text) const
    {
        SCOPED_TRACE(text);
        IterateUntil([&] { return Out().find(text) != std::string::npos; });
    }

    /// Sends the signal, if there is one, and waits for the end. @return the exit code; -1 when a signal ended the program
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

/// A program that prints when it is ready. The constructor waits for that.
struct Service : Program
{
    explicit Service(const std::string& command) : Program(command) { Await("ready"); }
};

/// A program that has ended. The constructor waits for that.
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

/// Every verb, with the words before it. The first one is the program itself, as an empty text.
inline std::vector<std::string> Verbs()
{
    std::vector<std::string> verbs{""};
    const std::regex rows("\n  ([a-z]+)  ");
    for (size_t i = 0; i < verbs.size(); ++i)
    {
        const std::string verb = verbs[i], help = Kivctl(verb + " --help").out;
        for (std::sregex_iterator row(help.begin(), help.end(), rows), end; row != end; ++row)
            verbs.push_back(verb + (verb.empty() ? "" : " ") + row->str(1));
    }
    return verbs;
}

/// Each test has its own bus, subscriber store and directory.
struct KivctlTest : testing::Test
{
    KivctlTest()
    {
        std::filesystem::current_path(directory);
        mkfifo("keyboard", 0600); // nobody types; at the end of its input, a terminal would print what ends it
        g_setenv("KIV_SUBSCRIBERS", (directory + "/subscribers.db").c_str(), TRUE);
    }
    ~KivctlTest() override { std::filesystem::remove_all(directory); }

    const std::string directory = mkdtemp((std::filesystem::temp_directory_path() / "kivctl-XXXXXX").string().data());
    PrivateBus bus;
};

} // namespace kiv::test

#endif
