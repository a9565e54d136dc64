#include "platform/qlib_crypt.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <string>
#include <vector>

#include "platform/qlibc_error.h"
#include "support/sim_root.h"

namespace {

class QlibCryptTest : public vorn::test::RootTest {
  protected:
    std::string Encrypt(const std::string& plain) {
        std::vector<char> out(QLIB_CRYPT_CIPHER_SIZE(plain.size()));
        EXPECT_EQ(QLIBCryptSzEncrypt(plain.c_str(), out.data(), static_cast<int>(out.size())), 0);
        return out.data();
    }
    // The deciphered text, or "FAILED" with the error code checked.
    std::string Decrypt(const std::string& cipher) {
        std::vector<char> out(cipher.size() + 1, 'x');
        if (QLIBCryptSzDecrypt(cipher.c_str(), out.data(), static_cast<int>(out.size())) != 0) {
            EXPECT_EQ(out[0], '\0');
            EXPECT_EQ(QLIBCErrGet(), QLIBC_ERR_FORMAT);
            return "FAILED";
        }
        return out.data();
    }
};

TEST_F(QlibCryptTest, RoundTripTamperAndForeignKey) {
    const std::string secret = "pa$$ word=with [odd] chars";
    const std::string cipher = Encrypt(secret);
    EXPECT_EQ(cipher.size() + 1, QLIB_CRYPT_CIPHER_SIZE(secret.size()));
    EXPECT_EQ(cipher.find_first_not_of("0123456789abcdefv:"), std::string::npos);
    EXPECT_NE(Encrypt(secret), cipher);  // a fresh nonce every time
    EXPECT_EQ(Decrypt(cipher), secret);
    EXPECT_EQ(Decrypt(Encrypt("")), "");

    struct stat info;
    ASSERT_EQ(stat(root_.Path("/etc/vorn/wifi_cipher.key").c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777, 0600u);
    EXPECT_EQ(info.st_size, 32);

    // Any changed digit, a cut tag or a foreign text fails instead of giving garbage.
    for (std::size_t at : {std::size_t{5}, std::size_t{30}, cipher.size() - 1}) {
        std::string altered = cipher;
        altered[at] = altered[at] == '0' ? '1' : '0';
        EXPECT_EQ(Decrypt(altered), "FAILED") << at;
    }
    EXPECT_EQ(Decrypt(cipher.substr(0, cipher.size() - 2)), "FAILED");
    EXPECT_EQ(Decrypt("plain text"), "FAILED");
    EXPECT_EQ(Decrypt("vc1:" + cipher.substr(4) + "zz"), "FAILED");

    // Another device's key: the same text no longer deciphers.
    root_.WriteFile("/etc/vorn/wifi_cipher.key", std::string(32, 'k'));
    EXPECT_EQ(Decrypt(cipher), "FAILED");
    EXPECT_EQ(Decrypt(Encrypt(secret)), secret);

    // Settings files written before keep deciphering: a text made under a known key.
    root_.WriteFile("/etc/vorn/wifi_cipher.key", "0123456789abcdef0123456789abcdef");
    EXPECT_EQ(
        Decrypt("vc1:c52f818d3e691f99593968107dcf948fc43105efc8d2151bc8fcd1ada3f839621d10be3e68"),
        "pass;word");

    char small[8];
    EXPECT_EQ(QLIBCryptSzEncrypt(secret.c_str(), small, sizeof(small)), -1);
    EXPECT_EQ(QLIBCErrGet(), QLIBC_ERR_INVALID_ARG);
}

}  // namespace
