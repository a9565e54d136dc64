#ifndef VORN_PLATFORM_QLIBC_STR_H
#define VORN_PLATFORM_QLIBC_STR_H

#ifdef __cplusplus
extern "C" {
#endif

/* Removes leading and trailing white space in place; returns text (null stays null). */
char* QLIBCStrTrimSpace(char* text);

/* strsep: the token at *cursor, ended at the first of delims (which is overwritten with NUL);
 * *cursor moves past it, or becomes null after the last token. Null when *cursor is null. */
char* QLIBCStrSep(char** cursor, const char* delims);

/* Splits a dotted IPv4 text into its decimal parts (each 0..255). Stores at most maxParts of them
 * and returns how many parts the text has, or -1 when a part is empty, not decimal or above 255. */
int cQLIBISepIP(const char* text, unsigned int* parts, int maxParts);

/* "a.b.c.d/m.m.m.m" -> "network/prefixlen" ("192.168.1.77/255.255.255.0" -> "192.168.1.0/24")
 * into out (size bytes). 0, or -1 for a malformed text, a mask whose ones are not contiguous or
 * an out buffer too small. */
int ErrQLIBIpMaskToSubnet(const char* ipMask, char* out, int size);

#ifdef __cplusplus
}
#endif

#endif
