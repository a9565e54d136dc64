#include "platform/qlib_crypt.h"

#include <fcntl.h>
#include <nettle/gcm.h>
#include <nettle/memops.h>
#include <sys/random.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
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
    ~Key() { explicit_bzero(bytes, sizeof(bytes)); }
};

bool RandomBytes(unsigned char* bytes, std::size_t length) {
    return getrandom(bytes, length, 0) == static_cast<ssize_t>(length);
}

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
    bool ok = fchmod(fd, 0600) == 0 && RandomBytes(key.bytes, kKeyLength) &&
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

// The expanded key is wiped with the context; the version prefix is authenticated with the text,
// so it cannot be swapped.
class Gcm {
  public:
    Gcm(const Key& key, const Bytes& nonce) {
        gcm_aes256_set_key(&context_, key.bytes);
        gcm_aes256_set_iv(&context_, nonce.size(), nonce.data());
        gcm_aes256_update(&context_, kPrefixLength, reinterpret_cast<const uint8_t*>(kPrefix));
    }
    ~Gcm() { explicit_bzero(&context_, sizeof(context_)); }
    Gcm(const Gcm&) = delete;
    Gcm& operator=(const Gcm&) = delete;

    void Encrypt(std::size_t length, uint8_t* out, const uint8_t* in) {
        gcm_aes256_encrypt(&context_, length, out, in);
    }
    void Decrypt(std::size_t length, uint8_t* out, const uint8_t* in) {
        gcm_aes256_decrypt(&context_, length, out, in);
    }
    void Tag(uint8_t* tag) { gcm_aes256_digest(&context_, kTagLength, tag); }

  private:
    gcm_aes256_ctx context_{};
};

void Seal(const Key& key, const Bytes& nonce, const std::string& plain, Bytes& sealed) {
    Gcm gcm(key, nonce);
    sealed.assign(plain.size() + kTagLength, 0);
    gcm.Encrypt(plain.size(), sealed.data(), reinterpret_cast<const uint8_t*>(plain.data()));
    gcm.Tag(sealed.data() + plain.size());
}

bool Open(const Key& key, const Bytes& nonce, const Bytes& sealed, std::string& plain) {
    Gcm gcm(key, nonce);
    const std::size_t textLength = sealed.size() - kTagLength;
    plain.assign(textLength, '\0');
    gcm.Decrypt(textLength, reinterpret_cast<uint8_t*>(&plain[0]), sealed.data());
    uint8_t tag[kTagLength];
    gcm.Tag(tag);
    if (memeql_sec(tag, sealed.data() + textLength, kTagLength) == 0) {
        explicit_bzero(&plain[0], plain.size());
        plain.clear();
        return false;
    }
    return true;
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
    if (!RandomBytes(nonce.data(), kNonceLength)) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
    Seal(key, nonce, plain, sealed);
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
        explicit_bzero(&text[0], text.size());
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    std::memcpy(plain, text.c_str(), text.size() + 1);
    explicit_bzero(&text[0], text.size());
    return 0;
}

}  // extern "C"
