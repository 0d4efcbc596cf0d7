#include "png/idat_index.h"

#include "frame/memory.h"

namespace pelm {
namespace {

bool start_table(PngDecodeState &state) {
    state.idatTable = allocate_array<PngIdatEntry>(IDAT_TABLE_STEP);
    if (state.idatTable == nullptr) return false;
    state.idatCapacity = IDAT_TABLE_STEP;
    return true;
}

// The used entries wait in a temporary block, so that the old table is free before the new one is asked for.
bool grow_table(PngDecodeState &state) {
    const uint64_t used = uint64_t{state.idatCount} * sizeof(PngIdatEntry);
    const uint64_t wanted = used + uint64_t{IDAT_TABLE_STEP} * sizeof(PngIdatEntry);
    void *const kept = allocate(used);
    if (kept == nullptr) return false;
    ZOTARPELM_OsMemcpy(kept, state.idatTable, static_cast<uint32_t>(used));
    ZOTARPELM_OsFree(state.idatTable);
    state.idatTable = static_cast<PngIdatEntry *>(allocate(wanted));
    if (state.idatTable != nullptr) {
        ZOTARPELM_OsMemset(state.idatTable, 0, static_cast<uint32_t>(wanted));
        ZOTARPELM_OsMemcpy(state.idatTable, kept, static_cast<uint32_t>(used));
        state.idatCapacity += IDAT_TABLE_STEP;
    }
    ZOTARPELM_OsFree(kept);
    return state.idatTable != nullptr;
}

} // namespace

bool index_idat(PngDecodeState &state, const PngInputBuffer &input, uint32_t length) {
    if (state.idatTable == nullptr) {
        if (!start_table(state)) return false;
    } else if (state.idatCount == state.idatCapacity && !grow_table(state)) {
        return false;
    }
    PngIdatEntry &entry = state.idatTable[state.idatCount];
    entry = {};
    entry.length = length;
    if (reads_memory(input)) {
        entry.memoryAddress = input.data + input.readPos;
    } else {
        entry.wholeLength = length;
        entry.sourceOffset = input.bufferStart + input.readPos;
    }
    state.idatIndexed = ++state.idatCount;
    state.idatTotalBytes += length;
    return true;
}

} // namespace pelm
