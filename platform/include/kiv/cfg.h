/* libkivcfg: device configuration, fixed at manufacture. */
#ifndef KIV_CFG_H
#define KIV_CFG_H

#ifdef __cplusplus
extern "C" {
#endif

enum {
    KIV_CFG_9X15_LED_ID = 531,      /* one byte: 1 when the LED function is on */
    KIV_CFG_PRODUCT_TYPE_ID = 6000, /* text of up to 127 characters: the product type */
};

/* Copies the item's value into buffer, at most size bytes: a text with its terminator, or cut.
 * Returns -1 on failure with the buffer untouched, any other value is success. */
int kiv_cfg_get_item(int item, void *buffer, int size);

#ifdef __cplusplus
}
#endif
#endif
