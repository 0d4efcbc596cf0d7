// Header and blocks in front of the image: what is accepted, what is skipped, what is refused.
#include "tests/gif/support/gif_check.h"

namespace pelm::test {
namespace {

constexpr uint16_t side = 4;
const ColourTable table = distinct_table(4);
const Bytes pixels = noise_pixels(side * side, 4, 3);

GifFile begun(const std::string &signature = "GIF89a") {
    return GifFile().screen(side, side, table, 0, signature);
}

Bytes finished(GifFile file) {
    return file.image({0, 0, side, side}, pixels, 2).trailer().bytes;
}

class GifHeader : public GifTest {
protected:
    static GifOutcome decoded(const Bytes &file) { return checked_decode(file, own_size(side, side, 1)); }
    static void expect_picture(const Bytes &file) {
        const GifOutcome outcome = decoded(file);
        EXPECT_EQ(outcome.result, 1);
        EXPECT_EQ(outcome.output, rgb_of(pixels, table));
    }
    static void expect_refused(const Bytes &file) {
        for (const GifCall call : {GifCall::one_shot, GifCall::iterative, GifCall::line}) {
            SideBySide both(file, own_size(side, side));
            EXPECT_EQ(both.call(call, side), "");
            EXPECT_EQ(both.result(), 0) << name_of(call);
        }
    }
};

TEST_F(GifHeader, any_two_digits_and_a_letter_are_a_version) {
    for (const char *const signature : {"GIF87a", "GIF89a", "GIF12Q", "GIF99Z", "GIF00A", "GIF55z", "GIF89[", "GIF89`"})
        expect_picture(finished(begun(signature)));
}

TEST_F(GifHeader, other_signatures_are_refused) {
    for (const char *const signature : {"GIFx9a", "GIF8xa", "GIF890", "GIF89@", "GIF89{", "gif89a", "GIG89a", "GJF89a",
                                        "HIF89a", "GIF/9a", "GIF:9a", "GIF8:a"})
        expect_refused(finished(begun(signature)));
}

TEST_F(GifHeader, a_screen_with_a_zero_side_is_refused) {
    for (const uint16_t width : {uint16_t{0}, side})
        for (const uint16_t height : {uint16_t{0}, side}) {
            if (width != 0 && height != 0) continue;
            GifFile file;
            file.screen(width, height, table);
            expect_refused(finished(file));
        }
}

TEST_F(GifHeader, tables_of_every_size_are_read_whole) {
    for (size_t entries = 2; entries <= 256; entries *= 2) {
        const ColourTable all = distinct_table(entries, 5);
        Bytes indices;
        for (size_t i = 0; i < 256; ++i)
            indices.push_back(static_cast<uint8_t>(i % entries));
        GifFile global, local;
        const ImagePlace place{0, 0, 16, 16};
        global.screen(16, 16, all).image(place, indices, 8).trailer();
        local.screen(16, 16, {}).image(place, indices, 8, all).trailer();
        EXPECT_EQ(checked_decode(global.bytes, own_size(16, 16, 1)).output, rgb_of(indices, all));
        EXPECT_EQ(checked_decode(local.bytes, own_size(16, 16, 1)).output, rgb_of(indices, all));
    }
}

TEST_F(GifHeader, indices_without_an_entry_are_black) {
    GifFile file;
    file.screen(2, 1, distinct_table(2)).image({0, 0, 2, 1}, {1, 7}, 3).trailer();
    const GifOutcome outcome = checked_decode(file.bytes, own_size(2, 1, 1));
    EXPECT_EQ(Bytes(outcome.output.begin() + 3, outcome.output.end()), Bytes(3, 0));
}

TEST_F(GifHeader, an_image_without_any_table_is_black) {
    GifFile file;
    file.screen(side, side, {}).image({0, 0, side, side}, pixels, 2).trailer();
    EXPECT_EQ(decoded(file.bytes).output, Bytes(side * side * 3, 0));
}

TEST_F(GifHeader, a_local_table_takes_the_place_of_the_global_one) {
    const ColourTable local = distinct_table(4, 77);
    GifFile file = begun();
    file.image({0, 0, side, side}, pixels, 2, local).trailer();
    EXPECT_EQ(decoded(file.bytes).output, rgb_of(pixels, local));
}

TEST_F(GifHeader, raw_tables_go_where_the_request_says) {
    const ColourTable local = distinct_table(2, 50);
    GifFile file = begun();
    file.image({0, 0, side, side}, noise_pixels(side * side, 2, 1), 2, local).trailer();
    GifSetting setting;
    setting.has_raw_table = true;
    const GifOutcome outcome = checked_decode(file.bytes, own_size(side, side), GifCall::one_shot, setting);
    Bytes expected(1024, 0x20);
    std::copy(table.begin(), table.end(), expected.begin());
    std::copy(local.begin(), local.end(), expected.begin());
    EXPECT_EQ(*outcome.words.global_table, expected);
    for (const GifCall call : {GifCall::iterative, GifCall::line})
        EXPECT_EQ(gif_difference(file.bytes, own_size(side, side), call, setting, side), "");
}

TEST_F(GifHeader, stray_bytes_between_blocks_are_skipped) {
    Bytes stray;
    for (int byte = 0; byte < 256; ++byte)
        if (byte != 0x21 && byte != 0x2C && byte != 0x3B) stray.push_back(static_cast<uint8_t>(byte));
    expect_picture(finished(begun().raw(stray).raw(stray)));
}

TEST_F(GifHeader, text_comment_and_application_blocks_are_skipped_whole) {
    const Bytes tempting = {0x2C, 0x3B, 0x21, 0xF9, 4, 1, 0, 0, 0, 0};
    for (const uint8_t label : std::initializer_list<uint8_t>{0x01, 0xFE, 0xFF})
        for (const std::vector<Bytes> &blocks :
             {std::vector<Bytes>{}, {tempting}, {Bytes(255, 0x2C), tempting, Bytes(1, 0x3B)}}) {
            const GifOutcome outcome = decoded(finished(begun().extension(label, blocks)));
            EXPECT_EQ(outcome.output, rgb_of(pixels, table));
            EXPECT_EQ(outcome.words.has_transparency, 0u);
        }
}

TEST_F(GifHeader, an_unknown_extension_is_scanned_as_stray_bytes) {
    expect_picture(finished(begun().extension(0x55, {{1, 2, 3}})));
    // The trailer in its body is met.
    SideBySide both(finished(begun().extension(0x55, {{1, 0x3B, 3}})), own_size(side, side));
    EXPECT_EQ(both.call(GifCall::one_shot), "");
    EXPECT_EQ(both.expected(), Bytes(side * side * 4, gif_background));
    // A graphic control in its body is read.
    const Bytes control = {9, 0x21, 0xF9, 4, 1, 0, 0, 2, 0, 5};
    EXPECT_EQ(decoded(finished(begun().raw({0x21, 0x55}).raw(control))).words.has_transparency, 1u);
}

TEST_F(GifHeader, a_graphic_control_of_another_size_or_without_terminator_is_refused) {
    expect_refused(finished(begun().raw({0x21, 0xF9, 3, 0, 0, 0, 0})));
    expect_refused(finished(begun().raw({0x21, 0xF9, 5, 0, 0, 0, 0, 0, 0})));
    expect_refused(finished(begun().raw({0x21, 0xF9, 4, 0, 0, 0, 0, 1})));
    expect_picture(finished(begun().raw({0x21, 0xF9, 4, 0, 0, 0, 0, 0})));
}

TEST_F(GifHeader, transparency_is_told_and_not_applied) {
    GifRequest request = own_size(side, side, 7);
    const Bytes opaque = checked_decode(finished(begun()), request).output;
    const GifOutcome outcome = checked_decode(finished(begun().control({0, 1, 7})), request);
    EXPECT_EQ(outcome.output, opaque);
    EXPECT_EQ(outcome.words.has_transparency, 1u);
    EXPECT_EQ(checked_decode(finished(begun().control({3, -1, 7})), request).words.has_transparency, 0u);
    // The last one counts.
    EXPECT_EQ(decoded(finished(begun().control({0, 1}).control({0, -1}))).words.has_transparency, 0u);
}

TEST_F(GifHeader, line_calls_leave_the_transparency_word_alone) {
    SideBySide both(finished(begun().control({0, 1})), own_size(side, side));
    EXPECT_EQ(both.call(GifCall::line, side), "");
    EXPECT_EQ(both.info().hasTransparency, 0xE0E0E0E0u);
}

TEST_F(GifHeader, a_trailer_before_any_image_leaves_the_output_alone_and_fails) {
    SideBySide both(begun().trailer().bytes, own_size(side, side));
    EXPECT_EQ(both.call(GifCall::one_shot), "");
    EXPECT_EQ(both.result(), 0);
    EXPECT_EQ(both.expected(), Bytes(side * side * 4, gif_background));
    EXPECT_EQ(host.live_blocks().size(), 0u);
}

TEST_F(GifHeader, a_trailer_before_any_image_ends_every_call_as_empty_data_would) {
    for (const Bytes &behind : {Bytes{}, Bytes{0}, Bytes{1, 0}, Bytes{1, 1, 0}, Bytes{1, 0, 0, 0}, Bytes(9, 3)})
        for (const GifCall call :
             {GifCall::one_shot, GifCall::iterative, GifCall::line, GifCall::frame, GifCall::frame_iterative})
            EXPECT_EQ(gif_difference(begun().trailer().raw(behind).bytes, own_size(side, side), call, {}, side), "");
}

TEST_F(GifHeader, a_code_size_above_twelve_is_refused_and_twelve_fails) {
    for (const uint8_t size : std::initializer_list<uint8_t>{13, 14, 100, 255})
        expect_refused(begun().descriptor({0, 0, side, side}).raw({size, 1, 0, 0, 0x3B}).bytes);
    const Bytes twelve = begun().descriptor({0, 0, side, side}).data(12, Bytes(40, 1)).trailer().bytes;
    const GifOutcome outcome = decoded(twelve);
    EXPECT_EQ(outcome.result, 0);
    EXPECT_EQ(host.live_blocks().size(), 0u);
    for (const GifCall call : {GifCall::iterative, GifCall::line})
        EXPECT_EQ(gif_difference(twelve, own_size(side, side), call, {}, side), "");
}

TEST_F(GifHeader, missing_requests_inputs_and_kinds_fail_without_allocating_for_good) {
    EXPECT_EQ(ZOTARPELMI_DecodeGIF(nullptr, nullptr, 1, 1), 0);
    EXPECT_EQ(ZOTARPELMI_DecodeGIFIter(nullptr, nullptr, 1, 1), 0);
    EXPECT_EQ(ZOTARPELMI_DecodeGIFLine(nullptr, nullptr, 1, 1, 1), 0);
    for (const uint32_t kind : {0u, 3u, 5u, 6u, 255u, 0x101u, 0xFFFFFFFFu}) {
        TestSource source(kind, finished(begun()));
        ImageDecodeInfo info{};
        info.input = kind == 0 ? nullptr : &source.source;
        uint8_t output[side * side * 4];
        EXPECT_EQ(ZOTARPELMI_DecodeGIF(&info, output, side, side), 0) << kind;
        EXPECT_EQ(ZOTARPELMI_DecodeGIFIter(&info, output, side, side), 0) << kind;
        EXPECT_EQ(ZOTARPELMI_DecodeGIFLine(&info, output, side, side, 1), 0) << kind;
        EXPECT_EQ(info.decoderState, nullptr);
        EXPECT_EQ(host.live_blocks().size(), 0u);
    }
}

TEST_F(GifHeader, a_one_shot_decode_does_not_look_at_a_state) {
    TestSource source(PELM_SOURCE_MEMORY, finished(begun()));
    ImageDecodeInfo info{};
    info.input = &source.source;
    info.outputFormat = 1;
    Bytes output(side * side * 3);
    EXPECT_EQ(ZOTARPELMI_DecodeGIFIter(&info, output.data(), side, side), 4);
    void *const state = info.decoderState;
    EXPECT_EQ(ZOTARPELMI_DecodeGIF(&info, output.data(), side, side), 1);
    EXPECT_EQ(output, rgb_of(pixels, table));
    info.decoderState = state;
    EXPECT_EQ(ZOTARPELMI_AbortGIFIter(&info), 1);
    EXPECT_TRUE(host.violations.empty());
    EXPECT_EQ(host.live_blocks().size(), 0u);
}

} // namespace
} // namespace pelm::test
