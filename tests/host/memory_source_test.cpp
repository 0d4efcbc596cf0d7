// Bytes of the caller as sources: filled by hand, and opened as every kind.
#include <cerrno>
#include <cstring>

#include "tests/host/support.h"

namespace pelm::host_test {
namespace {

InputSource by_hand(std::string &bytes) {
    InputSource source = {};
    source.kind = PELM_SOURCE_MEMORY;
    source.data = reinterpret_cast<uint8_t *>(bytes.data());
    source.size = static_cast<int32_t>(bytes.size());
    return source;
}

TEST(HostMemorySource, filled_by_hand_is_read_and_sought_without_an_opener) {
    std::string bytes = "0123456789";
    InputSource source = by_hand(bytes);
    EXPECT_EQ(read_some(source, 4), "0123");
    EXPECT_EQ(source.consumed, 4);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, -3, 1), -3);
    EXPECT_EQ(source.consumed, 1);
    EXPECT_EQ(read_some(source, 100), "123456789");
    EXPECT_EQ(source.consumed, source.size);
    EXPECT_EQ(read_result(source), 0);
    EXPECT_EQ(PelmHost_ReadError(&source), 0);
    PelmHost_Close(&source);
    EXPECT_TRUE(is_zeroed(source));
    EXPECT_EQ(bytes, "0123456789");
}

TEST(HostMemorySource, without_bytes_or_with_a_negative_size_delivers_nothing) {
    std::string bytes = "0123";
    InputSource negative = by_hand(bytes);
    negative.size = -4;
    EXPECT_EQ(read_result(negative), 0);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&negative, 2, 0), 0);
    InputSource none = by_hand(bytes);
    none.data = nullptr;
    EXPECT_EQ(read_result(none), 0);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&none, 2, 0), 0);
}

TEST(HostMemorySource, a_position_outside_the_bytes_is_put_right) {
    std::string bytes = "0123";
    InputSource source = by_hand(bytes);
    source.hostPosition = -5;
    EXPECT_EQ(read_some(source, 2), "01");
    source.hostPosition = 100;
    EXPECT_EQ(read_result(source), 0);
    EXPECT_EQ(source.consumed, 4);
}

TEST(HostMemorySource, a_stream_source_that_nobody_opened_delivers_nothing) {
    for (const uint32_t kind : {0u, 2u, 4u, 77u}) {
        InputSource source = {};
        source.kind = kind;
        source.size = 10;
        EXPECT_EQ(read_result(source), 0);
        EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 5, 0), 0);
        EXPECT_EQ(source.consumed, 0);
        EXPECT_EQ(PelmHost_ReadError(&source), 0);
    }
}

TEST(HostMemorySource, every_kind_delivers_the_same_bytes) {
    std::string bytes = numbered_bytes(1000);
    for (const uint32_t kind : {0u, 1u, 2u, 4u}) {
        for (const int32_t step : {1, 3, 999, 1000, 1001}) {
            Source source;
            ASSERT_EQ(PelmHost_OpenMemory(&source, kind, writable(bytes), 1000), 0);
            EXPECT_EQ(source.kind, kind);
            EXPECT_EQ(source.size, 1000);
            EXPECT_EQ(source.consumed, 0);
            EXPECT_EQ(source.bufferSize, PELM_HOST_BUFFER_SIZE);
            EXPECT_EQ(source.data, kind == 1 ? writable(bytes) : nullptr);
            EXPECT_EQ(read_all(source, step), bytes);
            EXPECT_EQ(source.consumed, 1000);
            EXPECT_EQ(PelmHost_ReadError(&source), 0);
        }
    }
}

TEST(HostMemorySource, every_kind_seeks_both_ways) {
    std::string bytes = "0123456789";
    for (const uint32_t kind : {0u, 1u, 2u, 4u}) {
        Source source;
        ASSERT_EQ(PelmHost_OpenMemory(&source, kind, writable(bytes), 10), 0);
        EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 7, 0), 7);
        EXPECT_EQ(ZOTARPELM_Seek_IO(&source, -5, 1), -5);
        EXPECT_EQ(read_some(source, 3), "234");
    }
}

TEST(HostMemorySource, an_empty_one_ends_at_once) {
    std::string bytes;
    for (const uint32_t kind : {0u, 1u, 2u, 4u}) {
        Source source;
        ASSERT_EQ(PelmHost_OpenMemory(&source, kind, writable(bytes), 0), 0);
        EXPECT_EQ(read_result(source), 0);
        EXPECT_EQ(source.consumed, source.size);
    }
}

// Decoders add to `consumed` and hang buffers from `data` of stream kinds.
TEST(HostMemorySource, what_decoders_write_to_the_record_moves_nothing) {
    std::string bytes = "0123456789";
    uint8_t staging[1] = {0};
    for (const uint32_t kind : {0u, 1u, 2u, 4u}) {
        Source source;
        ASSERT_EQ(PelmHost_OpenMemory(&source, kind, writable(bytes), 10), 0);
        if (kind != 1) source.data = staging;
        EXPECT_EQ(read_some(source, 2), "01");
        source.consumed += 2;
        EXPECT_EQ(read_some(source, 2), "23");
        EXPECT_EQ(source.consumed, 4);
        source.consumed = 9;
        EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 1, 1), 1);
        EXPECT_EQ(source.consumed, 5);
        if (kind != 1) {
            EXPECT_EQ(source.data, staging);
        }
        EXPECT_EQ(staging[0], 0);
    }
}

TEST(HostMemorySource, reads_that_ask_for_nothing_deliver_0_and_report_the_position) {
    std::string bytes = "0123456789";
    for (const uint32_t kind : {0u, 1u}) {
        Source source;
        ASSERT_EQ(PelmHost_OpenMemory(&source, kind, writable(bytes), 10), 0);
        read_some(source, 3);
        source.consumed = 8;
        char to = '?';
        EXPECT_EQ(ZOTARPELM_Read_IO(&source, nullptr, 4), 0);
        EXPECT_EQ(source.consumed, 3);
        EXPECT_EQ(ZOTARPELM_Read_IO(&source, &to, 0), 0);
        EXPECT_EQ(ZOTARPELM_Read_IO(&source, &to, -1), 0);
        EXPECT_EQ(ZOTARPELM_Read_IO(&source, &to, INT32_MIN), 0);
        EXPECT_EQ(to, '?');
        EXPECT_EQ(read_some(source, 1), "3");
    }
    char to = '?';
    EXPECT_EQ(ZOTARPELM_Read_IO(nullptr, &to, 1), 0);
}

TEST(HostMemorySource, wrong_arguments_are_refused_with_a_zeroed_record) {
    char byte = 'a';
    EXPECT_EQ(PelmHost_OpenMemory(nullptr, 0, &byte, 1), EINVAL);
    for (const uint32_t kind : {3u, 5u, 0xFFFFFFFFu}) {
        Source source;
        EXPECT_EQ(PelmHost_OpenMemory(&source, kind, &byte, 1), EINVAL);
        EXPECT_TRUE(is_zeroed(source));
    }
    Source source;
    EXPECT_EQ(PelmHost_OpenMemory(&source, 0, nullptr, 1), EINVAL);
    EXPECT_TRUE(is_zeroed(source));
    EXPECT_EQ(PelmHost_OpenMemory(&source, 1, &byte, -1), EINVAL);
    EXPECT_TRUE(is_zeroed(source));
}

TEST(HostClose, accepts_null_zeroed_and_closed_records) {
    PelmHost_Close(nullptr);
    InputSource source = {};
    PelmHost_Close(&source);
    char byte = 'a';
    ASSERT_EQ(PelmHost_OpenMemory(&source, 2, &byte, 1), 0);
    PelmHost_Close(&source);
    EXPECT_TRUE(is_zeroed(source));
    PelmHost_Close(&source);
    EXPECT_EQ(PelmHost_ReadError(&source), 0);
    EXPECT_EQ(PelmHost_ReadError(nullptr), 0);
}

} // namespace
} // namespace pelm::host_test
