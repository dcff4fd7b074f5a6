#include "Items.h"
#include "Ratios.h"

#include <DASystem.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <glib.h>

namespace
{

int copies = 0;

} // namespace

/// In front of the C library's, to count the texts that the library copies.
extern "C" char* strdup(const char* text) noexcept
{
    ++copies;
    const std::size_t size = std::strlen(text) + 1;
    void* const copy = std::malloc(size);
    return copy == nullptr ? nullptr : static_cast<char*>(std::memcpy(copy, text, size));
}

namespace kiv::bench
{

namespace
{

/// The platform calls of one IMSI query over two slots, in its order. What is allocated beyond them by the query: for each answer
/// the reader's copy and the one handed out.
void ImsiCallsBare()
{
    telephony_handle_list_s list = {};
    telephony_init(&list);
    for (unsigned slot = 0; slot < list.count; ++slot)
    {
        telephony_sim_state_e state{};
        telephony_sim_get_state(list.handle[slot], &state);
        char** const names = tel_get_cp_name_list();
        TapiHandle* const modem = tel_init(names[slot]);
        g_strfreev(names);
        TelSimImsiInfo_t imsi = {};
        tel_get_sim_imsi(modem, &imsi);
        benchmark::DoNotOptimize(imsi);
        tel_deinit(modem);
    }
    telephony_deinit(&list);
}

/// Tells how many copies one query makes: two an answer, the reader's and the one handed out.
void CountCopies()
{
    std::vector<char*> imsis;
    int count = 0;
    DASystem::GetInstance()->GetIMSIFromSim(&imsis, &count); // what is made once is made
    copies = 0;
    DASystem::GetInstance()->GetIMSIFromSim(&imsis, &count);
    std::printf("copies that an IMSI query over two slots makes: %d for %d answers\n", copies, count);
    for (char* const imsi : imsis)
        std::free(imsi);
}

} // namespace

void AddSimQueries()
{
    CountCopies();
    const auto library = [](benchmark::State& state)
    {
        std::vector<char*> imsis;
        imsis.reserve(2);
        for (auto _ : state)
        {
            int count = 0;
            DASystem::GetInstance()->GetIMSIFromSim(&imsis, &count);
            if (count != 2)
                state.SkipWithError("the profile must have two SIMs that answer");
            for (char* const imsi : imsis)
                std::free(imsi);
            imsis.clear();
        }
    };
    const auto bare = [](benchmark::State& state)
    {
        for (auto _ : state)
            ImsiCallsBare();
    };
    Compare("IMSI query over two slots, against platform calls", {1.1, 1000}, Clock::Cpu, library, bare);
}

} // namespace kiv::bench
