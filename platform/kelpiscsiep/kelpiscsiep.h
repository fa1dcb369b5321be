/* The two functions of the platform's iSCSI management library that the EP tools call. */
#pragma once

#ifdef __cplusplus
extern "C" {
#endif

/* Bytes of the LUN record that the caller provides. */
#define KELPISCSI_LUN_RECORD_SIZE 4480

/* Fills `record` (zeroed by the caller) with the configuration of the LUN `lid`; `reserved` is 0.
 * Returns 0, or an error code that KELPiSCSIStrError() has a text for. */
int KELPiSCSILunGetByLid(unsigned int lid, int reserved, void* record);

/* The text of an error code, whatever the code; never null. */
const char* KELPiSCSIStrError(int code);

#ifdef __cplusplus
}
#endif
