// An agent on the machine itself, for a test that starts and stops the daemons around it.
// usage: host_agent                  answers each line of standard input with what the device is, on one line
//        host_agent SECONDS IMSI...  asks everything from six threads; fails when an answer is none that may be
#include <DASystem.h>
#include <DeviceControl.h>
#include <runtime_info.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <iostream>
#include <sstream>
#include <thread>
#include <vector>

namespace
{

std::vector<std::string> Imsis()
{
    std::vector<char*> texts;
    int count = 0;
    DASystem::GetInstance()->GetIMSIFromSim(&texts, &count);
    std::vector<std::string> all(texts.begin(), texts.end());
    for (char* const text : texts)
        std::free(text);
    return all;
}

std::string Describe()
{
    DASystem* const system = DASystem::GetInstance();
    std::ostringstream line;
    line << "imsi=";
    for (const std::string& imsi : Imsis())
        line << imsi << ',';
    line << " cellular=" << system->GetCellularNetworkState() << " wifi=" << system->GetWifiNetworkState()
         << " flight=" << system->IsFlightMode() << " mobile=" << system->IsMobileData()
         << " roaming=" << system->IsDataRoamingEnabled();
    return line.str();
}

int Stress(std::chrono::seconds duration, const std::vector<std::string>& imsis)
{
    std::atomic<unsigned> wrong{0}, asked{0}, found{0};
    const auto end = std::chrono::steady_clock::now() + duration;
    const auto ask = [&](int thread)
    {
        DASystem* const system = DASystem::GetInstance();
        while (std::chrono::steady_clock::now() < end)
        {
            const std::vector<std::string> answers = Imsis();
            const bool areKnown = std::all_of(answers.begin(), answers.end(),
                [&](const std::string& imsi) { return std::find(imsis.begin(), imsis.end(), imsi) != imsis.end(); });
            const int cellular = system->GetCellularNetworkState();
            bool isRoaming = false;
            system->GetRoamingStatus(0, &isRoaming);
            char* name = nullptr;
            system->GetDeviceName(&name);
            std::free(name);
            if (!areKnown || answers.size() > imsis.size() || cellular < 0 || cellular > 5 || isRoaming || system->IsFlightMode())
                ++wrong;
            asked += 1;
            found += answers.empty() ? 0 : 1;
            if (thread == 0) // the platform's own registrations: the library's listener is for one thread
            {
                runtime_info_set_changed_cb(
                    RUNTIME_INFO_KEY_PACKET_DATA_ENABLED, [](runtime_info_key_e, void*) {}, nullptr);
                runtime_info_unset_changed_cb(RUNTIME_INFO_KEY_PACKET_DATA_ENABLED);
            }
        }
    };
    std::vector<std::thread> threads;
    for (int i = 0; i < 6; ++i)
        threads.emplace_back(ask, i);
    for (std::thread& thread : threads)
        thread.join();
    const bool isClean = kiv::platform::OpenHandles().empty() && kiv::platform::TakeMisuses().empty();
    std::printf("asked=%u found=%u wrong=%u clean=%d\n", asked.load(), found.load(), wrong.load(), isClean);
    return wrong == 0 && isClean && found > 0 && found < asked ? 0 : 1;
}

} // namespace

int main(int argc, char** argv)
{
    if (argc > 2)
        return Stress(std::chrono::seconds(std::atoi(argv[1])), {argv + 2, argv + argc});
    for (std::string line; std::getline(std::cin, line);)
        std::cout << Describe() << std::endl;
}
