// Descriptors as sequential sources.
#include <cerrno>

#include <sys/socket.h>

#include "tests/host/support.h"

namespace pelm::host_test {
namespace {

TEST(HostDescriptor, dribbles_add_up_to_full_reads) {
    const std::string bytes = numbered_bytes(300);
    for (const int32_t step : {1, 7, 100, 299, 300, 301}) {
        Pipe pipe;
        Source source;
        ASSERT_EQ(PelmHost_OpenDescriptor(&source, pipe.reader(), 0), 0);
        const DribblingWriter writer(pipe, bytes);
        std::string all;
        for (std::string piece; all.size() < bytes.size(); all += piece) {
            piece = read_some(source, step);
            ASSERT_EQ(piece.size(), std::min(static_cast<size_t>(step), bytes.size() - all.size()));
        }
        EXPECT_EQ(all, bytes);
        EXPECT_EQ(read_result(source), 0);
    }
}

TEST(HostDescriptor, its_size_is_unknown_until_its_end_was_met) {
    Pipe pipe;
    pipe.write_bytes("abcde");
    pipe.close_writer();
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, pipe.reader(), 99), 0);
    EXPECT_EQ(source.kind, uint32_t{PELM_SOURCE_SEQUENTIAL});
    EXPECT_EQ(source.data, nullptr);
    EXPECT_EQ(source.bufferSize, 99);
    EXPECT_EQ(source.size, unknown_size);
    EXPECT_EQ(read_some(source, 5), "abcde");
    EXPECT_EQ(source.size, unknown_size);
    EXPECT_EQ(source.consumed, 5);
    EXPECT_EQ(read_result(source), 0);
    EXPECT_EQ(source.size, 5);
    EXPECT_EQ(source.consumed, 5);
    EXPECT_EQ(PelmHost_ReadError(&source), 0);
}

TEST(HostDescriptor, moves_forward_by_reading_and_never_back) {
    Pipe pipe;
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, pipe.reader(), 0), 0);
    const DribblingWriter writer(pipe, "0123456789");
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 3, 0), 3);
    EXPECT_EQ(read_some(source, 2), "34");
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 0, 0), 0);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, -1, 1), 0);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, INT32_MIN, 1), 0);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 5, 7), 0);
    EXPECT_EQ(source.consumed, 5);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 2, 1), 2);
    EXPECT_EQ(read_some(source, 1), "7");
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, INT32_MAX, 1), 2);
    EXPECT_EQ(source.size, 10);
    EXPECT_EQ(read_result(source), 0);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, INT32_MAX, 0), 0);
}

TEST(HostDescriptor, a_seek_discards_more_than_one_buffer) {
    const std::string bytes = numbered_bytes(20000);
    const TemporaryFile file(bytes);
    const int descriptor = open(file.path(), O_RDONLY);
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, descriptor, 0), 0);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 19990, 0), 19990);
    EXPECT_EQ(read_some(source, 20), bytes.substr(19990));
    close(descriptor);
}

TEST(HostDescriptor, starts_where_it_stands_and_stays_open) {
    const TemporaryFile file("0123456789");
    const int descriptor = open(file.path(), O_RDONLY);
    ASSERT_EQ(lseek(descriptor, 4, SEEK_SET), 4);
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, descriptor, 0), 0);
    EXPECT_EQ(read_some(source, 2), "45");
    EXPECT_EQ(source.consumed, 2);
    PelmHost_Close(&source);
    EXPECT_EQ(lseek(descriptor, 0, SEEK_CUR), 6);
    EXPECT_EQ(close(descriptor), 0);
}

TEST(HostDescriptor, one_without_an_end_ends_before_the_position_overflows) {
    const int descriptor = open("/dev/zero", O_RDONLY);
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, descriptor, 0), 0);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, INT32_MAX - 2, 0), INT32_MAX - 2);
    EXPECT_EQ(read_some(source, 10).size(), 2u);
    EXPECT_EQ(source.consumed, source.size);
    EXPECT_EQ(read_result(source, 10), 0);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, INT32_MAX, 1), 0);
    EXPECT_EQ(PelmHost_ReadError(&source), 0);
    close(descriptor);
}

TEST(HostDescriptor, a_directory_fails_at_every_read) {
    const int descriptor = open("/", O_RDONLY | O_DIRECTORY);
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, descriptor, 0), 0);
    for (int i = 0; i < 2; ++i) {
        EXPECT_EQ(read_result(source), -1);
        EXPECT_EQ(PelmHost_ReadError(&source), EISDIR);
        EXPECT_NE(source.consumed, source.size);
    }
    close(descriptor);
}

TEST(HostDescriptor, a_seek_over_a_failure_leaves_it_to_the_next_read) {
    const int descriptor = open("/", O_RDONLY | O_DIRECTORY);
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, descriptor, 0), 0);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 5, 0), 0);
    EXPECT_EQ(PelmHost_ReadError(&source), EISDIR);
    close(descriptor);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 5, 0), 0);
    EXPECT_EQ(read_result(source), -1);
    EXPECT_EQ(PelmHost_ReadError(&source), EISDIR);
    EXPECT_EQ(read_result(source), -1);
    EXPECT_EQ(PelmHost_ReadError(&source), EBADF);
}

// A socket whose peer goes away without having read everything delivers what came before it reports that.
TEST(HostDescriptor, bytes_before_a_failure_are_delivered_first) {
    int ends[2];
    ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM, 0, ends), 0);
    ASSERT_EQ(write(ends[0], "unread", 6), 6);
    ASSERT_EQ(write(ends[1], "abc", 3), 3);
    close(ends[1]);
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, ends[0], 0), 0);
    EXPECT_EQ(read_some(source, 10), "abc");
    EXPECT_EQ(PelmHost_ReadError(&source), ECONNRESET);
    EXPECT_EQ(source.consumed, 3);
    EXPECT_EQ(read_result(source), -1);
    EXPECT_EQ(PelmHost_ReadError(&source), ECONNRESET);
    EXPECT_NE(source.consumed, source.size);
    close(ends[0]);
}

TEST(HostDescriptor, one_that_does_not_block_is_waited_for) {
    Pipe pipe(O_NONBLOCK);
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, pipe.reader(), 0), 0);
    const DribblingWriter writer(pipe, "0123456789");
    EXPECT_EQ(read_some(source, 10), "0123456789");
    EXPECT_EQ(PelmHost_ReadError(&source), 0);
}

TEST(HostDescriptor, is_read_in_full_under_a_control_too) {
    const Control control;
    PelmHost_UseForThread(control);
    const std::string bytes = numbered_bytes(300);
    Pipe pipe;
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, pipe.reader(), 0), 0);
    const DribblingWriter writer(pipe, bytes);
    EXPECT_EQ(read_all(source, 70), bytes);
}

TEST(HostDescriptor, what_is_not_open_for_reading_is_refused) {
    const Pipe pipe;
    Source source;
    EXPECT_EQ(PelmHost_OpenDescriptor(&source, pipe.writer(), 0), EBADF);
    EXPECT_TRUE(is_zeroed(source));
    EXPECT_EQ(PelmHost_OpenDescriptor(&source, -1, 0), EBADF);
    EXPECT_TRUE(is_zeroed(source));
    EXPECT_EQ(PelmHost_OpenDescriptor(nullptr, pipe.reader(), 0), EINVAL);
}

} // namespace
} // namespace pelm::host_test
