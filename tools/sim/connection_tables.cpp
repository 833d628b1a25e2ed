#include "sim/connection_tables.h"

#include "sim/connection_link.h"
#include "sim/machine_tables.h"

#include "wire/request.h"

namespace bt::sim::con {

namespace {

constexpr uint32_t id(bt::Request request)
{
    return static_cast<uint32_t>(request);
}

constexpr BtStateRow kEndOfStates = {BT_TABLE_END, nullptr, nullptr, nullptr};

constexpr BtStateRow kSearchStates[] = {
    {kSearchIdle, BT_CMN_nopEntryExit, BT_CMN_nopEntryExit, nullptr},
    {kSearching, BT_CMN_nopEntryExit, BT_CMN_nopEntryExit, nullptr},
    kEndOfStates,
};

constexpr BtStateRow kIncomingStates[] = {
    {kNobodyAsks, BT_CMN_nopEntryExit, BT_CMN_nopEntryExit, nullptr},
    {kPhoneAsks, BT_CMN_nopEntryExit, BT_CMN_nopEntryExit, nullptr},
    kEndOfStates,
};

constexpr BtStateRow kLinkStates[9] = {
    {kLinkIdle, BT_CMN_nopEntryExit, BT_CMN_nopEntryExit, nullptr},
    {kLinkBusy, BT_CMN_nopEntryExit, leave_busy, nullptr},
    {kRegistering, BT_CMN_nopEntryExit, BT_CMN_nopEntryExit, &kLinkStates[1]},
    {kPairing, enter_pairing, BT_CMN_nopEntryExit, &kLinkStates[2]},
    {kPrompting, enter_prompting, BT_CMN_nopEntryExit, &kLinkStates[2]},
    {kConnecting, enter_connecting, BT_CMN_nopEntryExit, &kLinkStates[1]},
    {kReleasing, enter_releasing, BT_CMN_nopEntryExit, &kLinkStates[1]},
    {kQuerying, enter_querying, BT_CMN_nopEntryExit, &kLinkStates[1]},
    kEndOfStates,
};

const std::vector<BtMatrixRow>& settings_matrix()
{
    static const std::vector<BtMatrixRow> matrix = matrix_of({
        {{kServing},
         {id(bt::Request::CON_setDiscoverableMode), id(bt::Request::CON_setAutomaticConnectionBehavior),
          id(bt::Request::CON_setSimplePairing), id(bt::Request::CON_setSimplePairingDebugMode),
          id(bt::Request::CON_setLinklossReconnectionBehavior), id(bt::Request::CON_suspendAutomaticConnection),
          id(bt::Request::CON_restartAutomaticConnection), id(bt::Request::CON_setBluetoothFunction),
          id(bt::Request::CON_changeTimerValue), id(bt::Request::CON_setSDPEnforcementSetting),
          id(bt::Request::CON_setLinklossReconnectionDirectionSetting), id(bt::Request::CON_setConnectionRetrySetting),
          id(bt::Request::CON_setNoSecurityDeviceAuthenticationSetting), id(bt::Request::CON_permitProfileConnection)},
         on_request<keep_setting>},
        {{kServing}, {id(bt::Request::CON_getTransmittingPower)}, on_request<tell_transmitting_power>},
    });
    return matrix;
}

const std::vector<BtMatrixRow>& search_matrix()
{
    static const std::vector<BtMatrixRow> matrix = matrix_of({
        {{kSearchIdle}, {id(bt::Request::CON_search)}, on_request<start_search>},
        {{kSearchIdle}, {id(bt::Request::CON_cancelSearch)}, on_request<not_expected>},
        {{kSearching}, {id(bt::Request::CON_search)}, on_request<refuse_second_search>},
        {{kSearching}, {id(bt::Request::CON_cancelSearch)}, on_request<cancel_search>},
        {{kSearching}, {kSearchTimer}, on_timer<search_timer, phone_found>},
    });
    return matrix;
}

const std::vector<BtMatrixRow>& incoming_matrix()
{
    static const std::vector<BtMatrixRow> matrix = matrix_of({
        {{kNobodyAsks, kPhoneAsks}, {kIncomingTimer}, on_timer<incoming_timer, phone_asks>},
        {{kNobodyAsks},
         {id(bt::Request::CON_acceptConnection), id(bt::Request::CON_cancelRemoteDeviceConnection)},
         on_request<not_expected>},
        {{kPhoneAsks}, {id(bt::Request::CON_acceptConnection)}, on_request<accept_connection>},
        {{kPhoneAsks}, {id(bt::Request::CON_cancelRemoteDeviceConnection)}, on_request<cancel_remote_connection>},
    });
    return matrix;
}

const std::vector<BtMatrixRow>& link_matrix()
{
    const std::vector<uint32_t> authentication = {id(bt::Request::CON_authenticatePinCode),
                                                  id(bt::Request::CON_authenticateNumericValue),
                                                  id(bt::Request::CON_authenticatePasskey)};
    const std::vector<uint32_t> queries = {id(bt::Request::CON_startServiceDiscovery),
                                           id(bt::Request::CON_startServiceDiscovery_UUID),
                                           id(bt::Request::CON_queryRemoteDeviceDIDInfo)};
    const std::vector<uint32_t> operations = {
        id(bt::Request::CON_requestConnection),       id(bt::Request::CON_requestDisconnection),
        id(bt::Request::CON_requestAllDisconnection), id(bt::Request::CON_delete),
        id(bt::Request::CON_startServiceDiscovery),   id(bt::Request::CON_startServiceDiscovery_UUID),
        id(bt::Request::CON_queryRemoteDeviceDIDInfo)};
    constexpr uint32_t cancel = id(bt::Request::CON_cancelConnection);
    constexpr uint32_t terminate = id(bt::Request::CON_TerminationRegistration);

    static const std::vector<BtMatrixRow> matrix = matrix_of({
        {{kLinkIdle}, {id(bt::Request::CON_requestConnection)}, on_request<request_connection>},
        {{kLinkIdle}, {id(bt::Request::CON_requestDisconnection)}, on_request<request_disconnection>},
        {{kLinkIdle}, {id(bt::Request::CON_requestAllDisconnection)}, on_request<request_all_disconnection>},
        {{kLinkIdle}, {id(bt::Request::CON_delete)}, on_request<delete_device>},
        {{kLinkIdle}, queries, on_request<start_query>},
        {{kPairing, kPrompting, kConnecting, kReleasing, kQuerying}, operations, defer_request},

        {{kPairing, kPrompting, kConnecting}, {cancel}, on_request<cancel_connection>},
        {{kLinkIdle, kReleasing, kQuerying}, {cancel}, on_request<not_expected>},
        {{kPairing, kPrompting}, {terminate}, on_request<cancel_registration>},
        {{kLinkIdle, kConnecting, kReleasing, kQuerying}, {terminate}, on_request<not_expected>},
        {{kPrompting}, authentication, on_request<authenticate>},
        {{kLinkIdle, kPairing, kConnecting, kReleasing, kQuerying}, authentication, on_request<not_expected>},

        {{kPairing}, {kLinkTimer}, on_timer<link_timer, pairing_done>},
        {{kPrompting}, {kLinkTimer}, on_timer<link_timer, prompt_timed_out>},
        {{kConnecting}, {kLinkTimer}, on_timer<link_timer, connecting_done>},
        {{kReleasing}, {kLinkTimer}, on_timer<link_timer, releasing_done>},
        {{kQuerying}, {kLinkTimer}, on_timer<link_timer, query_done>},
    });
    return matrix;
}

} // namespace

const BtStateRow* search_states()
{
    return kSearchStates;
}

const BtStateRow* incoming_states()
{
    return kIncomingStates;
}

const BtStateRow* link_states()
{
    return kLinkStates;
}

const BtFunctionIdRow* machine_table()
{
    static const BtFunctionIdRow table[] = {
        {kSettingsMachine, settings_state, settings_matrix().data()},
        {kSearchMachine, search_state, search_matrix().data()},
        {kIncomingMachine, incoming_state, incoming_matrix().data()},
        {kLinkMachine, link_state, link_matrix().data()},
        {BT_TABLE_END, nullptr, nullptr},
    };
    return table;
}

const BtDispatchRow* dispatch_table()
{
    static const std::vector<BtDispatchRow> table = [] {
        std::vector<BtDispatchRow> rows;
        const auto add = [&rows](const std::vector<BtMatrixRow>& matrix, uint32_t machine) {
            const std::vector<BtDispatchRow> more = dispatch_of(matrix, machine);
            rows.insert(rows.end(), more.begin(), more.end());
        };
        add(settings_matrix(), kSettingsMachine);
        add(search_matrix(), kSearchMachine);
        add(incoming_matrix(), kIncomingMachine);
        add(link_matrix(), kLinkMachine);
        rows.push_back({BT_TABLE_END, 0});
        return rows;
    }();
    return table.data();
}

} // namespace bt::sim::con
