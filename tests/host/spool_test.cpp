// Files and streams that are read whole into private memory.
#include <cerrno>

#include <malloc.h>
#include <sys/stat.h>

#include "tests/host/scripted_stream.h"
#include "tests/host/support.h"

namespace pelm::host_test {
namespace {

constexpr uint32_t all_kinds[] = {PELM_SOURCE_STREAM, PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM_ALT,
                                  PELM_SOURCE_SEQUENTIAL};

void expect_spooled(InputSource &source, uint32_t kind, const std::string &bytes) {
    EXPECT_EQ(source.kind, kind);
    EXPECT_EQ(source.size, static_cast<int32_t>(bytes.size()));
    EXPECT_EQ(source.consumed, 0);
    EXPECT_EQ(source.data != nullptr, kind == PELM_SOURCE_MEMORY);
    EXPECT_EQ(read_all(source, 1000), bytes);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 0, 0), -source.size) << "seeks both ways whatever the kind";
    EXPECT_EQ(read_all(source, 777), bytes);
}

// An error for a limit, from each opener.
int open_file(const std::string &bytes, int32_t limit) {
    const TemporaryFile file(bytes);
    Source source;
    const int error = PelmHost_OpenFileInMemory(&source, PELM_SOURCE_MEMORY, file.path(), limit);
    EXPECT_EQ(is_zeroed(source), error != 0);
    return error;
}

int open_pipe(const std::string &bytes, int32_t limit) {
    Pipe pipe;
    pipe.write_bytes(bytes);
    pipe.close_writer();
    FILE *const stream = fdopen(dup(pipe.reader()), "r");
    Source source;
    const int error = PelmHost_OpenSpooled(&source, PELM_SOURCE_MEMORY, stream, limit);
    EXPECT_EQ(is_zeroed(source), error != 0);
    fclose(stream);
    return error;
}

TEST(HostFileInMemory, delivers_the_file_as_every_kind) {
    for (const size_t size : {0u, 1u, 4096u, 200000u}) {
        const std::string bytes = numbered_bytes(size);
        const TemporaryFile file(bytes);
        for (const uint32_t kind : all_kinds) {
            Source source;
            ASSERT_EQ(PelmHost_OpenFileInMemory(&source, kind, file.path(), 0), 0);
            expect_spooled(source, kind, bytes);
        }
    }
}

TEST(HostFileInMemory, leaves_no_descriptor_open) {
    const TemporaryFile file("abc");
    const int next = next_descriptor();
    Source source;
    ASSERT_EQ(PelmHost_OpenFileInMemory(&source, PELM_SOURCE_STREAM, file.path(), 0), 0);
    Source refused;
    EXPECT_EQ(PelmHost_OpenFileInMemory(&refused, PELM_SOURCE_STREAM, file.path(), 2), EFBIG);
    EXPECT_EQ(next_descriptor(), next);
}

TEST(HostFileInMemory, files_that_do_not_tell_their_size_are_read_whole) {
    Source source;
    ASSERT_EQ(PelmHost_OpenFileInMemory(&source, PELM_SOURCE_STREAM, "/proc/self/status", 0), 0);
    EXPECT_GT(source.size, 0);
    EXPECT_NE(read_all(source, 100).find("Name:"), std::string::npos);
    Source limited;
    EXPECT_EQ(PelmHost_OpenFileInMemory(&limited, PELM_SOURCE_STREAM, "/proc/self/status", 20), EFBIG);
}

TEST(HostFileInMemory, a_named_pipe_is_read_to_its_end) {
    const std::string path = testing::TempDir() + "pelm_host_named_pipe_" + std::to_string(getpid());
    ASSERT_EQ(mkfifo(path.c_str(), 0600), 0);
    const std::string bytes = numbered_bytes(300000);
    std::thread writer([&] {
        FILE *const out = fopen(path.c_str(), "w");
        fwrite(bytes.data(), 1, bytes.size(), out);
        fclose(out);
    });
    Source source;
    EXPECT_EQ(PelmHost_OpenFileInMemory(&source, PELM_SOURCE_STREAM, path.c_str(), 0), 0);
    writer.join();
    EXPECT_EQ(read_all(source, 4096), bytes);
    unlink(path.c_str());
}

TEST(HostFileInMemory, the_limit_is_exact) {
    EXPECT_EQ(open_file("0123456789", 10), 0);
    EXPECT_EQ(open_file("0123456789", 9), EFBIG);
    EXPECT_EQ(open_file("", 1), 0);
    EXPECT_EQ(open_file("a", INT32_MAX), 0);
    EXPECT_EQ(open_file("a", -1), 0);
}

TEST(HostFileInMemory, a_huge_file_is_refused_before_it_is_read) {
    const TemporaryFile file("");
    file.resize(int64_t{1} << 40);
    Source source;
    EXPECT_EQ(PelmHost_OpenFileInMemory(&source, PELM_SOURCE_MEMORY, file.path(), 0), EFBIG);
}

TEST(HostFileInMemory, failures_are_told_by_their_errno_value) {
    const int next = next_descriptor();
    Source source;
    EXPECT_EQ(PelmHost_OpenFileInMemory(&source, PELM_SOURCE_MEMORY, "/no/such/file", 0), ENOENT);
    EXPECT_TRUE(is_zeroed(source));
    EXPECT_EQ(PelmHost_OpenFileInMemory(&source, PELM_SOURCE_MEMORY, "/", 0), EISDIR);
    EXPECT_TRUE(is_zeroed(source));
    EXPECT_EQ(PelmHost_OpenFileInMemory(&source, PELM_SOURCE_MEMORY, nullptr, 0), EINVAL);
    EXPECT_EQ(PelmHost_OpenFileInMemory(&source, 3, "/proc/self/status", 0), EINVAL);
    EXPECT_TRUE(is_zeroed(source));
    EXPECT_EQ(PelmHost_OpenFileInMemory(nullptr, PELM_SOURCE_MEMORY, "/dev/null", 0), EINVAL);
    EXPECT_EQ(next_descriptor(), next);
}

TEST(HostSpool, delivers_what_is_left_of_a_stream_as_every_kind) {
    const std::string bytes = numbered_bytes(200000);
    for (const uint32_t kind : all_kinds) {
        const TemporaryFile file(bytes);
        FILE *const stream = fopen(file.path(), "r");
        ASSERT_EQ(fseek(stream, 50, SEEK_SET), 0);
        Source source;
        ASSERT_EQ(PelmHost_OpenSpooled(&source, kind, stream, 0), 0);
        fclose(stream);
        expect_spooled(source, kind, bytes.substr(50));
    }
}

TEST(HostSpool, a_pipe_that_dribbles_is_read_to_its_end) {
    Pipe pipe;
    FILE *const stream = fdopen(dup(pipe.reader()), "r");
    const DribblingWriter writer(pipe, numbered_bytes(200));
    Source source;
    ASSERT_EQ(PelmHost_OpenSpooled(&source, PELM_SOURCE_MEMORY, stream, 0), 0);
    expect_spooled(source, PELM_SOURCE_MEMORY, numbered_bytes(200));
    fclose(stream);
}

TEST(HostSpool, what_exceeds_the_first_block_is_kept_as_it_grows) {
    std::vector<Answer> answers;
    std::string all;
    for (size_t i = 0; i < 400; ++i) {
        answers.push_back({numbered_bytes(1000 + i % 24)});
        all += answers.back().bytes;
    }
    const ScriptedStream stream(answers);
    Source source;
    ASSERT_EQ(PelmHost_OpenSpooled(&source, PELM_SOURCE_STREAM, stream.file(), 0), 0);
    expect_spooled(source, PELM_SOURCE_STREAM, all);
}

TEST(HostSpool, the_limit_is_exact) {
    EXPECT_EQ(open_pipe("0123456789", 10), 0);
    EXPECT_EQ(open_pipe("0123456789", 9), EFBIG);
    EXPECT_EQ(open_pipe("", 1), 0);
    EXPECT_EQ(open_pipe("a", 0), 0);
    EXPECT_EQ(open_pipe("a", INT32_MIN), 0);
}

TEST(HostSpool, a_stream_without_an_end_fails_as_soon_as_the_limit_is_exceeded) {
    FILE *const stream = fopen("/dev/zero", "r");
    ASSERT_NE(stream, nullptr);
    Source source;
    EXPECT_EQ(PelmHost_OpenSpooled(&source, PELM_SOURCE_MEMORY, stream, 1000000), EFBIG);
    EXPECT_TRUE(is_zeroed(source));
    fclose(stream);
}

TEST(HostSpool, a_failure_loses_what_was_read) {
    const ScriptedStream stream({{"abc"}, {"", EIO}});
    Source source;
    EXPECT_EQ(PelmHost_OpenSpooled(&source, PELM_SOURCE_MEMORY, stream.file(), 0), EIO);
    EXPECT_TRUE(is_zeroed(source));
}

TEST(HostSpool, wrong_arguments_are_refused) {
    Source source;
    EXPECT_EQ(PelmHost_OpenSpooled(&source, PELM_SOURCE_MEMORY, nullptr, 0), EINVAL);
    EXPECT_TRUE(is_zeroed(source));
    EXPECT_EQ(PelmHost_OpenSpooled(&source, 5, stdin, 0), EINVAL);
    EXPECT_TRUE(is_zeroed(source));
    EXPECT_EQ(PelmHost_OpenSpooled(nullptr, PELM_SOURCE_MEMORY, stdin, 0), EINVAL);
}

TEST(HostSpool, what_was_read_before_a_failure_is_freed) {
    // Blocks that are taken from the heap, and are too large for the thread's cache of freed blocks.
    const auto fail = [&] {
        Pipe pipe;
        pipe.write_bytes(std::string(5000, 'x'));
        pipe.close_writer();
        FILE *const piped = fdopen(dup(pipe.reader()), "r");
        InputSource source;
        EXPECT_EQ(PelmHost_OpenSpooled(&source, PELM_SOURCE_MEMORY, piped, 4000), EFBIG);
        fclose(piped);
    };
    fail();
    const size_t before = mallinfo2().uordblks;
    for (int32_t i = 0; i < 20; ++i)
        fail();
    EXPECT_LT(mallinfo2().uordblks, before + 10 * 4000);
}

} // namespace
} // namespace pelm::host_test
