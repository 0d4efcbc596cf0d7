// Stdio streams as sequential sources.
#include <cerrno>

#include "tests/host/scripted_stream.h"
#include "tests/host/support.h"

namespace pelm::host_test {
namespace {

TEST(HostStream, delivers_what_is_left_of_it_and_stays_open) {
    char bytes[] = "0123456789";
    FILE *const stream = fmemopen(bytes, 10, "r");
    ASSERT_EQ(fgetc(stream), '0');
    Source source;
    ASSERT_EQ(PelmHost_OpenStream(&source, stream, 50), 0);
    EXPECT_EQ(source.kind, uint32_t{PELM_SOURCE_SEQUENTIAL});
    EXPECT_EQ(source.size, unknown_size);
    EXPECT_EQ(source.bufferSize, 50);
    EXPECT_EQ(source.data, nullptr);
    EXPECT_EQ(read_some(source, 4), "1234");
    EXPECT_EQ(source.consumed, 4);
    PelmHost_Close(&source);
    EXPECT_EQ(fgetc(stream), '5');
    EXPECT_EQ(fclose(stream), 0);
}

TEST(HostStream, dribbles_add_up_to_full_reads) {
    const std::string bytes = numbered_bytes(200);
    for (const int32_t step : {1, 9, 200, 201}) {
        Pipe pipe;
        FILE *const stream = fdopen(dup(pipe.reader()), "r");
        Source source;
        ASSERT_EQ(PelmHost_OpenStream(&source, stream, 0), 0);
        {
            const DribblingWriter writer(pipe, bytes);
            EXPECT_EQ(read_some(source, step).size(), static_cast<size_t>(std::min(step, 200)));
            EXPECT_EQ(static_cast<size_t>(source.consumed) + read_all(source, step).size(), bytes.size());
        }
        EXPECT_EQ(source.size, 200);
        fclose(stream);
    }
}

TEST(HostStream, moves_forward_by_reading_and_never_back) {
    char bytes[] = "0123456789";
    FILE *const stream = fmemopen(bytes, 10, "r");
    Source source;
    ASSERT_EQ(PelmHost_OpenStream(&source, stream, 0), 0);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 6, 0), 6);
    EXPECT_EQ(read_some(source, 1), "6");
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, -2, 1), 0);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 0, 0), 0);
    EXPECT_EQ(read_some(source, 1), "7");
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 100, 1), 2);
    EXPECT_EQ(source.size, 10);
    EXPECT_EQ(source.consumed, 10);
    fclose(stream);
}

TEST(HostStream, bytes_before_a_failure_are_delivered_first) {
    const ScriptedStream stream({{"abc"}, {"", EIO}, {"def"}});
    Source source;
    ASSERT_EQ(PelmHost_OpenStream(&source, stream.file(), 0), 0);
    EXPECT_EQ(read_some(source, 100), "abc");
    EXPECT_EQ(PelmHost_ReadError(&source), EIO);
    EXPECT_EQ(read_result(source), -1);
    EXPECT_EQ(PelmHost_ReadError(&source), EIO);
    EXPECT_EQ(source.consumed, 3);
    EXPECT_EQ(source.size, unknown_size);
    EXPECT_EQ(read_some(source, 3), "def") << "a failure is reported once, then the stream is asked again";
    EXPECT_EQ(PelmHost_ReadError(&source), 0);
}

TEST(HostStream, a_failure_without_a_reason_is_an_input_error) {
    const ScriptedStream stream({{"", no_reason}});
    Source source;
    ASSERT_EQ(PelmHost_OpenStream(&source, stream.file(), 0), 0);
    EXPECT_EQ(read_result(source), -1);
    EXPECT_EQ(PelmHost_ReadError(&source), EIO);
}

TEST(HostStream, a_seek_stops_before_a_failure_and_leaves_it_to_the_next_read) {
    const ScriptedStream stream({{"abc"}, {"", EIO}});
    Source source;
    ASSERT_EQ(PelmHost_OpenStream(&source, stream.file(), 0), 0);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 10, 0), 3);
    EXPECT_EQ(source.consumed, 3);
    EXPECT_EQ(read_result(source), -1);
    EXPECT_EQ(PelmHost_ReadError(&source), EIO);
}

TEST(HostStream, interruptions_and_waits_are_not_failures) {
    const ScriptedStream stream({{"", EINTR}, {"abc"}, {"", EINTR}, {"", EAGAIN}, {"def"}, {"", EINTR}});
    Source source;
    ASSERT_EQ(PelmHost_OpenStream(&source, stream.file(), 0), 0);
    EXPECT_EQ(read_some(source, 6), "abcdef");
    EXPECT_EQ(read_result(source), 0);
    EXPECT_EQ(source.size, 6);
    EXPECT_EQ(PelmHost_ReadError(&source), 0);
}

TEST(HostStream, its_end_is_final) {
    const ScriptedStream stream({{"abc"}, {}, {"later"}});
    Source source;
    ASSERT_EQ(PelmHost_OpenStream(&source, stream.file(), 0), 0);
    EXPECT_EQ(read_some(source, 10), "abc");
    EXPECT_EQ(source.size, 3);
    for (int i = 0; i < 3; ++i)
        EXPECT_EQ(read_result(source), 0);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 5, 1), 0);
}

TEST(HostStream, a_failure_of_an_earlier_reader_is_not_its_own) {
    const ScriptedStream stream({{"", EIO}, {"abc"}});
    EXPECT_EQ(fgetc(stream.file()), EOF);
    ASSERT_TRUE(ferror(stream.file()));
    Source source;
    ASSERT_EQ(PelmHost_OpenStream(&source, stream.file(), 0), 0);
    EXPECT_EQ(read_some(source, 10), "abc");
    EXPECT_EQ(PelmHost_ReadError(&source), 0);
}

TEST(HostStream, null_is_refused) {
    Source source;
    EXPECT_EQ(PelmHost_OpenStream(&source, nullptr, 0), EINVAL);
    EXPECT_TRUE(is_zeroed(source));
    EXPECT_EQ(PelmHost_OpenStream(nullptr, stdin, 0), EINVAL);
}

} // namespace
} // namespace pelm::host_test
