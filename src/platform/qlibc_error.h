#ifndef VORN_PLATFORM_QLIBC_ERROR_H
#define VORN_PLATFORM_QLIBC_ERROR_H

#ifdef __cplusplus
extern "C" {
#endif

/* Platform error codes, kept per thread. */
enum {
    QLIBC_ERR_NONE = 0,
    QLIBC_ERR_NO_MEMORY = 0x0200,
    QLIBC_ERR_NOT_FOUND = 0x0400,  /* a file, section or key does not exist */
    QLIBC_ERR_FILE_IO = 0x0900,    /* 2304: a file could not be created, read or written */
    QLIBC_ERR_FORMAT = 0x0A00,     /* a text is malformed or exceeds a bound */
    QLIBC_ERR_EXEC = 0x0B00,       /* a program could not be run or did not exit with 0 */
    QLIBC_ERR_INVALID_ARG = 0x0D00 /* 3328: a bad argument */
};

int QLIBCErrGet(void);
void QLIBCErrSet(int code);

#ifdef __cplusplus
}
#endif

#endif
