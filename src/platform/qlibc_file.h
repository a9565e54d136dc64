#ifndef VORN_PLATFORM_QLIBC_FILE_H
#define VORN_PLATFORM_QLIBC_FILE_H

#include <stdio.h>

#include "platform/qlibc_container.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Every path is logical: the calls resolve it under the root prefix (VORN_ROOT).
 *
 * Section files: a header line "[name]", then key lines "key=value". Key=value files: lines
 * "key=value", where a value in double quotes reads back without them. In both, leading white
 * space is ignored, lines starting with '#' or ';' and blank lines are skipped, a repeated key
 * keeps its first position and its last value, keys come back in file order. A file larger than
 * 1 MiB, with a line longer than 8 KiB or with a NUL byte is malformed: the call fails with -1
 * and QLIBC_ERR_FORMAT. Failures set a QLIBC_ERR_* code. */

/* 1 when path exists, 0 otherwise. */
int QLIBCFileExist(const char* path);
/* 1 when dir is an existing directory, 0 when not; mode is what the caller wants of it and is
 * checked only as far as the directory being searchable. -1 on a null argument. */
int QLIBCFileCheckDir(const char* dir, unsigned int mode);
/* Creates path empty when missing, else updates its time. 0 or -1. */
int QLIBCFileTouch(const char* path);

/* Copies the value of key into value (size bytes with the NUL). 1 when found, 0 when the key is
 * absent (value empty), -1 on error, a missing file, or a value that does not fit. flags: 0. */
int QLIBCFileGetKeyValue(const char* file, const char* key, char* value, int size, int flags);
/* Sets one key, keeping every other line; a value that was quoted stays quoted. The file is
 * created when missing and replaced atomically. 0 or -1. */
int QLIBCFileSetKeyValue(const char* file, const char* key, const char* value);
/* 1 when key holds value, 0 when it does not (or is absent), -1 on error.
 * flags: QLIBC_FILE_IGNORE_CASE compares without regard to ASCII case. */
int QLIBCFileCheckKeyValue(const char* file, const char* key, const char* value, int flags);
enum { QLIBC_FILE_IGNORE_CASE = 1 };

/* Adds the pairs of a key=value file to *hash (allocated when null). keys, when not null, limits
 * the result to those keys; separator is the text between key and value ("="). Returns the
 * number of pairs added or -1. */
int QLIBCFileGetKeys(const char* file, const QLIBSZLIST* keys, QLIBSZHASH** hash,
                     const char* separator);
/* Sets the pairs of set and removes the keys of remove in a key=value file, keeping every other
 * line; replaced atomically, created when missing. flags: QLIBC_FILE_QUOTE_VALUES writes new
 * values in double quotes. 0 or -1. */
int QLIBCFileSetKeys(const char* file, const QLIBSZHASH* set, const QLIBSZHASH* remove, int flags);
enum { QLIBC_FILE_QUOTE_VALUES = 1 };

/* Appends the section names of a section file to *list (allocated when null), in file order,
 * each once. Returns the number of sections or -1. */
int QLIBCFileEnumSection(const char* file, QLIBSZLIST** list);
/* Appends to *names (allocated when null; the caller frees it with QLIBCSzListFree) the names of
 * the entries of dir that begin with prefix (null: all), "." and ".." excepted, sorted, the first
 * max of them (more are logged). Returns the number appended, or -1 when dir cannot be read
 * (logged). */
int QLIBCFileEnumDir(const char* dir, const char* prefix, int max, QLIBSZLIST** names);
/* Adds the pairs of one section to *hash (allocated when null). Returns the number of keys of
 * the section (0 when it has none or is absent) or -1. */
int QLIBCFileGetSection(const char* file, const char* section, QLIBSZHASH** hash);
/* Writes the section, replacing a section of that name or appending it, with each pair printed
 * through format (two "%s": key and value, e.g. "\t%s=%s\n"); the file is created when missing
 * and replaced atomically. 0 or -1. */
int QLIBCFileAddSection(const char* file, const char* section, const QLIBSZHASH* hash,
                        const char* format);
/* Writes "[section]\n" (nothing when section is null) and each pair through format to stream.
 * Refuses, before writing anything, pairs that would not read back: an empty key, a key with
 * '=', surrounding blanks or a leading '#', ';' or '[', a line end in a key or value, a section
 * name with ']' or a line end, a format without exactly two "%s". 0 or -1. */
int QLIBCFileHash2File(FILE* stream, const char* section, const QLIBSZHASH* hash,
                       const char* format);

/* rename(2) and unlink(2) on logical paths. 0 or -1. */
int QLIBCSysRename(const char* from, const char* to);
int QLIBCSysUnlink(const char* path);
/* Copies the content of src over dst (replaced atomically, mode of src). 0 or -1. */
int VORNFileCopy(const char* src, const char* dst);

#ifdef __cplusplus
}
#endif

#endif
