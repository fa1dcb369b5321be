/* The two functions of the platform's iSCSI management library that the EP tools call. */
#pragma once

#ifdef __cplusplus
extern "C" {
#endif

/* Bytes of the LUN record that the caller provides, aligned for its 64-bit number. */
#define KELPISCSI_LUN_RECORD_SIZE 4480

/* Where the fields of the record start, in bytes: numbers in the host's byte order, texts that end with a NUL. */
#define KELPISCSI_LUN_EXTENT_SIZE 20  /* unsigned, 4 bytes */
#define KELPISCSI_LUN_SIZE 24         /* unsigned, 8 bytes */
#define KELPISCSI_LUN_RESTORE_TIME 32 /* 4 bytes */
#define KELPISCSI_LUN_TYPE 36         /* signed, 4 bytes */
#define KELPISCSI_LUN_UUID 44
#define KELPISCSI_LUN_ROOT_PATH 118
#define KELPISCSI_LUN_NAME 4213

/* Fills `record` (zeroed by the caller) with the configuration of the LUN `lid`; `reserved` is 0.
 * Returns 0, or an error code that KELPiSCSIStrError() has a text for. With the stand-in, errno is then the reason why
 * its list cannot be used (EBADMSG: it is damaged), and 0 where it can be used. */
int KELPiSCSILunGetByLid(unsigned int lid, int reserved, void* record);

/* The text of an error code. What an unknown code gets is not documented: it may be null. */
const char* KELPiSCSIStrError(int code);

#ifdef __cplusplus
}
#endif
