/* libkivnv: the NV configuration store, texts by key. Any thread, any process. */
#ifndef KIV_NV_H
#define KIV_NV_H

#ifdef __cplusplus
extern "C" {
#endif

/* Copies the key's text into buffer: at most size - 1 characters and a terminator, a longer text is cut.
 * A missing key leaves the buffer untouched. Returns 0, or -1 when the key cannot be read. */
int kiv_nvconfig_read(const char *key, char *buffer, int size);

/* Stores length characters of value under the key, whole: a reader sees the old text or the new one.
 * Returns 0, or -1 when the text could not be stored. */
int kiv_nvconfig_write(const char *key, const char *value, int length);

#ifdef __cplusplus
}
#endif
#endif
