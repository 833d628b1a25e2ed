/* Connects a phone and lists the registered devices. */
#include <bt_platform/host.h>
#include <bt_service/bt_service.h>
#include <bt_sim/events.h>

#include <stdio.h>

int main(void)
{
    const BtDevAddress phone = {{0xA0, 0x00, 0x00, 0x00, 0x00, 0x01}, {0, 0}};
    const BtConParameters parameters = {0, {0}}; /* profile 0 */
    const uint32_t wanted[] = {BT_SIM_EVENT_CON_CONNECTION};
    const int32_t from = 0;
    static BtConRegDevInfo devices[BT_CON_DEVICE_MAX];
    BtMessage event;

    if (bt_host_claim_pno(BT_HOST_ANY_PNO) != 0) return fprintf(stderr, "%s\n", bt_host_error()), 1;
    const uint32_t handle = BT_SRV_EvtSrv_regist(_sys_GetPno(), 0, 1, wanted);
    if (handle == 0) return fprintf(stderr, "not registered: is a unit running?\n"), 1;

    if (BT_SRV_CON_requestConnection(&phone, &parameters) != BT_OK) return fprintf(stderr, "not posted\n"), 1;
    if (bt_host_receive(&event, sizeof event, 10000) != 1) return fprintf(stderr, "no answer\n"), 1;
    printf("answer 0x%04X, result %u\n", event.msg_header.hdr.cid, event.payload[0]);

    const int32_t count = BT_SRV_CON_getRemoteDeviceList(0, &from, BT_CON_DEVICE_MAX, devices);
    for (int32_t i = 0; i < count; ++i)
        printf("device %d: %.*s\n", (int)i, BT_CON_NAME_TEXT_SIZE, (const char*)devices[i].name.name_text);

    BT_SRV_EvtSrv_deregist(handle);
    return bt_host_release_pno();
}
