// The seek service on what can be sought freely; the sequential sources have their own tests.
#include "tests/host/support.h"

namespace pelm::host_test {
namespace {

struct SeekCase {
    int32_t from;
    int32_t offset;
    int32_t origin;
    int32_t reached; // in 10 bytes
};

constexpr SeekCase cases[] = {
    {0, 0, 0, 0},
    {0, 4, 0, 4},
    {4, 4, 0, 4},
    {7, 4, 0, 4},
    {0, 10, 0, 10},
    {0, 11, 0, 10},
    {3, INT32_MAX, 0, 10},
    {3, -1, 0, 0},
    {3, INT32_MIN, 0, 0},
    {3, 0, 1, 3},
    {3, 4, 1, 7},
    {3, -3, 1, 0},
    {3, -4, 1, 0},
    {3, 8, 1, 10},
    {10, INT32_MAX, 1, 10},
    {10, INT32_MIN, 1, 0},
    {10, -10, 1, 0},
    // Origins that do not exist.
    {3, 5, 2, 3},
    {3, 5, -1, 3},
    {3, 5, INT32_MIN, 3},
};

void expect_seeks(InputSource &source) {
    for (const SeekCase &each : cases) {
        SCOPED_TRACE(testing::Message() << each.offset << " from " << each.from << ", origin " << each.origin);
        ZOTARPELM_Seek_IO(&source, each.from, 0);
        ASSERT_EQ(source.consumed, each.from);
        EXPECT_EQ(ZOTARPELM_Seek_IO(&source, each.offset, each.origin), each.reached - each.from);
        EXPECT_EQ(source.consumed, each.reached);
        EXPECT_EQ(read_some(source, 20), std::string("0123456789").substr(static_cast<size_t>(each.reached)));
    }
}

TEST(HostSeek, returns_the_distance_moved_within_memory) {
    std::string bytes = "0123456789";
    for (const uint32_t kind : {0u, 1u, 2u, 4u}) {
        Source source;
        ASSERT_EQ(PelmHost_OpenMemory(&source, kind, writable(bytes), 10), 0);
        expect_seeks(source);
    }
}

TEST(HostSeek, returns_the_distance_moved_within_a_file) {
    const TemporaryFile file("0123456789");
    Source source;
    ASSERT_EQ(PelmHost_OpenFile(&source, file.path(), 0), 0);
    expect_seeks(source);
    source.kind = PELM_SOURCE_STREAM_ALT;
    expect_seeks(source);
}

TEST(HostSeek, returns_the_distance_moved_within_a_file_in_memory) {
    const TemporaryFile file("0123456789");
    for (const uint32_t kind : {0u, 1u, 2u, 4u}) {
        Source source;
        ASSERT_EQ(PelmHost_OpenFileInMemory(&source, kind, file.path(), 0), 0);
        expect_seeks(source);
    }
}

TEST(HostSeek, of_nothing_moves_by_0) {
    EXPECT_EQ(ZOTARPELM_Seek_IO(nullptr, 5, 0), 0);
}

} // namespace
} // namespace pelm::host_test
