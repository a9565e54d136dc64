#include "platform/qlib_crypt.h"

#include <fcntl.h>
#include <openssl/crypto.h>
#include <openssl/evp.h>
#include <openssl/rand.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include "platform/qlibc_error.h"
#include "platform/root_path.h"

namespace {

using Bytes = std::vector<unsigned char>;

constexpr const char* kKeyDir = "/etc/vorn";
constexpr const char* kKeyFile = "/etc/vorn/wifi_cipher.key";
constexpr const char* kPrefix = "vc1:";
constexpr std::size_t kPrefixLength = 4;
constexpr std::size_t kKeyLength = 32;
constexpr std::size_t kNonceLength = 12;
constexpr std::size_t kTagLength = 16;

int Fail(int code) {
    QLIBCErrSet(code);
    return -1;
}

// Wipes the key when it goes out of scope.
struct Key {
    unsigned char bytes[kKeyLength] = {};
    ~Key() { OPENSSL_cleanse(bytes, sizeof(bytes)); }
};

// Exactly kKeyLength bytes, or the file is not a key.
bool ReadKey(const std::string& real, Key& key) {
    const int fd = open(real.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW);
    if (fd < 0) {
        return false;
    }
    unsigned char extra = 0;
    const bool ok = read(fd, key.bytes, kKeyLength) == static_cast<ssize_t>(kKeyLength) &&
                    read(fd, &extra, 1) == 0;
    close(fd);
    return ok;
}

// Writes a fresh key beside the key file and links it into place, so a process that loses the
// race to create it uses the winner's key.
bool CreateKey(const std::string& real) {
    std::string temp = real + ".XXXXXX";
    const int fd = mkstemp(&temp[0]);
    if (fd < 0) {
        return false;
    }
    Key key;
    bool ok = fchmod(fd, 0600) == 0 && RAND_bytes(key.bytes, kKeyLength) == 1 &&
              write(fd, key.bytes, kKeyLength) == static_cast<ssize_t>(kKeyLength) &&
              fsync(fd) == 0;
    ok = close(fd) == 0 && ok;
    ok = ok && (link(temp.c_str(), real.c_str()) == 0 || errno == EEXIST);
    unlink(temp.c_str());
    return ok;
}

bool LoadKey(Key& key) {
    const std::string real = vorn::platform::RootPath(kKeyFile);
    if (ReadKey(real, key)) {
        return true;
    }
    if (errno != ENOENT) {
        return false;
    }
    if (mkdir(vorn::platform::RootPath(kKeyDir).c_str(), 0755) != 0 && errno != EEXIST) {
        return false;
    }
    return CreateKey(real) && ReadKey(real, key);
}

struct ContextDeleter {
    void operator()(EVP_CIPHER_CTX* context) const { EVP_CIPHER_CTX_free(context); }
};
using Context = std::unique_ptr<EVP_CIPHER_CTX, ContextDeleter>;

// The version prefix is authenticated with the text, so it cannot be swapped.
bool Seal(const Key& key, const Bytes& nonce, const std::string& plain, Bytes& sealed) {
    Context context(EVP_CIPHER_CTX_new());
    sealed.assign(plain.size() + kTagLength, 0);
    int length = 0;
    int tail = 0;
    const bool ok =
        context &&
        EVP_EncryptInit_ex(context.get(), EVP_aes_256_gcm(), nullptr, key.bytes, nonce.data()) ==
            1 &&
        EVP_EncryptUpdate(context.get(), nullptr, &length,
                          reinterpret_cast<const unsigned char*>(kPrefix), kPrefixLength) == 1 &&
        EVP_EncryptUpdate(context.get(), sealed.data(), &length,
                          reinterpret_cast<const unsigned char*>(plain.data()),
                          static_cast<int>(plain.size())) == 1 &&
        EVP_EncryptFinal_ex(context.get(), sealed.data() + length, &tail) == 1 &&
        EVP_CIPHER_CTX_ctrl(context.get(), EVP_CTRL_GCM_GET_TAG, kTagLength,
                            sealed.data() + plain.size()) == 1;
    return ok;
}

bool Open(const Key& key, const Bytes& nonce, Bytes& sealed, std::string& plain) {
    Context context(EVP_CIPHER_CTX_new());
    const std::size_t textLength = sealed.size() - kTagLength;
    Bytes out(textLength + 1, 0);
    int length = 0;
    int tail = 0;
    const bool ok =
        context &&
        EVP_DecryptInit_ex(context.get(), EVP_aes_256_gcm(), nullptr, key.bytes, nonce.data()) ==
            1 &&
        EVP_DecryptUpdate(context.get(), nullptr, &length,
                          reinterpret_cast<const unsigned char*>(kPrefix), kPrefixLength) == 1 &&
        EVP_DecryptUpdate(context.get(), out.data(), &length, sealed.data(),
                          static_cast<int>(textLength)) == 1 &&
        EVP_CIPHER_CTX_ctrl(context.get(), EVP_CTRL_GCM_SET_TAG, kTagLength,
                            sealed.data() + textLength) == 1 &&
        EVP_DecryptFinal_ex(context.get(), out.data() + length, &tail) == 1;
    if (ok) {
        plain.assign(reinterpret_cast<const char*>(out.data()), textLength);
    }
    OPENSSL_cleanse(out.data(), out.size());
    return ok;
}

std::string ToHex(const Bytes& bytes) {
    static const char digits[] = "0123456789abcdef";
    std::string hex;
    for (unsigned char byte : bytes) {
        hex += digits[byte >> 4];
        hex += digits[byte & 0x0f];
    }
    return hex;
}

int HexValue(char c) {
    if (c >= '0' && c <= '9') {
        return c - '0';
    }
    return c >= 'a' && c <= 'f' ? c - 'a' + 10 : -1;
}

bool FromHex(const char* hex, std::size_t length, Bytes& bytes) {
    if (length % 2 != 0) {
        return false;
    }
    bytes.clear();
    for (std::size_t i = 0; i < length; i += 2) {
        const int high = HexValue(hex[i]);
        const int low = HexValue(hex[i + 1]);
        if (high < 0 || low < 0) {
            return false;
        }
        bytes.push_back(static_cast<unsigned char>(high << 4 | low));
    }
    return true;
}

}  // namespace

extern "C" {

int QLIBCryptSzEncrypt(const char* plain, char* cipher, int size) {
    if (plain == nullptr || cipher == nullptr || size < 1) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const std::size_t plainLength = std::strlen(plain);
    if (static_cast<std::size_t>(size) < QLIB_CRYPT_CIPHER_SIZE(plainLength)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    Key key;
    if (!LoadKey(key)) {
        return Fail(QLIBC_ERR_FILE_IO);
    }
    Bytes nonce(kNonceLength, 0);
    Bytes sealed;
    if (RAND_bytes(nonce.data(), kNonceLength) != 1 || !Seal(key, nonce, plain, sealed)) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
    const std::string text = kPrefix + ToHex(nonce) + ToHex(sealed);
    std::memcpy(cipher, text.c_str(), text.size() + 1);
    return 0;
}

int QLIBCryptSzDecrypt(const char* cipher, char* plain, int size) {
    if (cipher == nullptr || plain == nullptr || size < 1) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    plain[0] = '\0';
    const std::size_t length = std::strlen(cipher);
    const std::size_t minimum = kPrefixLength + 2 * (kNonceLength + kTagLength);
    Bytes nonce;
    Bytes sealed;
    if (length < minimum || std::strncmp(cipher, kPrefix, kPrefixLength) != 0 ||
        !FromHex(cipher + kPrefixLength, 2 * kNonceLength, nonce) ||
        !FromHex(cipher + kPrefixLength + 2 * kNonceLength,
                 length - kPrefixLength - 2 * kNonceLength, sealed)) {
        return Fail(QLIBC_ERR_FORMAT);
    }
    Key key;
    if (!LoadKey(key)) {
        return Fail(QLIBC_ERR_FILE_IO);
    }
    std::string text;
    if (!Open(key, nonce, sealed, text)) {
        return Fail(QLIBC_ERR_FORMAT);
    }
    if (text.size() >= static_cast<std::size_t>(size) || text.find('\0') != std::string::npos) {
        OPENSSL_cleanse(&text[0], text.size());
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    std::memcpy(plain, text.c_str(), text.size() + 1);
    OPENSSL_cleanse(&text[0], text.size());
    return 0;
}

}  // extern "C"
