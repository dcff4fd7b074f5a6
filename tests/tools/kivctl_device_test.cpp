#include "tools/KivctlTest.h"

namespace kiv::test
{
namespace
{

TEST_F(KivctlTest, ShowsAndChangesTheValuesOfADeviceFile)
{
    const std::tuple<std::string, int, std::string, const char*> steps[] = {
        {"-p ./x device set --from roamin", 10, "", "\"roamin\" is not a profile; profiles are dual, "},
        {"-p ./x device unset runtime.flight-mode", 10, "", "./x: No such file"},
        {"-p ./x device set --from roaming runtime.wifi-status=2", 0, "", ""},
        {"-p ./x device get runtime.wifi-status", 0, "connected\n", ""},
        {"-p ./x device get profile.description -t", 0, "profile.description:one slot, its SIM roaming, with data allowed\n", ""},
        {"-p ./x device set --from single", 10, "", "./x: already exists; "},
        {"-p ./x device unset runtime.wifi-status runtime.nothing", 10, "", "[runtime] nothing: not in the file"},
        {"-p ./x device get runtime.wifi-status", 0, "connected\n", ""},
        {"-p ./x device unset runtime.wifi-status sim0.number", 0, "", ""},
        {"-p ./x device get runtime.wifi-status", 0, "off\n", ""},
        {"-p ./x device get sim0.number", 1, "", "sim0.number has no value"},
        {"-p ./x device get sim0.imei", 0, "356938035643809\n", ""},
        {"-p ./x device get sim0.imei -t", 0, "sim0.imei:356938035643809\n", ""},
        {"-p ./x device get -t", 0, "\nsim0.imei:***********3809\n", ""},
        {"-p ./x device get -t", 0, "\nsim0.msin:**********\n", ""},
        {"-p single device get -t", 0, "\nsim0.number:***********78\n", ""},
        {"-p ./x device get -t", 0, "\ndevice.serial:*********6789\n", ""},
        {"-p ./x device get -t", 0, "\ndevice.tizen-id:***********9wPq\n", ""},
        {"-p ./x device get -t --show-ids", 0, "\nsim0.imei:356938035643809\n", ""},
        {"-p ./x device get sim0.imie", 2, "", "(did you mean \"sim0.imei\"?)"},
        {"-p ./x device set faults.tel_get_sim_imsi@1=-5", 0, "", ""},
        {"-p ./x sim --fields imsi -t", 0, "\n", ""},
        {"-p ./x device set faults.tel_get_cp_name_list=-1", 0, "", ""},
        {"-p ./x sim", 1, "", "this device has no modem"},
        {"-p ./x device set", 2, "", "nothing to change"},
        {"profiles show singel", 10, "", "did you mean \"single\"?"},
        {"profiles show single", 0, "[profile]\ndescription=one slot, its SIM ready\n", ""},
        {"profiles show single -t", 0, "\nsim0.card-status:ready\n", ""},
    };
    for (const auto& [arguments, exit, out, err] : steps)
    {
        const Outcome outcome = Kivctl(arguments);
        EXPECT_EQ(exit, outcome.exit) << arguments << "\n" << outcome.err;
        EXPECT_THAT(outcome.out, HasSubstr(out)) << arguments;
        EXPECT_EQ(out.empty(), outcome.out.empty()) << arguments;
        EXPECT_THAT(outcome.err, HasSubstr(err)) << arguments;
    }
}

TEST_F(KivctlTest, NamesTheProfileThatANewDeviceFileStartsFrom)
{
    const Outcome made("env KIV_PROFILE=roaming " KIVCTL " -p ./x device set network.wifi=off");
    EXPECT_EQ("kivctl: created ./x from the profile roaming\n", made.err);
    EXPECT_EQ("true\n", Kivctl("-p ./x device get sim0.roaming").out);
    EXPECT_EQ("", Kivctl("-p ./x device set network.wifi=connected").err);
    EXPECT_EQ("kivctl: created ./y from the profile dual\n", Kivctl("-p ./y device set network.wifi=off").err);
    EXPECT_EQ("1\n", Kivctl("-p ./y device get telephony.preferred-voice").out);
    const Outcome fromHost("env KIV_PROFILE=host " KIVCTL " -p ./z device set network.wifi=off");
    EXPECT_EQ("kivctl: created ./z from the profile dual\n", fromHost.err);
}

TEST_F(KivctlTest, DoctorListsRecordsWithoutAReachableService)
{
    const auto examine = [] { return Kivctl("doctor -t --fields finding,remedy").out; };
    EXPECT_THAT(examine(), HasSubstr("\nnone:\n"));
    const Service client(KIVCTL " subscribe --name a.b --kind auth");
    EXPECT_THAT(examine(), HasSubstr("\neach one is on the bus, or the bus can start it:\n"));
    for (const char* record : {"status 7 org.gone.Away /a a.b", "push 'two words' :1.999 /a a.b"})
        ASSERT_EQ(0, Kivctl(std::string("subscribers add ") + record).exit);
    EXPECT_THAT(
        examine(), AllOf(HasSubstr("\nstatus 7\\: no program owns org.gone.Away, and the bus cannot start one:start the service, "
                                   "or remove its record\\: "
                                   "kivctl subscribers remove status 7 org.gone.Away /a a.b\n"),
                       HasSubstr("remove push 'two words' \\:1.999 /a a.b\n"), testing::Not(HasSubstr("no program owns a.b"))));
    EXPECT_EQ(1, Kivctl("doctor").exit);
}

} // namespace
} // namespace kiv::test
