/* A C program against the installed library: without a unit, requests and queries say so and nothing ends the program. */
#include <bt_service/bt_service.h>
#include <stdio.h>
#include <string.h>

int main(void)
{
    BtDevAddress phone = {{0x00, 0x1A, 0x7D, 0xDA, 0x71, 0x11}, {0, 0}};
    uint32_t parameters[7] = {1, 0, 0, 0, 0, 0, 0};
    uint32_t mode = 99;
    int32_t posted = BT_SRV_CON_requestConnection(&phone, (const void*)parameters);
    int32_t queried = BT_SRV_CON_getScanMode(&mode);
    uint32_t handle = BT_SRV_EvtSrv_regist(0x4000, 0, 1, &mode);

    if (posted != BT_NOT_POSTED || queried == BT_OK || mode != 99 || handle != 0) {
        printf("without a unit: posted %d, queried %d, mode %u, handle %u\n", (int)posted, (int)queried, (unsigned)mode,
               (unsigned)handle);
        return 1;
    }
    BT_SRV_EvtSrv_deregist(handle);
    return strcmp(AppName, "BT_Service") == 0 ? 0 : 1;
}
