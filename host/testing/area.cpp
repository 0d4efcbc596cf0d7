// Memory between inaccessible pages.
#include <sys/mman.h>
#include <unistd.h>

#include <cstring>

#include "PelmHostTesting.h"

namespace {

constexpr uint8_t canary = 0xC3;
// Canaries beyond this distance from the area are not looked at.
constexpr size_t watched = 512;

size_t watched_of(size_t bytes) {
    return bytes < watched ? bytes : watched;
}

size_t room_before(const PelmTestArea &area) {
    return static_cast<size_t>(area.bytes - area.room);
}

size_t room_behind(const PelmTestArea &area) {
    return area.roomSize - area.size - room_before(area);
}

bool are_canaries(const uint8_t *bytes, size_t count) {
    for (size_t i = 0; i < count; ++i)
        if (bytes[i] != canary) return false;
    return true;
}

bool reserve(PelmTestArea &area, size_t size) {
    if (area.mapping != nullptr && area.roomSize >= size) return true;
    PelmTest_ReleaseArea(&area);
    const auto page = static_cast<size_t>(sysconf(_SC_PAGESIZE));
    if (size > SIZE_MAX / 2) return false;
    const size_t room = (size / page + 1) * page;
    void *const mapping = mmap(nullptr, room + 2 * page, PROT_NONE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (mapping == MAP_FAILED) return false;
    area.mapping = static_cast<uint8_t *>(mapping);
    area.mappingSize = room + 2 * page;
    area.room = area.mapping + page;
    area.roomSize = room;
    if (mprotect(area.room, room, PROT_READ | PROT_WRITE) == 0) return true;
    PelmTest_ReleaseArea(&area);
    return false;
}

} // namespace

uint8_t *PelmTest_TakeArea(PelmTestArea *area, size_t size, int edge) {
    if (!reserve(*area, size)) return nullptr;
    area->bytes = edge == PELM_TEST_AREA_AT_START ? area->room : area->room + (area->roomSize - size);
    area->size = size;
    const size_t before = watched_of(room_before(*area));
    memset(area->bytes - before, canary, before);
    memset(area->bytes + size, canary, watched_of(room_behind(*area)));
    return area->bytes;
}

int PelmTest_AreaIsIntact(const PelmTestArea *area) {
    if (area->bytes == nullptr) return 1;
    const size_t before = watched_of(room_before(*area));
    return are_canaries(area->bytes - before, before) &&
           are_canaries(area->bytes + area->size, watched_of(room_behind(*area)));
}

void PelmTest_ReleaseArea(PelmTestArea *area) {
    if (area->mapping != nullptr) munmap(area->mapping, area->mappingSize);
    *area = PelmTestArea{};
}
