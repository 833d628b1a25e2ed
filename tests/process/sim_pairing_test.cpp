// The ways of pairing, and phones that ask for a connection by themselves.
#include "sim_unit.h"

#include <gtest/gtest.h>

#include <cstring>

namespace bt::test {
namespace {

class SimPairing : public testing::Test {
protected:
    TemporaryRoot root_;
    SimUnit unit_{"sim-pairing", root_.path(), "pairing"};
};

TEST_F(SimPairing, EachPhoneIsPairedInItsOwnWay)
{
    constexpr uint32_t kAgree = 0;
    constexpr uint32_t kRefuse = 1;
    struct Row {
        uint8_t phone;
        uint32_t prompt; // 0: the phone does not ask
        void (*reply)(const BtDevAddress& address);
        uint32_t result;
    };
    static const BtConPasskey right = {{'3', '1', '4', '1', '5', '9'}};
    static const BtConPasskey wrong = {{'3', '1', '4', '1', '5'}};
    const Row rows[] = {
        {1, BT_SIM_EVENT_CON_NUMERIC_REQUEST,
         [](const BtDevAddress& address) { EXPECT_EQ(0, BT_SRV_CON_authenticateNumericValue(kRefuse, &address)); },
         BT_SIM_REFUSED},
        {1, BT_SIM_EVENT_CON_NUMERIC_REQUEST,
         [](const BtDevAddress& address) {
             EXPECT_EQ(0, BT_SRV_CON_TerminationRegistration());
             EXPECT_EQ(0, BT_SRV_CON_authenticateNumericValue(kAgree, &address)) << "too late";
         },
         BT_SIM_CANCELLED},
        {1, BT_SIM_EVENT_CON_NUMERIC_REQUEST,
         [](const BtDevAddress& address) { EXPECT_EQ(0, BT_SRV_CON_cancelConnection(&address, 0)); }, BT_SIM_CANCELLED},
        {1, BT_SIM_EVENT_CON_NUMERIC_REQUEST, [](const BtDevAddress&) {}, BT_SIM_AUTHENTICATION_FAILED},
        {1, BT_SIM_EVENT_CON_NUMERIC_REQUEST,
         [](const BtDevAddress& address) {
             EXPECT_EQ(0, BT_SRV_CON_authenticatePasskey(kAgree, &address, &right)) << "answers another prompt";
             EXPECT_EQ(0, BT_SRV_CON_authenticateNumericValue(kAgree, &address));
         },
         BT_SIM_OK},
        {2, BT_SIM_EVENT_CON_PASSKEY_REQUEST,
         [](const BtDevAddress& address) { EXPECT_EQ(0, BT_SRV_CON_authenticatePasskey(kAgree, &address, &wrong)); },
         BT_SIM_AUTHENTICATION_FAILED},
        {2, BT_SIM_EVENT_CON_PASSKEY_REQUEST,
         [](const BtDevAddress& address) { EXPECT_EQ(0, BT_SRV_CON_authenticatePasskey(kAgree, &address, &right)); },
         BT_SIM_OK},
        {3, 0, nullptr, BT_SIM_REFUSED},
        {4, 0, nullptr, BT_SIM_OUT_OF_RANGE},
    };
    ASSERT_TRUE(unit_.ready());
    as_application(unit_.domain(), [&] {
        listen_for({BT_SIM_EVENT_CON_CONNECTION, BT_SIM_EVENT_CON_NUMERIC_REQUEST, BT_SIM_EVENT_CON_PASSKEY_REQUEST});
        for (const Row& row : rows) {
            SCOPED_TRACE(&row - rows);
            const BtDevAddress address = device_address(0xA0, row.phone);
            request_connection(address, 0);
            if (row.prompt != 0) {
                EXPECT_EQ(0, std::memcmp(&address, wait_for(row.prompt).payload, sizeof address));
                row.reply(address);
            }
            EXPECT_EQ(row.result, word(wait_for(BT_SIM_EVENT_CON_CONNECTION), 0));
        }
        EXPECT_EQ(2, registered_count());
    });
}

// The phone asks again after each restart of the service.
TEST_F(SimPairing, PhoneThatAsksIsConnectedOnlyWhenTheApplicationAccepts)
{
    struct Row {
        uint32_t first;
        BtConProfileFilterBlock filter;
        uint32_t result;
    };
    const Row rows[] = {{1, {}, BT_SIM_REFUSED}, {0, {1, {0}}, BT_SIM_REFUSED}, {0, {2, {0, 1}}, BT_SIM_OK}};
    const BtDevAddress caller = device_address(0xA0, 5);
    ASSERT_TRUE(unit_.ready());
    as_application(unit_.domain(), [&] {
        listen_for({BT_SIM_EVENT_CON_CONNECTION_INDICATION, BT_SIM_EVENT_CON_ACCEPT_CONNECTION,
                    BT_SIM_EVENT_CON_CANCEL_SEARCH});
        for (const Row& row : rows) {
            SCOPED_TRACE(&row - rows);
            kill_connection_service();
            ASSERT_EQ(0, BT_SRV_CON_cancelSearch());
            wait_for(BT_SIM_EVENT_CON_CANCEL_SEARCH);
            EXPECT_EQ(1U, word(wait_for(BT_SIM_EVENT_CON_CONNECTION_INDICATION), 8));
            ASSERT_EQ(0, BT_SRV_CON_acceptConnection(row.first, &caller, &row.filter));
            EXPECT_EQ(row.result, word(wait_for(BT_SIM_EVENT_CON_ACCEPT_CONNECTION), 0));
            ASSERT_EQ(0, BT_SRV_CON_acceptConnection(0, &caller, nullptr));
            EXPECT_EQ(BT_SIM_NOT_EXPECTED, word(wait_for(BT_SIM_EVENT_CON_ACCEPT_CONNECTION), 0));
        }
        EXPECT_EQ(1U, connection_mode(caller));
    });
}

} // namespace
} // namespace bt::test
