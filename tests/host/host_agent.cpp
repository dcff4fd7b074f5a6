// An agent on the machine itself, for a test that starts and stops the daemons around it. Obeys lines of standard input, and ends
// each reply with an empty line:
//   ask    prints a line "QUERY ANSWER" for each query
//   start  makes all queries from six threads until "stop", and sets and removes a listener
//   N      what begins from now on begins in phase N; prints a line "TIMES FIRST-PHASE LAST-PHASE QUERY ANSWER" for each distinct
//          answer since the last phase began
//   stop   the same
// The fields of a line are separated by tabs.
#include "sweep/Members.h"
#include "sweep/Operations.h"

#include <DASystem.h>

#include <condition_variable>
#include <iostream>
#include <optional>

namespace
{

using namespace kiv::test;
using Report = std::function<void(const std::string& query, const std::string& answer)>;

// Makes the queries that depend on the machine. Polling is none of them: it waits for minutes where there is no modem.
void Query(const Report& report)
{
    const Given package{"dpkg"};
    Session session;
    for (const Operation& operation : Operations("abstract:one", 0))
    {
        const bool isQuery = operation.kind == Kind::Walk || (operation.kind == Kind::Single && !operation.failing.empty());
        if (isQuery && operation.name.find("Polling") == std::string::npos && (!operation.needsHandle || session.given.count != 0))
            report(operation.name, operation.run(session));
    }
    report("version of dpkg", CallMember(&DASystem::GetPackageVersion, package, session).substr(1));
    report("dpkg is installed", CallMember(&DASystem::IsPackageInstalled, package, session).substr(1));
}

// The answers of one thread.
struct Heard
{
    void Note(int begin, int end, const std::string& query, const std::string& answer)
    {
        const std::lock_guard lock(mutex);
        ++answers[std::to_string(begin) + '\t' + std::to_string(end) + '\t' + query + '\t' + answer];
    }

    void Print()
    {
        const std::lock_guard lock(mutex);
        for (const auto& [answer, times] : std::exchange(answers, {}))
            std::cout << times << '\t' << answer << '\n';
    }

    std::mutex mutex;
    std::map<std::string, unsigned> answers;
};

// Six threads that make queries, and a listener.
class Stress : IDAConnectionStateListener
{
public:
    Stress()
    {
        for (Heard& heard : queries_)
            threads_.push_back(std::async(std::launch::async, [&] { Ask(heard); }));
        threads_.push_back(std::async(std::launch::async, [this] { Listen(); }));
    }

    void Enter(int phase)
    {
        phase_ = phase;
        changes_.Print();
        for (Heard& heard : queries_)
            heard.Print();
    }

    // Call it while no change is being delivered.
    void End()
    {
        {
            const std::lock_guard lock(mutex_);
            ended_ = true;
            removed_.notify_all();
        }
        threads_.clear(); // which waits for them
        for (const auto& texts : {kiv::platform::OpenHandles(), kiv::platform::TakeMisuses()})
            for (const std::string& text : texts)
                changes_.Note(phase_, phase_, "handle", text);
        Enter(phase_);
    }

private:
    void Ask(Heard& heard)
    {
        while (!ended_)
            Query([&, begin = phase_.load()](const auto& query, const auto& answer) { heard.Note(begin, phase_, query, answer); });
    }

    // This thread sets the listener. The thread that notifies it removes it, once it is set completely. So neither happens while
    // a change is being delivered.
    void Listen()
    {
        std::unique_lock lock(mutex_);
        while (!ended_)
        {
            changes_.Note(phase_, phase_, "registration", "done");
            count_ = 0;
            last_.clear();
            lock.unlock();
            DASystem::GetInstance()->SetConnectionEventListener(this, nullptr);
            lock.lock();
            isSet_ = true;
            removed_.wait(lock, [this] { return !isSet_ || ended_; });
        }
        lock.unlock();
        DASystem::GetInstance()->SetConnectionEventListener(nullptr, nullptr);
    }

    void Hear(const char* change, int value, int queried)
    {
        const std::lock_guard lock(mutex_);
        int& last = last_.emplace(change, -1).first->second;
        const bool isNew = std::exchange(last, value) != value;
        changes_.Note(
            phase_, phase_, change, Tell(value, isNew ? "new" : "again", value == queried ? "agreed" : "denied").substr(1));
        if (++count_ < 3 || !isSet_)
            return;
        DASystem::GetInstance()->SetConnectionEventListener(nullptr, nullptr);
        isSet_ = false;
        removed_.notify_all();
    }

    // There is no Wi-Fi.
    void OnWifiDeviceStateChanged(wifi_device_state_e state, void*) override { Hear("wifi device", state, -1); }
    void OnWifiConnectionStateChanged(wifi_connection_state_e state, void*, void*) override { Hear("wifi", state, -1); }
    void OnWifiConnectedChanged(bool isConnected, void*) override { Hear("wifi status", isConnected, -1); }
    void OnFlightModeChanged(bool isOn, void*) override { Hear("flight mode", isOn, DASystem::GetInstance()->IsFlightMode()); }
    void OnPacketDataChanged(bool isOn, void*) override { Hear("packet data", isOn, DASystem::GetInstance()->IsMobileData()); }

    std::atomic<int> phase_{0};
    std::atomic<bool> ended_{false};
    std::vector<std::future<void>> threads_;
    std::array<Heard, 6> queries_;
    Heard changes_;

    std::mutex mutex_; // guards what follows
    std::condition_variable removed_;
    bool isSet_ = false;
    unsigned count_ = 0;              // of changes since the listener was set
    std::map<std::string, int> last_; // value of each of them
};

} // namespace

int main()
{
    std::optional<Stress> stress;
    for (std::string line; std::getline(std::cin, line); std::cout << std::endl)
    {
        if (line == "ask")
            Query([](const auto& query, const auto& answer) { std::cout << query << '\t' << answer << '\n'; });
        else if (line == "start")
            stress.emplace();
        else if (line == "stop")
            stress->End();
        else
            stress->Enter(std::stoi(line));
    }
}
