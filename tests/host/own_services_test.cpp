// An application that links the static library and replaces one of its services: the application's own wins, the
// others are the library's.
#include "tests/host/support.h"

namespace {
int polls = 0;
}

extern "C" void ZOTARPELM_CheckExStatus(int32_t *status) {
    ++polls;
    *status = 77;
}

namespace pelm::host_test {
namespace {

TEST(HostOwnServices, win_over_those_of_the_static_library) {
    polls = 0;
    int32_t status = 0;
    ZOTARPELM_CheckExStatus(&status);
    EXPECT_EQ(status, 77);
    EXPECT_EQ(polls, 1);
}

TEST(HostOwnServices, leave_the_others_in_place) {
    const Control control;
    PelmHost_UseForThread(control);
    ZOTARPELM_OsFree(ZOTARPELM_OsMalloc(5));
    ZOTARPELM_OsSleep(0);
    EXPECT_EQ(control.counters().allocations, 1u);
    std::string bytes = "abc";
    Source source;
    ASSERT_EQ(PelmHost_OpenMemory(&source, PELM_SOURCE_STREAM, writable(bytes), 3), 0);
    EXPECT_EQ(read_all(source, 2), "abc");
}

} // namespace
} // namespace pelm::host_test
