#include "tests/support/guarded_buffer.h"

#include <cstdlib>

namespace pelm::test {

uint8_t *GuardedBuffer::take(size_t size, Edge edge) {
    uint8_t *const bytes =
        PelmTest_TakeArea(&area_, size, edge == Edge::start ? PELM_TEST_AREA_AT_START : PELM_TEST_AREA_AT_END);
    if (bytes == nullptr) abort();
    return bytes;
}

} // namespace pelm::test
