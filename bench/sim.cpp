#include "Items.h"
#include "Ratios.h"

#include <DASystem.h>

#include <cstdlib>
#include <cstring>
#include <glib.h>

namespace
{

int copies = 0;

} // namespace

/// Replaces the C library's function, to count the library's copies.
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

/// Makes the platform calls of one IMSI query over two slots, in the same order.
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

/// Makes one query through the library.
/// @return the number of answers
int ImsiQuery(std::vector<char*>& imsis)
{
    int count = 0;
    DASystem::GetInstance()->GetIMSIFromSim(&imsis, &count);
    for (char* const imsi : imsis)
        std::free(imsi);
    imsis.clear();
    return count;
}

} // namespace

void MeasureSimQueries(Table& table)
{
    constexpr int kQueries = 100;
    std::vector<char*> imsis;
    imsis.reserve(2);
    ImsiQuery(imsis); // makes what is made only once
    copies = 0;
    const int answers = ImsiQuery(imsis);
    if (const char* const item = "copies made by an IMSI query over two slots"; table.Wants(item))
    {
        // Per slot, the reader's copy and the caller's.
        const Outcome outcome = answers != 2 ? Outcome::NotMeasured : copies <= 4 ? Outcome::Met : Outcome::Missed;
        table.Add({item, "<= 4", outcome, static_cast<double>(copies), 0, 0, " texts",
            answers == 2 ? "" : "the device must have two SIMs that answer"});
    }
    Compare(table, {"IMSI query over two slots, against platform calls", {1.1, 1000}, CpuNs, kQueries,
                       {Times(kQueries, [&] { ImsiQuery(imsis); })}, {Times(kQueries, ImsiCallsBare)}});
}

} // namespace kiv::bench
