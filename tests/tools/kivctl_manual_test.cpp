#include "tools/KivctlTest.h"

namespace kiv::test
{
namespace
{

using Words = std::set<std::string>;

/// The texts of the pattern's group in all its matches.
Words All(const char* pattern, const std::string& text)
{
    const std::regex regex(pattern);
    return {std::sregex_token_iterator(text.begin(), text.end(), regex, 1), std::sregex_token_iterator()};
}

/// The completions of the last of those words, one per line. A shell reads the words.
std::string Complete(const std::string& words)
{
    return Kivctl("complete-words " + words).out;
}

TEST_F(KivctlTest, PrintsWhatThePagesShow)
{
    std::map<std::string, Service> running; // by the expected output
    const std::string pages = Contents(KIV_DOCS "/profiles.md") + Contents(KIV_DOCS "/kivctl.md");
    g_auto(GStrv) examples = g_strsplit(pages.c_str(), "\n$ kivctl ", -1);
    EXPECT_LT(42U, g_strv_length(examples));
    for (char** rest = examples + 1; *rest != nullptr; ++rest)
    {
        const std::string text = *rest, example = text.substr(0, text.find("\n```")) + '\n';
        const std::string arguments = example.substr(0, example.find('\n'));
        const std::string printed = example.substr(arguments.size() + 1);
        if (arguments.back() == '&')
        {
            running.try_emplace(printed, KIVCTL " " + arguments.substr(0, arguments.size() - 2));
            continue;
        }
        const Outcome outcome = Kivctl(arguments);
        const std::string end = outcome.exit ? "(exit code " + std::to_string(outcome.exit) + ")\n" : "";
        EXPECT_EQ(Steady(printed), Steady(outcome.out + outcome.err + end)) << arguments;
    }
    for (const auto& [printed, program] : running)
    {
        program.Await(printed);
        EXPECT_EQ(printed, program.Out());
    }

    const Words rows = All("\n(\\| `kivctl [^`]*` \\| (?:object|array) \\| .*) \\|", pages); // of the table of JSON fields
    EXPECT_EQ(18U, rows.size());
    for (const std::string& row : rows)
    {
        const std::string verb = *All("`kivctl (.*?)`", row).begin();
        const std::string out = Kivctl("--json --profile single " + verb).out;
        Words names = All("\"(\\w+)\": ?", out);
        names.erase("notes");
        EXPECT_EQ(All("`(\\w+)`", row), names) << row;
        const bool isQuery = row.find("`event`") == row.npos && row.find("`result`") == row.npos;
        if (isQuery)
        {
            EXPECT_THAT(All("(\\w+)\n", Complete(verb + " --fields ''")), testing::IsSupersetOf(names)) << row;
        }
        EXPECT_EQ(row.find("| array |") != row.npos, out.front() == '[') << row;
    }
}

TEST_F(KivctlTest, PagesAndCompletionCoverTheWholeHelp)
{
    const std::string man = std::regex_replace(Kivctl("print-man-page").out, std::regex(R"(\\([-:]))"), "$1");
    const std::string general = Kivctl("--help").out, page = Contents(KIV_DOCS "/kivctl.md");
    const char* const inHelp = "(?:\n  |, )(--?[a-z-]+)";
    const Words everywhere = All(inHelp, general);
    EXPECT_THAT(everywhere, testing::Contains("--json"));
    const std::vector<std::string> verbs = Verbs();
    for (const std::string& verb : verbs)
    {
        const std::string whole = Kivctl(verb + " --help").out, help = whole.substr(0, whole.find("Options of every"));
        Words words = All("\n  ([a-z]+)  ", help);
        words.merge(All(inHelp, help));
        EXPECT_EQ(help.find("Options of every verb"), help.rfind("Options of every verb")) << verb;
        words.insert(everywhere.begin(), everywhere.end());
        EXPECT_THAT(All("([^\t\n]+)(?:\t[^\n]*)?\n", Complete(verb + " ''") + Complete(verb + " -")), testing::IsSupersetOf(words))
            << verb;

        const std::string below = man.substr(man.find(verb.empty() ? ".SH OPTIONS" : ".SS \"" + verb + " ["));
        Words described = All(R"((?:\\fB|, )(--?[a-z-]+))", below.substr(0, below.find("\n.S")));
        described.insert({"-h", "--help"}); // described once for all verbs
        EXPECT_THAT(described, testing::IsSupersetOf(All(inHelp, help))) << verb;
    }
    EXPECT_EQ(24U, verbs.size());

    const Words variables = All("\n  ([A-Z_]{6,})  ", general);
    EXPECT_EQ(5U, variables.size());
    for (const std::string& variable : variables)
        EXPECT_THAT(man, HasSubstr("\n\\fB" + variable + "\\fR\n"));

    const Words codes = All("\n +([0-9]+  .*)", general);
    EXPECT_EQ(11U, codes.size());
    for (const std::string& code : codes)
    {
        EXPECT_THAT(page, HasSubstr("| " + std::regex_replace(code, std::regex("  "), " | ") + " |\n"));
        EXPECT_THAT(man, HasSubstr("\\fB" + std::regex_replace(code, std::regex("  "), "\\fR\n")));
    }
}

TEST_F(KivctlTest, CompletesAWordFromTheWordsBeforeIt)
{
    for (const char* record : {"status 7 org.a.B /x a.b", "auth all org.c.D /y c.d", "push mail org.a.B /x a.b"})
        Kivctl(std::string("subscribers add ") + record);
    const std::pair<const char*, const char*> cases[] = {
        {"device set runtime.fl", "runtime.flight-mode=\twhether flight mode is on\n"},
        {"device set runtime.flight-mode=t", "runtime.flight-mode=true\n"},
        {"device set -p ./x network.wifi-device=", "network.wifi-device=off\nnetwork.wifi-device=on\n"},
        {"device set sim1.sms", "sim1.sms-status=\twhether the modem is ready for text messages\n"},
        {"device get sim1.imei", "sim1.imei\tIMEI of the modem\n"},
        {"device unset runtime.fl", "runtime.flight-mode\twhether flight mode is on\n"},
        {"device set --from sl", "slow-sim\tone slot, its SIM ready at the fourth read\n"},
        {"profiles show roa", "roaming\tone slot, its SIM roaming, with data allowed\n"},
        {"network --profile=ro", "--profile=roaming\tone slot, its SIM roaming, with data allowed\n:files\n"},
        {"-p nothing", ":files\n"},
        {"subscribe --store=s", ":files\n"},
        {"notify on --to ''", "subscribers\nmanager\n"},
        {"notify on --service 7 po", "policy\n"},
        {"--color=a", "--color=auto\n--color=always\n"},
        {"sim w", "wait\tWait until a SIM is usable, checking once per second\n"},
        {"sim --sl", "--slot\tUse only this slot, counted from 0\n"},
        {"subscribers remove ''", "auth\npush\nstatus\n"},
        {"subscribers remove status ''", "7\n"},
        {"subscribers remove push mail ''", "org.a.B\n"},
        {"subscribers add status ''", "7\nall\n"},
        {"completion ''", "bash\nzsh\nfish\n"},
        {"device id --fields=d", "--fields=device_id\n"},
        {"network --fields wifi,", "wifi,cellular\nwifi,bluetooth\nwifi,connected\n"},
    };
    for (const auto& [words, offered] : cases)
        EXPECT_EQ(offered, Complete(words)) << words;
}

} // namespace
} // namespace kiv::test
