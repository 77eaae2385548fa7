/* libkivtr181: client of the device's TR-181 data-model store. */
#ifndef KIV_TR181_H
#define KIV_TR181_H

#ifdef __cplusplus
extern "C" {
#endif

enum {
    KIV_TR181_TBL_LEDS = 141,     /* DEV.LEDS */
    KIV_TR181_TBL_LEDS_LED = 142, /* DEV.LEDS.LED */
};

/* A record: native byte order, unused bytes 0. A parameter's flag is 1 when its value is set. */
enum {
    KIV_TR181_RECORD_SIZE = 4964,
    KIV_TR181_INSTANCE = 0, /* int32, from 1 */
    KIV_TR181_PATH = 4,     /* NUL-terminated object path, KIV_TR181_PATH_SIZE bytes */
    KIV_TR181_PATH_SIZE = 34,
    KIV_TR181_PARAM1_FLAG = 38, /* uint16 */
    KIV_TR181_PARAM1 = 64,      /* DEV.LEDS: int32 number of entries; DEV.LEDS.LED: name */
    KIV_TR181_PARAM1_SIZE = 68,
    KIV_TR181_PARAM2_FLAG = 134, /* uint16; DEV.LEDS.LED only */
    KIV_TR181_PARAM2 = 160,      /* status */
    KIV_TR181_PARAM2_SIZE = 36,
    KIV_TR181_PARAM3_FLAG = 198, /* uint16; DEV.LEDS.LED only */
    KIV_TR181_PARAM3 = 224,      /* location */
    KIV_TR181_PARAM3_SIZE = 36,
};

/* Connects to the store; once, before any write. Returns 0, or -1. */
int libkiv_tr181_Init(void);

/* Writes one record of KIV_TR181_RECORD_SIZE bytes into a table. The last two arguments are 1 and 0.
 * Returns 0, or a negative value. */
int libkiv_tr181_set_tbl(int table_id, void *record, int arg3, int arg4);

#ifdef __cplusplus
}
#endif
#endif
