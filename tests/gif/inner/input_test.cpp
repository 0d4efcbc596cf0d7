// The buffered reader, the header and the walk from block to block: what they keep in the record.
#include "tests/gif/inner/decoding_record.h"

namespace pelm::test {
namespace {

class GifReader : public GifTest {
protected:
    void expect_position(int32_t left, ptrdiff_t at) const {
        EXPECT_EQ(bytes_left, left);
        EXPECT_EQ(cursor - buffer.data(), at);
    }
    int32_t check(int32_t need, InputSource &source) {
        return PELMI_CheckBuffer(need, &source, buffer.data(), &bytes_left, &cursor);
    }
    Bytes buffer = Bytes(16384, 0);
    int32_t bytes_left = 0;
    uint8_t *cursor = buffer.data();
};

TEST_F(GifReader, reads_nothing_when_there_is_enough) {
    TestSource source(PELM_SOURCE_STREAM, Bytes(100, 1));
    bytes_left = 5;
    cursor = buffer.data() + 9;
    EXPECT_EQ(check(5, source.source), 1);
    EXPECT_EQ(check(0, source.source), 1);
    EXPECT_TRUE(host.reads.empty());
    expect_position(5, 9);
}

TEST_F(GifReader, an_empty_buffer_is_filled_whole) {
    TestSource source(PELM_SOURCE_STREAM, Bytes(20000, 1));
    EXPECT_EQ(check(1, source.source), 1);
    EXPECT_EQ(host.reads, (std::vector<ReadCall>{{0, 16384, 16384}}));
    expect_position(16384, 0);
}

TEST_F(GifReader, what_is_left_moves_to_the_start_and_the_rest_is_filled) {
    Bytes file(300);
    for (size_t i = 0; i < file.size(); ++i)
        file[i] = static_cast<uint8_t>(i);
    TestSource source(PELM_SOURCE_STREAM, file);
    for (uint8_t i = 0; i < 3; ++i)
        buffer[16381u + i] = static_cast<uint8_t>(201 + i);
    bytes_left = 3;
    cursor = buffer.data() + 16381;
    EXPECT_EQ(check(4, source.source), 1);
    EXPECT_EQ(host.reads, (std::vector<ReadCall>{{0, 16381, 300}}));
    expect_position(303, 0);
    EXPECT_EQ(Bytes(buffer.begin(), buffer.begin() + 5), (Bytes{201, 202, 203, 0, 1}));
}

TEST_F(GifReader, too_little_leaves_the_position_as_it_was) {
    TestSource source(PELM_SOURCE_STREAM, Bytes(10, 1));
    bytes_left = 2;
    cursor = buffer.data() + 40;
    EXPECT_EQ(check(13, source.source), 0);
    expect_position(2, 40);
}

TEST_F(GifReader, more_than_the_buffer_holds_is_never_there) {
    TestSource source(PELM_SOURCE_STREAM, Bytes(40000, 1));
    EXPECT_EQ(check(16384, source.source), 1);
    EXPECT_EQ(check(16385, source.source), 0);
    EXPECT_EQ(check(INT32_MAX, source.source), 0);
    expect_position(16384, 0);
}

TEST_F(GifReader, failed_reads_count_as_nothing_and_boasting_ones_as_what_was_asked_for) {
    TestSource source(PELM_SOURCE_STREAM, Bytes(40000, 1));
    for (const int32_t result : {0, -1, -20000, INT32_MIN}) {
        host.faults.failing_reads_from = 1;
        host.faults.failing_read_result = result;
        EXPECT_EQ(check(1, source.source), 0);
        expect_position(0, 0);
    }
    host.faults.failing_reads_from = 0;
    host.faults.overclaiming_reads_from = 1;
    EXPECT_EQ(check(1, source.source), 1);
    expect_position(16384, 0);
}

class GifHeaderFields : public GifTest {};

TEST_F(GifHeaderFields, the_screen_is_kept) {
    GifFile file;
    file.screen(0x1234, 0x0102, {1, 2, 3, 4, 5, 6}, 200);
    file.bytes[10] = 0x80 | 5 << 4;
    file.bytes[12] = 77;
    DecodingRecord record(file.trailer().bytes, {7, 0, 0, 9, 9});
    ASSERT_NE(record.state, nullptr);
    EXPECT_EQ(record.state->screenWidth, 0x1234);
    EXPECT_EQ(record.state->screenHeight, 0x0102);
    EXPECT_EQ(record.state->colorResolution, 5u);
    EXPECT_EQ(record.state->backgroundIndex, 200u);
    EXPECT_EQ(record.state->aspectRatio, 77u);
    EXPECT_EQ(record.state->globalTable[0], 1u << 20 | 2u << 10 | 3u);
    EXPECT_EQ(record.state->globalTable[1], 4u << 20 | 5u << 10 | 6u);
    EXPECT_EQ(record.state->globalTable[2], 0u);
    EXPECT_EQ(record.state->activeTable, record.state->globalTable);
    EXPECT_EQ(record.state->transparentIndex, -1);
    EXPECT_EQ(record.seek(), 3) << "nothing but a trailer";
}

TEST_F(GifHeaderFields, a_graphic_control_is_kept_for_all_images_that_have_none) {
    GifFile file;
    file.screen(4, 4, distinct_table(4)).control({5, -1, 7});
    file.bytes[file.bytes.size() - 2] = 3; // an index that nothing makes transparent
    file.image({1, 2, 3, 4, true}, Bytes(12, 1), 2, distinct_table(2, 8));
    file.control({3, 9, 0xFFFF, 0xE2}).image({0, 0, 1, 1}, {1}, 3);
    file.image({0, 0, 1, 1}, {1}, 3);
    file.control({}).image({0, 0, 1, 1}, {1}, 3);
    DecodingRecord record(file.trailer().bytes, own_size(4, 4));
    ASSERT_NE(record.state, nullptr);
    GifDecoderState &state = *record.state;
    state.sourceRow = 99;
    ASSERT_EQ(record.seek(), 1);
    EXPECT_EQ(state.disposal, 5u);
    EXPECT_EQ(state.hasTransparency, 0u);
    EXPECT_EQ(state.transparentIndex, -1);
    EXPECT_EQ(state.delayMs, 70u);
    EXPECT_EQ(state.imageLeft, 1);
    EXPECT_EQ(state.imageTop, 2);
    EXPECT_EQ(state.imageWidth, 3);
    EXPECT_EQ(state.imageHeight, 4);
    EXPECT_EQ(state.interlaced, 1u);
    EXPECT_EQ(state.activeTable, state.localTable);
    EXPECT_EQ(state.lzwMinCodeSize, 2u);
    EXPECT_EQ(state.sourceRow, 0);
    ASSERT_EQ(record.seek(), 1);
    EXPECT_EQ(state.disposal, 3u) << "the bits round it mean something else";
    EXPECT_EQ(state.hasTransparency, 1u);
    EXPECT_EQ(state.transparentIndex, 9);
    EXPECT_EQ(state.delayMs, 655350u);
    EXPECT_EQ(state.interlaced, 0u);
    EXPECT_EQ(state.activeTable, state.globalTable);
    // What is left of the image's data is walked over.
    ASSERT_EQ(record.seek(), 1);
    EXPECT_EQ(state.transparentIndex, 9);
    ASSERT_EQ(record.seek(), 1);
    EXPECT_EQ(state.transparentIndex, -1) << "a control without one takes the last one's place";
    EXPECT_EQ(record.seek(), 3);
}

} // namespace
} // namespace pelm::test
