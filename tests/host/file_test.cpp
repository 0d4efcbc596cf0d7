// Regular files as seekable streams.
#include <cerrno>
#include <climits>
#include <filesystem>

#include <sys/inotify.h>
#include <sys/resource.h>
#include <sys/stat.h>

#include "tests/host/support.h"

namespace pelm::host_test {
namespace {

TEST(HostFile, delivers_its_bytes_in_steps_of_any_size) {
    const std::string bytes = numbered_bytes(5000);
    const TemporaryFile file(bytes);
    for (const int32_t step : {1, 7, 4999, 5000, 6000}) {
        Source source;
        ASSERT_EQ(PelmHost_OpenFile(&source, file.path(), 123), 0);
        EXPECT_EQ(source.kind, uint32_t{PELM_SOURCE_STREAM});
        EXPECT_EQ(source.size, 5000);
        EXPECT_EQ(source.data, nullptr);
        EXPECT_EQ(source.consumed, 0);
        EXPECT_EQ(source.bufferSize, 123);
        EXPECT_EQ(read_all(source, step), bytes);
        EXPECT_EQ(source.consumed, source.size);
        EXPECT_EQ(PelmHost_ReadError(&source), 0);
    }
}

TEST(HostFile, proposes_the_default_buffer_size_for_0_and_below) {
    const TemporaryFile file("a");
    for (const int32_t proposal : {0, -1, INT32_MIN}) {
        Source source;
        ASSERT_EQ(PelmHost_OpenFile(&source, file.path(), proposal), 0);
        EXPECT_EQ(source.bufferSize, PELM_HOST_BUFFER_SIZE);
    }
}

TEST(HostFile, two_sources_over_one_file_do_not_move_each_other) {
    const TemporaryFile file("0123456789");
    Source first;
    Source second;
    ASSERT_EQ(PelmHost_OpenFile(&first, file.path(), 0), 0);
    ASSERT_EQ(PelmHost_OpenFile(&second, file.path(), 0), 0);
    EXPECT_EQ(read_some(first, 4), "0123");
    EXPECT_EQ(read_some(second, 2), "01");
    EXPECT_EQ(read_some(first, 2), "45");
}

TEST(HostFile, is_not_inherited_by_programs_that_the_application_starts) {
    const TemporaryFile file("a");
    const int descriptor = next_descriptor();
    Source source;
    ASSERT_EQ(PelmHost_OpenFile(&source, file.path(), 0), 0);
    EXPECT_EQ(fcntl(descriptor, F_GETFD) & FD_CLOEXEC, FD_CLOEXEC);
    PelmHost_Close(&source);
    EXPECT_EQ(fcntl(descriptor, F_GETFD), -1);
}

TEST(HostFile, the_largest_possible_is_read_to_its_last_byte) {
    const TemporaryFile file("");
    file.resize(INT32_MAX);
    file.overwrite_last_byte(INT32_MAX, 'z');
    Source source;
    ASSERT_EQ(PelmHost_OpenFile(&source, file.path(), 0), 0);
    EXPECT_EQ(source.size, INT32_MAX);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, INT32_MAX - 1, 0), INT32_MAX - 1);
    EXPECT_EQ(read_some(source, 10), "z");
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, INT32_MAX, 1), 0);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, INT32_MIN, 1), -INT32_MAX);
}

TEST(HostFile, larger_ones_are_refused) {
    const TemporaryFile file("");
    file.resize(int64_t{INT32_MAX} + 1);
    const int next = next_descriptor();
    Source source;
    EXPECT_EQ(PelmHost_OpenFile(&source, file.path(), 0), EFBIG);
    EXPECT_TRUE(is_zeroed(source));
    EXPECT_EQ(next_descriptor(), next);
}

TEST(HostFile, one_that_became_shorter_ends_where_it_ends_now) {
    const TemporaryFile file("0123456789");
    Source source;
    ASSERT_EQ(PelmHost_OpenFile(&source, file.path(), 0), 0);
    file.resize(6);
    EXPECT_EQ(read_some(source, 8), "012345");
    EXPECT_EQ(source.size, 6);
    EXPECT_EQ(read_result(source), 0);
    EXPECT_EQ(PelmHost_ReadError(&source), 0);
}

TEST(HostFile, what_is_not_a_regular_file_is_refused) {
    for (const std::string &path : {std::filesystem::temp_directory_path().string(), std::string("/dev/null")}) {
        Source source;
        EXPECT_EQ(PelmHost_OpenFile(&source, path.c_str(), 0), ESPIPE) << path;
        EXPECT_TRUE(is_zeroed(source));
    }
}

TEST(HostFile, a_pipe_is_refused_without_being_opened) {
    const std::string path = testing::TempDir() + "pelm_host_fifo_" + std::to_string(getpid());
    ASSERT_EQ(mkfifo(path.c_str(), 0600), 0);
    const int watcher = inotify_init1(IN_NONBLOCK);
    ASSERT_GE(inotify_add_watch(watcher, path.c_str(), IN_OPEN), 0);
    Source source;
    EXPECT_EQ(PelmHost_OpenFile(&source, path.c_str(), 0), ESPIPE);
    char event[sizeof(inotify_event) + NAME_MAX + 1];
    EXPECT_EQ(read(watcher, event, sizeof event), -1) << "it was opened";
    close(watcher);
    unlink(path.c_str());
}

TEST(HostFile, failures_to_open_are_told_by_their_errno_value) {
    Source source;
    EXPECT_EQ(PelmHost_OpenFile(&source, "/no/such/file", 0), ENOENT);
    EXPECT_TRUE(is_zeroed(source));
    EXPECT_EQ(PelmHost_OpenFile(&source, nullptr, 0), EINVAL);
    EXPECT_TRUE(is_zeroed(source));
    EXPECT_EQ(PelmHost_OpenFile(nullptr, "/dev/null", 0), EINVAL);
}

TEST(HostFile, a_process_without_free_descriptors_is_told_so) {
    const TemporaryFile file("a");
    rlimit before = {};
    ASSERT_EQ(getrlimit(RLIMIT_NOFILE, &before), 0);
    const rlimit none = {static_cast<rlim_t>(next_descriptor()), before.rlim_max};
    ASSERT_EQ(setrlimit(RLIMIT_NOFILE, &none), 0);
    Source source;
    const int error = PelmHost_OpenFile(&source, file.path(), 0);
    setrlimit(RLIMIT_NOFILE, &before);
    EXPECT_EQ(error, EMFILE);
}

} // namespace
} // namespace pelm::host_test
