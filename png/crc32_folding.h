// Checksums by carry-less multiplication, on x86 processors that have it.
#pragma once

#include <cstddef>
#include <cstdint>

namespace pelm {

struct FoldedBytes {
    uint8_t bytes[16];
};

// Sixteen bytes whose checksum, gone on with from 0, is that of `blocks` times sixteen bytes, gone on with from `crc`.
// `blocks` is at least 1, and kernels() at least Kernels::carryless.
FoldedBytes crc32_fold(uint32_t crc, const uint8_t *bytes, size_t blocks);

} // namespace pelm
