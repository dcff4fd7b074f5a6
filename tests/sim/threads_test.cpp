// Two threads on different operations at the same time, with the support library's own locks.
#include <DASystem.h>
#include <SimulatedDevice.h>

#include <gtest/gtest.h>

#include <functional>
#include <thread>

namespace
{

using kiv::sim::Call;
namespace sim = kiv::sim;

thread_local const char* part = "";

TEST(SimThreads, DoNotComeIntoEachOthersOperations)
{
    ASSERT_EQ("", sim::UseProfile("dual"));
    sim::SetCallHook(
        [](Call, int)
        {
            std::this_thread::yield();
            return part;
        });
    sim::StartJournal();
    const auto repeat = [](const char* name, const std::function<bool()>& work)
    {
        part = name;
        for (int i = 0; i < 200; ++i)
            EXPECT_TRUE(work());
    };
    DASystem& facade = *DASystem::GetInstance();
    std::string modem = sim::GetDevice().slots.at(0).cpName, mcc, mnc, msin;
    bool roaming = true;
    auto status = TAPI_SIM_STATUS_UNKNOWN;
    int smsStatus = 0, serviceType = 0;
    const auto readIdentity = [&]
    { return facade.IsSimExist() && facade.GetSimInfo(modem.c_str(), &mcc, &mnc, &msin) && facade.GetRoamingStatus(0, &roaming); };
    const auto prepareAnSms = [&]
    { return facade.CheckSmsEnabled(modem.data(), &smsStatus) && facade.IsAvaliableSendSMS(0, &status, &serviceType); };
    std::thread identity(repeat, "identity", readIdentity), sms(repeat, "sms", prepareAnSms);
    identity.join();
    sms.join();

    // Each of these operations ends with a call that closes; where the thread changes, one has ended.
    const auto journal = sim::TakeJournal();
    int changes = 0;
    for (std::size_t i = 1; i < journal.size(); ++i)
    {
        const bool isChange = journal[i].note != journal[i - 1].note;
        changes += int{isChange};
        EXPECT_TRUE(!isChange || journal[i - 1].call == Call::telephony_deinit || journal[i - 1].call == Call::tel_deinit) << i;
    }
    EXPECT_GT(changes, 0);
    EXPECT_EQ(std::vector<std::string>(), sim::OpenHandles());
    EXPECT_EQ(std::vector<std::string>(), sim::TakeMisuses());
}

} // namespace
