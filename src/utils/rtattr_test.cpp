#include "utils/rtattr.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <vector>

namespace vornwireless::utils {
namespace {

// An attribute block laid out as the kernel does, in 4-byte aligned storage.
class Block {
  public:
    // length: the rta_len to claim, when not the true one.
    Block& Add(std::uint16_t type, std::size_t payload, int length = -1) {
        rtattr header{};
        header.rta_type = type;
        header.rta_len = static_cast<std::uint16_t>(length >= 0 ? length : RTA_LENGTH(payload));
        const std::size_t at = words_.size();
        words_.resize(at + RTA_SPACE(payload) / 4, 0xABABABABu);
        std::memcpy(&words_[at], &header, sizeof(header));
        return *this;
    }
    const rtattr* First() const { return reinterpret_cast<const rtattr*>(words_.data()); }
    int Size() const { return static_cast<int>(words_.size() * 4); }

  private:
    std::vector<std::uint32_t> words_;
};

int Offset(const rtattr* attribute, const rtattr* first) {
    return static_cast<int>(reinterpret_cast<const char*>(attribute) -
                            reinterpret_cast<const char*>(first));
}

TEST(ParseRtattrTest, IndexesFirstAttributeOfEachKnownType) {
    Block block;
    block.Add(3, 5).Add(1, 4).Add(200, 8).Add(3, 4).Add(0x8000 | 2, 4).Add(2, 0);
    const rtattr* first = block.First();
    const rtattr* table[4];
    ASSERT_EQ(parse_rtattr(table, 3, first, block.Size()), 0);
    EXPECT_EQ(table[0], nullptr);
    EXPECT_EQ(Offset(table[3], first), 0);   // the later duplicate is ignored
    EXPECT_EQ(Offset(table[1], first), 12);  // after 4 + 5 bytes padded to 12
    // The flagged type 0x8002 is not type 2; the empty type-2 attribute at the end is.
    EXPECT_EQ(Offset(table[2], first), 12 + 8 + 12 + 8 + 8);
    EXPECT_EQ(table[2]->rta_len, RTA_LENGTH(0));

    EXPECT_EQ(parse_rtattr(table, 3, nullptr, 0), 0);
    EXPECT_EQ(table[3], nullptr);
}

TEST(ParseRtattrTest, BadLengthsStopTheWalkAndFail) {
    const rtattr* table[4];
    Block overlong;
    overlong.Add(1, 4).Add(2, 4, 17).Add(3, 4);  // 16 bytes are left at the second
    EXPECT_EQ(parse_rtattr(table, 3, overlong.First(), overlong.Size()), -1);
    EXPECT_NE(table[1], nullptr);
    EXPECT_EQ(table[3], nullptr);

    for (int length : {0, 2}) {  // zero-length, and shorter than its own header
        Block empty;
        empty.Add(1, 4).Add(2, 4, length).Add(3, 4);
        EXPECT_EQ(parse_rtattr(table, 3, empty.First(), empty.Size()), -1) << length;
    }

    Block tail;
    tail.Add(1, 4);
    EXPECT_EQ(parse_rtattr(table, 3, tail.First(), tail.Size() + 2), -1);  // a stray half header
    EXPECT_EQ(parse_rtattr(table, 3, tail.First(), tail.Size() - 2), -1);  // cut short
    EXPECT_EQ(parse_rtattr(table, 3, tail.First(), -1), -1);
    EXPECT_EQ(parse_rtattr(nullptr, 3, tail.First(), tail.Size()), -1);
}

}  // namespace
}  // namespace vornwireless::utils
