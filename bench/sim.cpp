#include "Items.h"
#include "Ratios.h"

#include <DASystem.h>

#include <cstdlib>
#include <glib.h>

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

} // namespace

void AddSimQueries()
{
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
