// Hosts without memory, sources that fail and images that are too large: what is answered, and that nothing stays
// behind.
#include <algorithm>

#include "png/state.h"
#include "tests/png/decode/blocks.h"
#include "tests/png/support/memory.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

using PngFailures = PngDecoding;

TEST_F(PngFailures, a_decode_allocates_what_is_documented_in_order) {
    if constexpr (sizeof(void *) == 4) {
        EXPECT_EQ(sizeof(PngDecodeState), 976u);
        EXPECT_EQ(sizeof(PngInputBuffer), 28u);
        EXPECT_EQ(sizeof(PngIdatEntry), 12u);
    }
    for (const Layout layout : all_layouts)
        for (const uint32_t kind : all_source_kinds)
            for (const Blocks compressed : {Blocks::stored, Blocks::fixed, Blocks::dynamic})
                for (const int32_t side : {30, 9}) {
                    reset();
                    const Picture picture = with_transparency(noise_picture(layout.colour_type, layout.depth, 21, 14));
                    const Bytes file = file_of_blocks(picture, compressed, 300);
                    const Request request{7, 0, side, side};
                    EXPECT_EQ(flaws(run(file, kind, request, buffer_size(picture, request))), "");
                    const std::vector<Block> blocks = expected_blocks(picture, kind, request, compressed);
                    EXPECT_EQ(host.allocations, sizes_of(blocks)) << picture.described() << ", " << name_of(compressed);
                    uint64_t sum = 0;
                    for (const Block &block : blocks)
                        sum += block.size;
                    EXPECT_EQ(host.peak_bytes, sum);
                }
}

TEST_F(PngFailures, later_calls_allocate_nothing_again) {
    const Picture picture = noise_picture(rgb, 8, 21, 24);
    const Bytes file = file_of_blocks(picture, Blocks::dynamic, 200);
    for (const uint32_t kind : all_source_kinds)
        for (const Call call : {Call::iterative, Call::line})
            for (const int32_t side : {30, 9}) {
                reset();
                const Request request{7, 0, side, side};
                const Outcome outcome = run(file, kind, request, buffer_size(picture, request), call, 2);
                EXPECT_EQ(flaws(outcome), "");
                EXPECT_GT(outcome.results.size(), 3u);
                EXPECT_EQ(host.allocations, sizes_of(expected_blocks(picture, kind, request, Blocks::dynamic)));
            }
}

TEST_F(PngFailures, every_failing_allocation_is_answered_and_leaves_nothing) {
    for (const Layout layout : all_layouts)
        for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM})
            for (const Call call : {Call::one_shot, Call::iterative, Call::line})
                for (const int32_t side : {30, 9})
                    for (const bool from_then_on : {false, true}) {
                        const Picture picture = noise_picture(layout.colour_type, layout.depth, 21, 14);
                        const Request request{7, 0, side, side};
                        const size_t size = buffer_size(picture, request);
                        const Bytes file = file_of_blocks(picture, Blocks::dynamic, 5000);
                        const std::vector<Block> blocks = expected_blocks(picture, kind, request, Blocks::dynamic);
                        Bytes whole = background(size);
                        draw(picture, request, whole);
                        for (size_t n = 1; n <= blocks.size(); ++n) {
                            reset();
                            (from_then_on ? host.faults.failing_allocations_from : host.faults.failing_allocation) =
                                static_cast<int>(n);
                            const Outcome outcome = run(file, kind, request, size, call, 0);
                            const std::string name = blocks[n - 1].name;
                            const bool accumulator = name.find("accumulator") != std::string::npos && !from_then_on;
                            const bool needed = side == 9 && !picture.is_plain_grey();
                            const std::string what = picture.described() + ", " + name_of(call) + " without " + name +
                                                     ", side " + std::to_string(side) +
                                                     (from_then_on ? " and all after it" : "");
                            EXPECT_EQ(flaws(outcome, accumulator ? 1 : 0), "") << what;
                            EXPECT_EQ(outcome.output, accumulator && !needed ? whole : background(size)) << what;
                        }
                    }
}

TEST_F(PngFailures, an_index_that_cannot_grow_fails) {
    Png png = png_of(noise_picture(rgb, 8, 40, 30));
    png.level = 0;
    png.idat_size = 1;
    const Bytes file = build(png);
    EXPECT_EQ(flaws(run(file, PELM_SOURCE_MEMORY, {7, 0, 40, 30}, 4800)), "");
    const size_t allocations = host.allocations.size();
    for (size_t n = 1; n <= allocations; ++n) {
        reset();
        host.faults.failing_allocation = static_cast<int>(n);
        const Outcome outcome = run(file, PELM_SOURCE_MEMORY, {7, 0, 40, 30}, 4800);
        const bool accumulator = n == 6 || n == 7; // behind state, reader, index, and two blocks of its growth
        EXPECT_EQ(flaws(outcome, accumulator ? 1 : 0), "") << n;
    }
}

TEST_F(PngFailures, every_failing_read_fails_the_decode) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{indexed, 8}})
        for (const uint32_t kind : {PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT, PELM_SOURCE_SEQUENTIAL})
            for (const Blocks compressed : {Blocks::stored, Blocks::dynamic})
                for (const size_t split : {0u, 300u}) {
                    const Picture picture = with_transparency(noise_picture(layout.colour_type, layout.depth, 21, 24));
                    Png png = png_of(picture);
                    png.stream = stream_of_blocks(scanlines_of(png), compressed, 400, 10);
                    png.idat_size = split;
                    const Bytes file = build(png);
                    const Request request = own_size(picture);
                    const size_t size = buffer_size(picture, request);
                    reset();
                    EXPECT_EQ(flaws(run(file, kind, request, size)), "");
                    const int reads = static_cast<int>(host.reads.size());
                    for (int n = 1; n <= reads; ++n)
                        for (const int32_t result : {0, -1})
                            for (const bool from_then_on : {false, true})
                                for (const Call call : {Call::one_shot, Call::line}) {
                                    reset();
                                    (from_then_on ? host.faults.failing_reads_from : host.faults.failing_read) = n;
                                    host.faults.failing_read_result = result;
                                    const Outcome outcome = run(file, kind, request, size, call, 4);
                                    // What nobody looks at may be missing: the first attempt to fill an empty
                                    // buffer, and the 12 bytes between two chunks of image data.
                                    const bool may_succeed = split != 0 || (n == 1 && !from_then_on);
                                    const bool succeeds = may_succeed && outcome.result == 1;
                                    EXPECT_EQ(flaws(outcome, succeeds ? 1 : 0), "")
                                        << "read " << n << " of " << reads << " gives " << result;
                                }
                }
}

TEST_F(PngFailures, short_and_false_reads_leave_nothing) {
    const Picture picture = with_transparency(noise_picture(indexed, 8, 100, 200));
    for (const size_t split : {0u, 700u})
        for (const int32_t most : {1, 2, 3, 5, 11, 1000})
            for (int from = 1; from < 12; from += quick() ? 3 : 1)
                for (const bool overclaims : {false, true})
                    for (const Call call : {Call::one_shot, Call::iterative}) {
                        reset();
                        Png png = png_of(picture);
                        png.idat_size = split;
                        host.faults.short_reads_from = from;
                        host.faults.most_per_read = most;
                        if (overclaims) host.faults.overclaiming_reads_from = from;
                        const Outcome outcome = run(build(png), PELM_SOURCE_STREAM, {1, 0, 60, 60}, 10800, call);
                        EXPECT_TRUE(outcome.result == 0 || outcome.result == 1) << outcome.result;
                        EXPECT_EQ(flaws(outcome, outcome.result), "");
                    }
}

TEST_F(PngFailures, one_byte_reads_of_a_single_chunk_of_image_data_are_enough_once_the_file_is_parsed) {
    const Picture picture = noise_picture(rgb, 8, 21, 24);
    const Bytes file = file_of(picture);
    const Request request = own_size(picture);
    EXPECT_EQ(flaws(run(file, PELM_SOURCE_STREAM, request, buffer_size(picture, request))), "");
    const int last = static_cast<int>(host.reads.size());
    for (const int32_t most : {1, 2, 3, 7}) {
        reset();
        host.faults.short_reads_from = last;
        host.faults.most_per_read = most;
        const Outcome outcome = run(file, PELM_SOURCE_STREAM, request, buffer_size(picture, request));
        EXPECT_EQ(flaws(outcome), "") << most;
        EXPECT_EQ(outcome.output, after_rows(picture, 24)) << most;
    }
}

TEST_F(PngFailures, huge_images_in_little_memory_are_answered) {
    constexpr uint32_t huge[] = {0xFFFFFFFF, 0xFFFFFFFE, 0x80000000, 0x7FFFFFFF, 0x40000000, 0x20000000, 0x1FFFFFFF};
    constexpr uint32_t small_sides[] = {1, 7, 100};
    const auto check = [&](Picture picture, const Request &request, uint32_t kind) {
        reset();
        host.faults.largest_block = 1u << 20;
        Png png{.width = picture.width,
                .height = picture.height,
                .colour_type = picture.colour_type,
                .depth = picture.depth};
        if (picture.colour_type == indexed) png.plte = Bytes(768);
        png.stream = zlib_stored(Bytes(2000));
        const Geometry geometry = geometry_of(picture, request);
        const uint64_t row = (uint64_t{picture.width} * picture.depth * picture.channels() + 7) / 8 + 1;
        const int32_t wanted = geometry.empty() || row_buffer_bytes(row, picture.width) <= 1u << 20 ? 1 : 0;
        const Outcome outcome = run(build(png), kind, request, 100 * 100 * 4);
        EXPECT_EQ(flaws(outcome, wanted), "") << picture.described() << ", " << request.described();
    };
    for (const Layout layout : all_layouts)
        for (const uint32_t side : huge)
            for (const uint32_t other : small_sides)
                for (const uint32_t placement : {0x000u, 0x100u, 0x700u})
                    for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM}) {
                        const auto picture = [&](uint32_t width, uint32_t height) {
                            return Picture{width, height, layout.colour_type, layout.depth, {}, {}, {}};
                        };
                        check(picture(side, other), {7, placement, 100, 100}, kind);
                        check(picture(other, side), {7, placement, 100, 100}, kind);
                        check(picture(side, side), {7, placement, 100, 100}, kind);
                        check(picture(side, 0xFFFFFFFF), {7, placement | 4, 100, 100}, kind);
                    }
}

TEST_F(PngFailures, a_huge_image_at_its_own_size_in_a_huge_box_runs_out_of_memory) {
    for (const Layout layout : all_layouts) {
        reset();
        host.faults.largest_block = 1u << 20;
        Png png{.width = 0x7FFFFFFF, .height = 0x7FFFFFFF, .colour_type = layout.colour_type, .depth = layout.depth};
        if (layout.colour_type == indexed) png.plte = Bytes(768);
        png.stream = zlib_stored(Bytes(2000));
        Decode decode(build(png), PELM_SOURCE_MEMORY, {7, 0, INT32_MAX, INT32_MAX});
        EXPECT_EQ(decode.one_shot(nullptr), 0);
        EXPECT_TRUE(host.live_blocks().empty());
    }
}

TEST_F(PngFailures, a_tall_image_at_its_own_size_writes_the_rows_there_are) {
    // The buffer is said to be huge; only the rows of the stream are touched.
    Picture picture = noise_picture(rgb, 8, 3, 5);
    Png png = png_of(picture);
    const Bytes data = scanlines_of(png);
    png.scanlines = data;
    png.height = 0x08000000;
    Output output(3 * 5 * 4);
    Decode decode(build(png), PELM_SOURCE_MEMORY, {7, 0, 3, 0x08000000});
    EXPECT_EQ(decode.one_shot(output.data()), 1);
    EXPECT_EQ(output.bytes(), after_rows(picture, 5));
}

TEST_F(PngFailures, refused_headers_fail_without_image_memory) {
    const auto fails = [&](const Png &png, const char *name) {
        for (const uint32_t kind : all_source_kinds) {
            reset();
            const Outcome outcome = run(build(png), kind, {7, 0, 10, 10}, 400);
            EXPECT_EQ(flaws(outcome, 0), "") << name;
            EXPECT_EQ(outcome.output, background(400)) << name;
        }
    };
    const Png good{.width = 5, .height = 5, .colour_type = 2, .depth = 8};
    const auto with = [&](auto change) {
        Png png = good;
        change(png);
        return png;
    };
    fails(with([](Png &p) { p.width = 0; }), "width 0");
    fails(with([](Png &p) { p.height = 0; }), "height 0");
    for (const int depth : {0, 1, 2, 3, 4, 5, 7, 9, 15, 17, 32, 255})
        fails(with([=](Png &p) { p.depth = static_cast<uint8_t>(depth); }), "depth");
    for (const int type : {1, 5, 7, 8, 255})
        fails(with([=](Png &p) { p.colour_type = static_cast<uint8_t>(type); }), "colour type");
    fails(with([](Png &p) { p.colour_type = 3, p.depth = 16, p.plte = Bytes(3); }), "palette at 16 bits");
    fails(with([](Png &p) { p.compression_method = 1; }), "compression");
    fails(with([](Png &p) { p.filter_method = 1; }), "filter method");
    fails(with([](Png &p) { p.interlace = 2; }), "interlace");
    fails(with([](Png &p) { p.colour_type = 6, p.trns = Bytes(6); }), "tRNS beside an alpha channel");
    fails(with([](Png &p) { p.trns = Bytes(5); }), "tRNS of a wrong size");
    fails(with([](Png &p) { p.colour_type = 3, p.plte = Bytes(771); }), "palette too large");
    fails(with([](Png &p) { p.colour_type = 3, p.plte = Bytes(5); }), "palette of broken triplets");
}

TEST_F(PngFailures, many_decodes_leave_nothing_behind) {
    const int times = quick() ? 100 : 1000;
    for (int i = 0; i < times; ++i) {
        const Layout layout = all_layouts[static_cast<size_t>(i) % std::size(all_layouts)];
        const Picture picture = with_transparency(noise_picture(layout.colour_type, layout.depth, 9, 9));
        const Bytes file = file_of_blocks(picture, static_cast<Blocks>(i % 4), 30);
        Decode decode(file, all_source_kinds[i / 4 % 4], {written_formats[i % 6], 0, 5 + i % 6, 9});
        const Call call = static_cast<Call>(i % 3);
        decode.call(call, nullptr, 2);
        if (i % 5 == 0) decode.call(call, nullptr, 2);
        ZOTARPELMI_AbortPNGIter(&decode.info);
        ASSERT_TRUE(host.live_blocks().empty()) << i;
        host.allocations.clear();
    }
    EXPECT_TRUE(host.violations.empty());
}

} // namespace
} // namespace pelm::test
