#include <gtest/gtest.h>

#include "png/crc32.h"
#include "tests/png/support/png_builder.h"
#include "tests/support/guarded_buffer.h"
#include "tests/support/kernels.h"

#ifdef PELM_TEST_HAS_ZLIB
#include <zlib.h>
#endif

namespace pelm::test {

namespace {

Bytes counting_bytes(size_t size) {
    Bytes bytes(size);
    for (size_t i = 0; i < size; ++i)
        bytes[i] = static_cast<uint8_t>(i * 167 + (i >> 8) + 13);
    return bytes;
}

} // namespace

TEST(Crc, known_values) {
    const std::string digits = "123456789";
    EXPECT_EQ(__PELMI_PngCrc32(reinterpret_cast<const uint8_t *>(digits.data()), 9), 0xCBF43926u);
    const std::string iend = "IEND";
    EXPECT_EQ(__PELMI_PngCrc32(reinterpret_cast<const uint8_t *>(iend.data()), 4), 0xAE426082u);
    EXPECT_EQ(__PELMI_PngCrc32(nullptr, 0), 0u);
}

TEST(Crc, every_length_up_to_300_at_every_alignment_equals_the_bytewise_checksum) {
    const Bytes bytes = counting_bytes(316);
    for (size_t at = 0; at < 16; ++at)
        for (size_t length = 0; length <= 300; ++length) {
            const Bytes part(bytes.begin() + static_cast<ptrdiff_t>(at),
                             bytes.begin() + static_cast<ptrdiff_t>(at + length));
            const uint32_t expected = crc32_of(part);
            for (const Kernels kind : all_kernels()) {
                const WithKernels with(kind);
                ASSERT_EQ(__PELMI_PngCrc32(bytes.data() + at, static_cast<uint32_t>(length)), expected)
                    << length << " bytes at " << at << ", kernels " << static_cast<int>(kind);
            }
        }
}

// A checksum is linear: where each single bit is right, and what it goes on from, all are.
TEST(Crc, every_single_bit_counts_as_it_does_bytewise) {
    for (const size_t length : {64u, 176u, 300u})
        for (size_t bit = 0; bit < 8 * length; ++bit) {
            Bytes bytes(length);
            bytes[bit / 8] = static_cast<uint8_t>(1u << bit % 8);
            const uint32_t expected = crc32_of(bytes);
            for (const Kernels kind : all_kernels()) {
                const WithKernels with(kind);
                ASSERT_EQ(__PELMI_PngCrc32(bytes.data(), static_cast<uint32_t>(length)), expected)
                    << length << " bytes, bit " << bit << ", kernels " << static_cast<int>(kind);
            }
        }
}

TEST(Crc, stays_within_its_bytes) {
    for (const Kernels kind : all_kernels()) {
        const WithKernels with(kind);
        for (size_t length = 0; length <= 200; ++length)
            for (const Edge edge : {Edge::end, Edge::start}) {
                GuardedBuffer memory;
                uint8_t *const bytes = memory.take(length, edge);
                for (size_t i = 0; i < length; ++i)
                    bytes[i] = static_cast<uint8_t>(7 * i);
                EXPECT_EQ(__PELMI_PngCrc32(bytes, static_cast<uint32_t>(length)),
                          crc32_of(Bytes(bytes, bytes + length)));
                EXPECT_TRUE(memory.intact());
            }
    }
}

TEST(Crc, a_checksum_continued_in_two_parts_equals_that_of_the_whole) {
    const Bytes bytes = counting_bytes(260);
    const uint32_t whole = crc32_of(bytes);
    for (size_t cut = 0; cut <= bytes.size(); ++cut) {
        const uint32_t first = crc32_go_on(crc32_start, bytes.data(), cut);
        EXPECT_EQ(~crc32_go_on(first, bytes.data() + cut, bytes.size() - cut), whole) << "cut at " << cut;
    }
}

#ifdef PELM_TEST_HAS_ZLIB
TEST(Crc, equals_the_one_of_zlib) {
    const Bytes bytes = counting_bytes(100000);
    for (const uint32_t length : {0u, 1u, 5u, 1000u, 65537u, 100000u})
        EXPECT_EQ(__PELMI_PngCrc32(bytes.data(), length), crc32(0, bytes.data(), length)) << length << " bytes";
}
#endif

} // namespace pelm::test
