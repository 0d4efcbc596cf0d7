#include <gtest/gtest.h>

#include "png/reader.h"
#include "tests/png/inner/inflating.h"
#include "tests/support/test_host.h"

namespace pelm::test {

namespace {

struct Reader {
    explicit Reader(const Bytes &bytes, uint32_t kind = PELM_SOURCE_STREAM) : source(kind, bytes) {
        TestHost::get().reset();
        input.source = &source.source;
        input.sourceSize = static_cast<uint32_t>(bytes.size());
        buffer = {memory.take(PNG_READ_BUFFER_SIZE, Edge::end)};
        input.data = kind == PELM_SOURCE_MEMORY ? source.source.data : buffer;
    }
    // As if `position` bytes had been read and all but the last `left` used up.
    void place(uint32_t position, uint32_t read_pos, uint32_t left) {
        input.sourceEnd = position;
        input.readPos = read_pos;
        input.bytesLeft = left;
        source.source.hostPosition = static_cast<int32_t>(position);
        for (uint32_t i = 0; i < left; ++i)
            input.data[read_pos + i] = source.bytes()[position - left + i];
    }
    std::vector<uint32_t> words() const { return {input.readPos, input.bytesLeft, input.bufferStart, input.sourceEnd}; }

    TestSource source;
    GuardedBuffer memory;
    uint8_t *buffer;
    PngInputBuffer input{};
};

using Words = std::vector<uint32_t>; // read position, bytes left, noted start, end

const Bytes bytes_40000 = noise_bytes(40000, 1);

} // namespace

TEST(Reader, a_fresh_fill_asks_for_a_whole_buffer) {
    Reader reader(bytes_40000);
    EXPECT_EQ(__checkbuffer_util1(&reader.input, 1), 1u);
    EXPECT_EQ(reader.words(), (Words{0, 16384, 0, 16384}));
    reader.input.readPos = 16384;
    reader.input.bytesLeft = 0;
    EXPECT_EQ(__checkbuffer_util1(&reader.input, 4), 1u);
    EXPECT_EQ(reader.words(), (Words{0, 16384, 16384, 32768}));
    EXPECT_EQ(__checkbuffer_util1(&reader.input, 16384), 1u);
    EXPECT_EQ(reader.words(), (Words{0, 40000 - 32768, 32768, 40000}));
    EXPECT_TRUE(std::equal(bytes_40000.begin() + 32768, bytes_40000.end(), reader.input.data));
    EXPECT_EQ(__checkbuffer_util1(&reader.input, 1), 11u);
    for (const ReadCall &read : TestHost::get().reads)
        EXPECT_EQ(read.asked, 16384);
}

TEST(Reader, a_fresh_fill_of_more_than_a_buffer_is_refused_unread) {
    Reader reader(bytes_40000);
    EXPECT_EQ(__checkbuffer_util1(&reader.input, 16385), 11u);
    EXPECT_EQ(__checkbuffer_util1(&reader.input, INT32_MAX), 11u);
    EXPECT_TRUE(TestHost::get().reads.empty());
    EXPECT_EQ(reader.words(), (Words{0, 0, 0, 0}));
    EXPECT_EQ(__checkbuffer_util1(&reader.input, -1), 1u); // the comparison is a signed one
}

TEST(Reader, a_top_up_moves_the_rest_to_the_front_and_asks_for_what_was_used) {
    for (uint32_t left = 1; left <= 3; ++left) {
        Reader reader(bytes_40000);
        reader.place(16384, 16384 - left, left);
        EXPECT_EQ(__checkbuffer_util2(&reader.input, 4), 1u);
        EXPECT_EQ(reader.words(), (Words{0, 16384, 16384, 32768 - left}));
        EXPECT_TRUE(std::equal(reader.input.data, reader.input.data + 16384, bytes_40000.begin() + 16384 - left));
        ASSERT_EQ(TestHost::get().reads.size(), 1u);
        EXPECT_EQ(TestHost::get().reads[0].asked, static_cast<int32_t>(16384 - left));
    }
}

TEST(Reader, a_top_up_near_the_end_takes_what_there_is) {
    Reader reader(bytes_40000);
    reader.place(39998, 16000, 2);
    EXPECT_EQ(__checkbuffer_util2(&reader.input, 4), 1u);
    EXPECT_EQ(reader.words(), (Words{0, 4, 39998, 40000}));
    EXPECT_TRUE(std::equal(reader.input.data, reader.input.data + 4, bytes_40000.end() - 4));
    reader.place(40000, 16000, 2);
    EXPECT_EQ(__checkbuffer_util2(&reader.input, 4), 11u);
}

TEST(Reader, a_top_up_beyond_a_buffer_is_refused_unread) {
    Reader reader(bytes_40000);
    reader.place(16384, 16381, 3);
    EXPECT_EQ(__checkbuffer_util2(&reader.input, 16382), 11u);
    EXPECT_TRUE(TestHost::get().reads.empty());
    EXPECT_EQ(__checkbuffer_util2(&reader.input, 16381), 1u);
}

TEST(Reader, failed_reads_are_an_end) {
    for (const int32_t result : {-1, 0, INT32_MIN}) {
        Reader reader(bytes_40000);
        TestHost::get().faults.failing_reads_from = 1;
        TestHost::get().faults.failing_read_result = result;
        EXPECT_EQ(__checkbuffer_util1(&reader.input, 1), 11u);
        reader.place(16384, 16382, 2);
        EXPECT_EQ(__checkbuffer_util2(&reader.input, 4), 11u);
        PngDecodeState state{};
        PngIdatEntry entry{};
        entry.length = 10;
        state.idatTable = &entry;
        state.idatCount = state.idatIndexed = 1;
        uint32_t index = 0;
        reader.input.bytesLeft = 0;
        EXPECT_EQ(__checkbuffer_util1_multiPELMI_IDAT(&state, &reader.input, &index), 0u);
    }
}

TEST(Reader, reads_that_claim_too_much_count_as_what_was_asked_for) {
    for (const uint32_t left : {0u, 1u, 3u}) {
        Reader reader(bytes_40000);
        TestHost::get().faults.overclaiming_reads_from = 1;
        reader.place(16384, 16384 - left, left);
        EXPECT_EQ(left == 0 ? __checkbuffer_util1(&reader.input, 4) : __checkbuffer_util2(&reader.input, 4), 1u);
        EXPECT_EQ(reader.words(), (Words{0, 16384, 16384, 32768 - left}));
    }
}

TEST(Reader, memory_is_never_refilled) {
    Reader reader(bytes_40000, PELM_SOURCE_MEMORY);
    EXPECT_EQ(__checkbuffer_util1(&reader.input, 1), 11u);
    reader.input.readPos = 39998;
    reader.input.bytesLeft = 2;
    EXPECT_EQ(__checkbuffer_util2(&reader.input, 4), 11u);
    EXPECT_TRUE(TestHost::get().reads.empty());
    EXPECT_TRUE(reader.source.unchanged());
}

TEST(Reader, a_word_is_read_across_refills) {
    for (uint32_t left = 0; left <= 4; ++left) {
        Reader reader(bytes_40000);
        reader.place(16384, 16384 - left, left);
        uint32_t value = 0;
        ASSERT_TRUE(read_u32(reader.input, value));
        EXPECT_EQ(value, __PELMI_PngGetUINT32(bytes_40000.data() + 16384 - left)) << left << " bytes left";
        const uint32_t noted = left == 4 ? 0 : 16384;
        EXPECT_EQ(reader.input.bufferStart, noted) << left << " bytes left";
    }
}

TEST(Reader, words_and_bytes_that_are_not_there_are_not_read) {
    for (uint32_t left = 0; left < 4; ++left) {
        Reader reader(bytes_40000);
        reader.place(40000, 10000, left);
        uint32_t value = 0;
        EXPECT_FALSE(read_u32(reader.input, value)) << left;
    }
    Reader reader(bytes_40000);
    reader.place(40000, 10000, 1);
    uint8_t byte = 0;
    EXPECT_TRUE(read_byte(reader.input, byte));
    EXPECT_EQ(byte, bytes_40000.back());
    EXPECT_FALSE(read_byte(reader.input, byte));
}

TEST(Reader, skipping_moves_the_source_only_by_what_is_not_buffered) {
    Reader reader(bytes_40000);
    reader.place(16384, 16000, 384);
    EXPECT_TRUE(skip_bytes(reader.input, 384));
    EXPECT_EQ(reader.words(), (Words{16384, 0, 0, 16384}));
    EXPECT_TRUE(TestHost::get().seeks.empty());

    reader.place(16384, 16000, 384);
    EXPECT_TRUE(skip_bytes(reader.input, 1000));
    EXPECT_EQ(reader.words(), (Words{0, 0, 0, 17000}));
    ASSERT_EQ(TestHost::get().seeks.size(), 1u);
    EXPECT_TRUE((TestHost::get().seeks[0] == SeekCall{616, 1}));

    EXPECT_TRUE(skip_bytes(reader.input, 23000));
    EXPECT_FALSE(skip_bytes(reader.input, 1));
    EXPECT_FALSE(skip_bytes(reader.input, uint64_t{1} << 32));
}

namespace {

// Three chunks of image data in a row, as a file holds them: 12 bytes between each two.
struct Chain {
    explicit Chain(const std::vector<uint32_t> &lengths) : entries(lengths.size()) {
        for (size_t i = 0; i < lengths.size(); ++i) {
            entries[i].length = lengths[i];
            for (uint32_t k = 0; k < lengths[i]; ++k)
                data.push_back(static_cast<uint8_t>(data.size() * 11 + (data.size() >> 8)));
            file.insert(file.end(), data.end() - static_cast<ptrdiff_t>(lengths[i]), data.end());
            file.insert(file.end(), 12, 0xEE);
        }
        state.idatTable = entries.data();
        state.idatCount = state.idatIndexed = static_cast<uint32_t>(lengths.size());
    }

    std::vector<PngIdatEntry> entries;
    Bytes data, file;
    PngDecodeState state{};
};

} // namespace

TEST(Reader, image_data_comes_chunk_by_chunk_and_buffer_by_buffer) {
    for (const std::vector<uint32_t> &lengths : {std::vector<uint32_t>{5},
                                                 {5, 3},
                                                 {16384, 1},
                                                 {16385, 1, 2},
                                                 {32768, 32769, 7},
                                                 {1, 1, 1, 1},
                                                 {40000, 40000}}) {
        Chain chain(lengths);
        Reader reader(chain.file);
        uint32_t index = 0;
        Bytes got;
        uint32_t end = 0;
        while (__checkbuffer_util1_multiPELMI_IDAT(&chain.state, &reader.input, &index) == 1) {
            ASSERT_EQ(reader.input.readPos, 0u);
            ASSERT_GE(reader.input.bytesLeft, 1u);
            ASSERT_LE(reader.input.bytesLeft, 16384u);
            ASSERT_EQ(reader.input.bufferStart, end); // the twelve bytes between are not counted
            end += reader.input.bytesLeft;
            ASSERT_EQ(reader.input.sourceEnd, end);
            got.insert(got.end(), reader.input.data, reader.input.data + reader.input.bytesLeft);
            reader.input.bytesLeft = 0;
        }
        EXPECT_TRUE(got == chain.data) << got.size() << " bytes of " << chain.data.size();
        EXPECT_EQ(chain.state.idatIndexed, lengths.size());
    }
}

TEST(Reader, stepping_to_the_next_chunk_reads_twelve_bytes_and_counts_them_as_consumed) {
    Chain chain({5, 3});
    Reader reader(chain.file);
    uint32_t index = 0;
    EXPECT_EQ(__checkbuffer_util1_multiPELMI_IDAT(&chain.state, &reader.input, &index), 1u);
    EXPECT_EQ(index, 0u);
    EXPECT_EQ(chain.state.idatCount, 2u);
    EXPECT_EQ(chain.entries[0].length, 0u);
    EXPECT_EQ(reader.words(), (Words{0, 5, 0, 5}));
    reader.input.bytesLeft = 0;
    EXPECT_EQ(__checkbuffer_util1_multiPELMI_IDAT(&chain.state, &reader.input, &index), 1u);
    EXPECT_EQ(index, 1u);
    EXPECT_EQ(chain.state.idatCount, 1u);
    EXPECT_EQ(reader.words(), (Words{0, 3, 5, 8}));
    const std::vector<ReadCall> wanted = {{0, 5, 5}, {5, 12, 12}, {17, 3, 3}};
    EXPECT_TRUE(TestHost::get().reads == wanted);
    // The host has set the word at its last read; only the twelve bytes were added, before that read.
    EXPECT_EQ(reader.source.source.consumed, 20);
    reader.input.bytesLeft = 0;
    EXPECT_EQ(__checkbuffer_util1_multiPELMI_IDAT(&chain.state, &reader.input, &index), 0u);
    EXPECT_EQ(__checkbuffer_util1_multiPELMI_IDAT(&chain.state, &reader.input, &index), 0u);
}

TEST(Reader, a_long_chunk_is_counted_down_by_whole_buffers) {
    Chain chain({40000});
    Reader reader(chain.file);
    uint32_t index = 0;
    for (const uint32_t left : {40000u - 16384, 40000u - 32768, 0u}) {
        reader.input.bytesLeft = 0;
        EXPECT_EQ(__checkbuffer_util1_multiPELMI_IDAT(&chain.state, &reader.input, &index), 1u);
        EXPECT_EQ(chain.entries[0].length, left);
    }
    EXPECT_EQ(reader.words(), (Words{0, 40000 - 32768, 32768, 40000}));
}

TEST(Reader, image_data_may_end_between_and_within_chunks) {
    Chain chain({5, 30});
    for (size_t size = 0; size <= chain.file.size(); ++size) {
        Chain again({5, 30});
        Reader reader({again.file.begin(), again.file.begin() + static_cast<ptrdiff_t>(size)});
        uint32_t index = 0;
        size_t got = 0;
        while (__checkbuffer_util1_multiPELMI_IDAT(&again.state, &reader.input, &index) == 1) {
            got += reader.input.bytesLeft;
            reader.input.bytesLeft = 0;
        }
        const size_t wanted = size <= 17 ? std::min<size_t>(size, 5) : std::min<size_t>(5 + size - 17, 35);
        EXPECT_EQ(got, wanted) << size << " bytes";
    }
}

TEST(Reader, big_endian_words) {
    const uint8_t bytes[] = {0, 0x12, 0x34, 0x56, 0x78, 0xFF, 0xFF, 0xFF, 0xFF};
    EXPECT_EQ(__PELMI_PngGetUINT32(bytes), 0x00123456u);
    EXPECT_EQ(__PELMI_PngGetUINT32(bytes + 1), 0x12345678u);
    EXPECT_EQ(__PELMI_PngGetUINT32(bytes + 5), 0xFFFFFFFFu);
}

} // namespace pelm::test
