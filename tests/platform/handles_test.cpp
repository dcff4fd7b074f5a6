#include "support/Test.h"

#include <ITapiSim.h>
#include <SimulatedDevice.h>
#include <net_connection.h>
#include <telephony.h>

using namespace kiv::sim;
using testing::StartsWith;

namespace
{

TEST(Handles, ThatAreOpenAndWhatWasDoneWronglyWithThemAreTold)
{
    telephony_handle_list_s list{};
    connection_h connection = nullptr;
    ASSERT_EQ(0, telephony_init(&list));
    TapiHandle* const modem = tel_init("modem1");
    ASSERT_EQ(0, connection_create(&connection));
    EXPECT_THAT(OpenHandles(),
        testing::UnorderedElementsAre(StartsWith("handle list, opened by telephony_init call 1 from platform_test+0x"),
            StartsWith("TAPI handle of slot 1, opened by tel_init call 1 from platform_test+0x"),
            StartsWith("connection handle, opened by connection_create call 1")));

    telephony_handle_list_s copy = list;
    const telephony_h second = list.handle[1];
    telephony_sim_state_e state{};
    EXPECT_NE(0, tel_deinit(reinterpret_cast<TapiHandle*>(second)));
    EXPECT_EQ(0, connection_destroy(connection));
    EXPECT_EQ(0, tel_deinit(modem));
    EXPECT_EQ(0, telephony_deinit(&list));
    EXPECT_EQ(0, telephony_deinit(&list)) << "an empty list closes nothing";
    const int refusals[] = {telephony_deinit(&copy), telephony_sim_get_state(second, &state), tel_deinit(modem),
        tel_deinit(nullptr), connection_destroy(&state)};
    EXPECT_THAT(refusals, testing::Each(testing::Ne(0)));
    EXPECT_THAT(OpenHandles(), testing::IsEmpty());
    EXPECT_THAT(TakeMisuses(),
        testing::ElementsAre(
            StartsWith("tel_deinit: needs a TAPI handle, got a telephony handle of slot 1, opened by telephony_init call 1"),
            StartsWith("telephony_deinit: closed twice: handle list, opened by telephony_init call 1 from "),
            StartsWith("telephony_sim_get_state: used after closing: telephony handle of slot 1, opened by telephony_init call 1"),
            StartsWith("tel_deinit: closed twice: TAPI handle of slot 1"), "tel_deinit: needs a TAPI handle, got null",
            "connection_destroy: needs a connection handle, got what never was a handle"));
}

} // namespace
