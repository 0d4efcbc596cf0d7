// Eight bytes a step through eight tables: table k advances a byte by k further bytes of zeros. Where the processor can
// fold, the tables get what is left of the folding.
#include "png/crc32.h"

#include <array>

#include "frame/bytes.h"
#include "frame/processor.h"
#include "png/crc32_folding.h"

namespace pelm {
namespace {

using Tables = std::array<std::array<uint32_t, 256>, 8>;

constexpr Tables make_tables() {
    Tables tables{};
    for (uint32_t byte = 0; byte < 256; ++byte) {
        uint32_t crc = byte;
        for (int32_t bit = 0; bit < 8; ++bit)
            crc = (crc & 1) != 0 ? crc >> 1 ^ crc32_polynomial : crc >> 1;
        tables[0][byte] = crc;
    }
    for (uint32_t k = 1; k < 8; ++k)
        for (uint32_t byte = 0; byte < 256; ++byte) {
            const uint32_t crc = tables[k - 1][byte];
            tables[k][byte] = crc >> 8 ^ tables[0][crc & 0xFF];
        }
    return tables;
}

constexpr Tables tables = make_tables();

uint32_t four_bytes(uint32_t word, uint32_t first_table) {
    return tables[first_table + 3][word & 0xFF] ^ tables[first_table + 2][word >> 8 & 0xFF] ^
           tables[first_table + 1][word >> 16 & 0xFF] ^ tables[first_table][word >> 24];
}

uint32_t go_on_by_tables(uint32_t crc, const uint8_t *bytes, size_t length) {
    for (; length >= 8; length -= 8, bytes += 8)
        crc = four_bytes(read_u32le(bytes) ^ crc, 4) ^ four_bytes(read_u32le(bytes + 4), 0);
    for (; length > 0; --length)
        crc = tables[0][(crc ^ *bytes++) & 0xFF] ^ crc >> 8;
    return crc;
}

constexpr size_t least_to_fold = 48; // bytes: fewer go faster through the tables

} // namespace

uint32_t crc32_go_on(uint32_t crc, const uint8_t *bytes, size_t length) {
    if (length >= least_to_fold && kernels() >= Kernels::carryless) {
        const size_t blocks = length / 16;
        crc = go_on_by_tables(0, crc32_fold(crc, bytes, blocks).bytes, 16);
        bytes += 16 * blocks;
        length -= 16 * blocks;
    }
    return go_on_by_tables(crc, bytes, length);
}

} // namespace pelm

uint32_t __PELMI_PngCrc32(const uint8_t *bytes, uint32_t length) {
    return ~pelm::crc32_go_on(pelm::crc32_start, bytes, length);
}
