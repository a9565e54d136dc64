#ifndef VORN_PLATFORM_QLIBC_CONTAINER_H
#define VORN_PLATFORM_QLIBC_CONTAINER_H

#ifdef __cplusplus
extern "C" {
#endif

/* Ordered string pairs: entries keep the order of their first insertion; setting a key that
 * is present replaces its value in place. */
typedef struct QLIBSZHASH QLIBSZHASH;
/* Ordered list of strings. */
typedef struct QLIBSZLIST QLIBSZLIST;

/* capacity is a hint; both grow as needed. Null when memory is short. */
QLIBSZHASH* QLIBCSzHashAlloc(int capacity);
void QLIBCSzHashFree(QLIBSZHASH* hash);
/* 0 on success, -1 for a null argument or no memory. */
int QLIBCSzHashSetValue(QLIBSZHASH* hash, const char* key, const char* value);
/* The value of key, or null when absent. Valid until the hash changes. */
const char* QLIBCSzHashGetValue(const QLIBSZHASH* hash, const char* key);
int QLIBCSzHashRemove(QLIBSZHASH* hash, const char* key);
void QLIBCHashRemoveAll(QLIBSZHASH* hash);
int QLIBCSzHashCount(const QLIBSZHASH* hash);
/* Entry index in insertion order (0 .. count-1); null outside. */
const char* QLIBCSzHashKeyAt(const QLIBSZHASH* hash, int index);
const char* QLIBCSzHashValueAt(const QLIBSZHASH* hash, int index);

QLIBSZLIST* QLIBCSzListAlloc(int capacity);
void QLIBCSzListFree(QLIBSZLIST* list);
/* Appends a copy of value. 0 on success, -1 on a null argument or no memory. */
int QLIBCSzListAdd(QLIBSZLIST* list, const char* value);
/* The element at index, or null outside the list. */
const char* QLIBCSzListGet(const QLIBSZLIST* list, int index);
int QLIBCSzListCount(const QLIBSZLIST* list);
void QLIBCSzListRemoveAll(QLIBSZLIST* list);

#ifdef __cplusplus
}
#endif

#endif
