// Where the bytes come from: every kind of source, short reads, failing reads, and files that end anywhere.
#include "tests/gif/support/gif_check.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

constexpr GifCall stills[] = {GifCall::one_shot, GifCall::iterative, GifCall::line};

// Everything that a header can have, and some data.
GifFile rich_file() {
    GifFile file;
    file.screen(13, 11, distinct_table(8)).raw({0, 0, 7}).extension(0xFF, {Bytes(11, 65), {3, 1, 0, 0}});
    file.extension(0x77, {{1, 2, 3}}).control({1, 3, 9}).extension(0xFE, {Bytes(40, 66), Bytes(2, 67)});
    file.descriptor({0, 0, 13, 11}, distinct_table(16, 9));
    return file.data(4, lzw_data(noise_pixels(143, 16, 5), 4), 30).trailer();
}

Bytes large_file() { // several buffers long
    return still_file({300, 200, 8, false, 3}).bytes;
}

class GifSources : public GifTest {};

TEST_F(GifSources, every_kind_gives_the_same_picture) {
    for (const uint32_t kind : gif_source_kinds)
        for (const GifCall call : stills)
            for (const Bytes &file : {rich_file().bytes, large_file()}) {
                GifSetting setting;
                setting.kind = kind;
                const GifRequest request{1, 0, 0, 150, 100};
                EXPECT_EQ(gif_difference(file, request, call, setting, 100), "") << "kind " << kind;
            }
}

TEST_F(GifSources, every_decode_rewinds_once_and_never_seeks_again) {
    for (const uint32_t kind : gif_source_kinds) {
        GifSetting setting;
        setting.kind = kind;
        SideBySide both(large_file(), own_size(300, 200), setting);
        both.source().hostPosition = 77;
        EXPECT_EQ(both.all_calls(GifCall::iterative), "");
        EXPECT_EQ(host.seeks, (std::vector<SeekCall>{{0, 0}}));
    }
}

TEST_F(GifSources, a_buffer_of_16384_bytes_is_filled_whole) {
    SideBySide both(large_file(), own_size(300, 200));
    EXPECT_EQ(both.call(GifCall::one_shot), "");
    ASSERT_FALSE(host.reads.empty());
    EXPECT_EQ(host.reads.front(), (ReadCall{0, 16384, 16384}));
    for (const ReadCall &read : host.reads)
        EXPECT_LE(read.asked, 16384);
}

TEST_F(GifSources, reads_that_come_short_end_the_data_where_one_read_is_not_enough) {
    for (const Bytes &file : {rich_file().bytes, large_file()})
        for (const int32_t most : {1, 2, 5, 12, 13, 14, 23, 24, 25, 47, 48, 49, 100, 255, 256, 257, 767, 768, 4000})
            for (const GifCall call : stills) {
                GifSetting setting;
                setting.most_per_read = most;
                EXPECT_EQ(gif_difference(file, {1, 0, 0, 150, 100}, call, setting, 100), "") << most;
            }
}

TEST_F(GifSources, reads_of_a_sub_block_at_a_time_are_enough) {
    GifSetting setting;
    setting.most_per_read = 800; // a whole colour table
    SideBySide both(large_file(), own_size(300, 200, 1), setting);
    EXPECT_EQ(both.call(GifCall::one_shot), "");
    EXPECT_EQ(both.result(), 1);
    const Still still{300, 200, 8, false, 3};
    EXPECT_EQ(both.expected(), rgb_of(still_pixels(still), distinct_table(256, 3)));
}

TEST_F(GifSources, a_read_that_fails_fails_the_decode_and_frees_what_it_should) {
    const Bytes file = large_file();
    for (const int32_t result : {0, -1, INT32_MIN})
        for (int failing = 1; failing <= 5; ++failing) {
            host.reset();
            host.faults.failing_reads_from = failing;
            host.faults.failing_read_result = result;
            TestSource source(PELM_SOURCE_STREAM, file);
            ImageDecodeInfo info{};
            info.input = &source.source;
            info.outputFormat = 1;
            Bytes output(300 * 200 * 3, gif_background);
            EXPECT_EQ(ZOTARPELMI_DecodeGIF(&info, output.data(), 300, 200), 0) << "read " << failing;
            EXPECT_TRUE(host.live_blocks().empty()) << "read " << failing;
            EXPECT_TRUE(host.violations.empty());
        }
}

TEST_F(GifSources, a_read_that_claims_more_than_was_asked_for_does_no_harm) {
    const Bytes file = large_file();
    for (const GifCall call : stills)
        for (int from = 1; from <= 6; ++from) {
            host.reset();
            host.faults.overclaiming_reads_from = from;
            TestSource source(PELM_SOURCE_STREAM, file);
            ImageDecodeInfo info{};
            info.input = &source.source;
            info.outputFormat = 1;
            Bytes output(300 * 200 * 3);
            int32_t result = 4;
            for (int i = 0; i < 100 && (i == 0 || info.decoderState != nullptr); ++i)
                result = call == GifCall::one_shot    ? ZOTARPELMI_DecodeGIF(&info, output.data(), 300, 200)
                         : call == GifCall::iterative ? ZOTARPELMI_DecodeGIFIter(&info, output.data(), 300, 200)
                                                      : ZOTARPELMI_DecodeGIFLine(&info, output.data(), 300, 200, 50);
            EXPECT_TRUE(result == 0 || result == 1);
            EXPECT_TRUE(host.violations.empty());
            EXPECT_TRUE(host.live_blocks().empty() || host.live_blocks().size() == 11) << "the stated leak";
        }
}

TEST_F(GifSources, a_full_buffer_whose_reads_come_full_is_used_to_its_last_byte) {
    const Bytes file = large_file();
    for (size_t more = 0; more < 300; more += quick() ? 37 : 1) { // moves every block across the buffer's end
        GifFile moved;
        moved.raw({file.begin(), file.begin() + 13 + 768})
            .raw(Bytes(more, 0))
            .raw({file.begin() + 13 + 768, file.end()});
        EXPECT_EQ(gif_difference(moved.bytes, {1, 0, 0, 30, 20}), "") << more;
    }
}

class GifTruncation : public GifTest {
protected:
    static void expect_as_modelled_at_every_byte(const Bytes &file, const GifRequest &request, size_t step) {
        for (size_t size = 0; size < file.size(); size += step)
            for (const GifCall call : stills) {
                GifSetting setting;
                setting.kind = gif_source_kinds[size % 4];
                const Bytes cut(file.begin(), file.begin() + static_cast<ptrdiff_t>(size));
                EXPECT_EQ(gif_difference(cut, request, call, setting, 3), "") << size << " bytes, " << name_of(call);
            }
    }
};

TEST_F(GifTruncation, a_file_with_every_kind_of_block_may_end_anywhere) {
    expect_as_modelled_at_every_byte(rich_file().bytes, own_size(13, 11, 7), 1);
}

TEST_F(GifTruncation, an_interlaced_file_may_end_anywhere) {
    expect_as_modelled_at_every_byte(still_file({9, 14, 3, true}).bytes, own_size(9, 14, 1), 1);
}

TEST_F(GifTruncation, a_reduced_file_may_end_anywhere) {
    expect_as_modelled_at_every_byte(still_file({30, 24, 4}).bytes, {8, 0, 0, 17, 11}, 1);
}

TEST_F(GifTruncation, a_turned_file_of_tiny_sub_blocks_may_end_anywhere) {
    GifFile file;
    file.screen(8, 8, distinct_table(16)).descriptor({0, 0, 8, 8});
    file.data_in(4, lzw_data(noise_pixels(64, 16, 5), 4), {1, 0, 2, 1, 0, 0, 3, 1}).trailer();
    expect_as_modelled_at_every_byte(file.bytes, {0, 1, 0, 9, 10}, 1);
}

TEST_F(GifTruncation, a_long_file_may_end_anywhere) {
    expect_as_modelled_at_every_byte(large_file(), {1, 0, 0, 30, 20}, quick() ? 9973 : 997);
}

TEST_F(GifTruncation, half_of_a_file_decodes_half_of_the_picture_and_clears_the_rest) {
    const Bytes file = still_file({40, 40, 8}).bytes;
    const Bytes whole = checked_decode(file, own_size(40, 40)).output;
    const GifOutcome half = checked_decode({file.begin(), file.begin() + 1600}, own_size(40, 40));
    EXPECT_EQ(half.result, 1);
    const auto differing = std::mismatch(half.output.begin(), half.output.end(), whole.begin()).first;
    const ptrdiff_t rows = (differing - half.output.begin()) / 160;
    EXPECT_GT(rows, 5);
    EXPECT_LT(rows, 35);
    EXPECT_TRUE(std::all_of(half.output.begin() + rows * 160, half.output.end(), [](uint8_t b) { return b == 0; }));
}

} // namespace
} // namespace pelm::test
