#ifndef VORN_PLATFORM_QLIB_CRYPT_H
#define VORN_PLATFORM_QLIB_CRYPT_H

#ifdef __cplusplus
extern "C" {
#endif

/* The device's string cipher, which keeps passwords in setting files.
 *
 * AES-256-GCM (nettle) under a device key: 32 random bytes in "/etc/vorn/wifi_cipher.key" (under the root
 * prefix), created with mode 0600 on first use. A cipher text is printable and one line:
 * "vc1:" followed by lower-case hex of a random 12-byte nonce, the enciphered bytes and the
 * 16-byte tag. It is QLIB_CRYPT_CIPHER_SIZE(strlen(plain)) bytes long with its NUL. */
#define QLIB_CRYPT_CIPHER_SIZE(plainLength) (4 + 2 * (12 + (plainLength) + 16) + 1)

/* Enciphers plain into cipher (size bytes with the NUL). 0, or -1 with QLIBC_ERR_INVALID_ARG
 * (null argument, buffer too small) or QLIBC_ERR_FILE_IO (the key cannot be read or made). */
int QLIBCryptSzEncrypt(const char* plain, char* cipher, int size);
/* Deciphers what QLIBCryptSzEncrypt made on this device. 0, or -1 with plain empty: a text that
 * is not of that form, was altered or was made under another key gives QLIBC_ERR_FORMAT. */
int QLIBCryptSzDecrypt(const char* cipher, char* plain, int size);

#ifdef __cplusplus
}
#endif

#endif
