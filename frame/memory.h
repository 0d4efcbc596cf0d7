// Memory of the host. Sizes are computed in 64 bits: what the service's 32 bits cannot name is a failed allocation.
#pragma once

#include <cstdint>
#include <limits>

#include "frame/host.h"

namespace pelm {

inline void *allocate(uint64_t bytes) {
    return bytes > std::numeric_limits<uint32_t>::max() ? nullptr : ZOTARPELM_OsMalloc(static_cast<uint32_t>(bytes));
}

// Uninitialised; NULL without memory. However large the count, the product does not wrap.
template <class Element>
Element *allocate_array(uint64_t count) {
    constexpr uint64_t most = std::numeric_limits<uint32_t>::max() / sizeof(Element);
    return count > most ? nullptr : static_cast<Element *>(allocate(count * sizeof(Element)));
}

// Zeroed; NULL without memory.
template <class Record>
Record *new_record() {
    auto *const record = static_cast<Record *>(ZOTARPELM_OsMalloc(sizeof(Record)));
    if (record != nullptr) ZOTARPELM_OsMemset(record, 0, sizeof(Record));
    return record;
}

// Frees the block, if there is one, and clears the pointer.
template <class Block>
void free_block(Block *&block) {
    if (block != nullptr) ZOTARPELM_OsFree(block);
    block = nullptr;
}

} // namespace pelm
