// What blocks hold when the host for tests frees them. The linker leads its free here.
#include <cstdint>
#include <cstring>
#include <vector>

#include <gtest/gtest.h>

#include "PelmHostTesting.h"

namespace {

constexpr size_t size = 100;
constexpr uintptr_t longest_margin = 64; // in front of a block

uintptr_t watched = 0; // the block whose memory is looked at; 0: none
uint8_t left[size];    // what it held

} // namespace

extern "C" {
void __real_free(void *memory);
void __wrap_free(void *memory) {
    const auto start = reinterpret_cast<uintptr_t>(memory);
    if (watched != 0 && start <= watched && watched - start <= longest_margin) {
        memcpy(left, static_cast<uint8_t *>(memory) + (watched - start), size);
        watched = 0;
    }
    __real_free(memory);
}
}

namespace {

class FreedBlocks : public testing::Test {
protected:
    FreedBlocks() { PelmTest_Reset(); }
    ~FreedBlocks() override { PelmTest_Reset(); }

    // Of a block with these bytes in it, once `give_back` has freed it.
    template <class GiveBack>
    static std::vector<uint8_t> freed(int32_t filling, uint8_t held, GiveBack give_back) {
        PelmTest_Faults()->filling = filling;
        void *const block = ZOTARPELM_OsMalloc(size);
        memset(block, held, size);
        watched = reinterpret_cast<uintptr_t>(block);
        give_back(block);
        EXPECT_EQ(watched, 0u) << "it was not freed";
        return {left, left + size};
    }
};

TEST_F(FreedBlocks, hold_neither_what_they_held_nor_what_new_ones_do) {
    for (const int32_t filling : {0xA5, 0x00, 0xFF})
        EXPECT_EQ(freed(filling, 0x42, ZOTARPELM_OsFree), std::vector<uint8_t>(size, static_cast<uint8_t>(~filling)));
}

TEST_F(FreedBlocks, are_overwritten_by_a_reset_too) {
    EXPECT_EQ(freed(0xA5, 0x42, [](void *) { PelmTest_Reset(); }), std::vector<uint8_t>(size, 0x5A));
}

TEST_F(FreedBlocks, are_left_alone_where_new_ones_are) {
    EXPECT_EQ(freed(-1, 0x42, ZOTARPELM_OsFree), std::vector<uint8_t>(size, 0x42));
}

} // namespace
