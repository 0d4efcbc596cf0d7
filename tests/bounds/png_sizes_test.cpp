// Images of more pixels than 32 bits count: sizes that wrap, and the memory that is asked for on the way.
#include "tests/bounds/ways.h"
#include "tests/bounds/work.h"
#include "tests/png/support/png_builder.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

using PngSizes = BoundsTest;

struct Layout {
    uint8_t colour_type, depth;
};

constexpr Layout layouts[] = {{0, 1}, {0, 2}, {0, 4}, {0, 8}, {0, 16}, {2, 8}, {2, 16}, {3, 1},
                              {3, 2}, {3, 4}, {3, 8}, {4, 8}, {4, 16}, {6, 8}, {6, 16}};

// The size that reducing leaves, with products of 32 bits, for images that are larger than their box.
struct Reduced {
    uint32_t width, height;
};

Reduced reduced(uint32_t width, uint32_t height, const Asking &asking) {
    const bool sideways = (asking.flags & 4) != 0;
    const auto box_x = static_cast<uint32_t>(sideways ? asking.height : asking.width);
    const auto box_y = static_cast<uint32_t>(sideways ? asking.width : asking.height);
    if ((asking.flags & 0x700) == 0x700) return {box_x, box_y};
    const float across = static_cast<float>(width) / static_cast<float>(box_x);
    const float down = static_cast<float>(height) / static_cast<float>(box_y);
    if (across < down) return {width * box_y / height, box_y};
    return {box_x, height * box_x / width};
}

Bytes file_of(const Layout &layout, uint32_t width, uint32_t height, uint8_t interlace) {
    Png png{.width = width, .height = height, .colour_type = layout.colour_type, .depth = layout.depth};
    png.interlace = interlace;
    if (layout.colour_type == 3) png.plte = Bytes(768, 9);
    png.stream = zlib_stored(Bytes(3000));
    return build(png);
}

constexpr uint64_t most_alive = 256u << 10;

std::vector<Asking> askings(uint32_t kind) {
    std::vector<Asking> all;
    for (const uint32_t flags : {0x000u, 0x100u, 0x700u, 0x200u, 0x004u, 0x704u, 0x1000u, 0x1700u})
        for (const auto &[width, height] : {std::pair{100, 100}, {1, 1}, {2, 1}, {7, 90}, {90, 7}})
            all.push_back({kind, 7, flags, width, height});
    return all;
}

// A side of 0 is a success; everything else would need rows that no memory holds.
void expect_stated(const Layout &layout, uint32_t width, uint32_t height) {
    for (const uint8_t interlace : {uint8_t{0}, uint8_t{1}}) {
        const Bytes file = file_of(layout, width, height, interlace);
        for (const uint32_t kind : every_kind) {
            if (quick() && (kind == PELM_SOURCE_SEQUENTIAL) != (interlace != 0)) continue;
            for (const Asking &asking : askings(kind))
                for (const Way way : png_ways) {
                    reset_work();
                    const Reduced size = reduced(width, height, asking);
                    const Decoded decoded = decode(file, way, asking);
                    const std::string what = name_of(way) + ", " + std::to_string(width) + " x " +
                                             std::to_string(height) + ", type " + std::to_string(layout.colour_type) +
                                             ", depth " + std::to_string(layout.depth) + ", box " +
                                             std::to_string(asking.width) + " x " + std::to_string(asking.height) +
                                             ", flags " + std::to_string(asking.flags);
                    EXPECT_EQ(decoded.result, size.width == 0 || size.height == 0 ? 1 : 0) << what;
                    EXPECT_EQ(static_cast<uint32_t>(decoded.output_width), size.width) << what;
                    EXPECT_EQ(static_cast<uint32_t>(decoded.output_height), size.height) << what;
                    EXPECT_EQ(decoded.output, Bytes(decoded.output.size())) << what;
                    EXPECT_LT(work().peak_bytes, most_alive) << what;
                    EXPECT_TRUE(left_nothing()) << what;
                }
        }
    }
}

TEST_F(PngSizes, the_largest_header_gives_the_result_of_its_wrapped_sizes) {
    for (const Layout &layout : layouts)
        expect_stated(layout, 0xFFFFFFFF, 0xFFFFFFFF);
}

TEST_F(PngSizes, a_row_of_two_thousand_million_pixels_gives_the_result_of_its_wrapped_sizes) {
    for (const Layout &layout : layouts)
        expect_stated(layout, 0x80000000, 1);
}

TEST_F(PngSizes, square_headers_around_the_wrap_give_the_result_of_their_wrapped_sizes) {
    for (const uint32_t side : {0xFFFFFFFEu, 0x80000001u, 0x80000000u})
        for (const Layout &layout : {Layout{0, 1}, Layout{3, 8}, Layout{6, 16}})
            expect_stated(layout, side, side);
}

// A picture one pixel wide, stretched to a million: the sums are cleared once, and rows that are not written cost what
// the file's rows do.
TEST_F(PngSizes, a_wide_box_without_a_buffer_costs_nothing_in_width) {
    for (const uint8_t colour_type : {uint8_t{2}, uint8_t{0}})
        for (const int32_t height : {500, 2000, 7000}) {
            Png png{.width = 1, .height = 2000, .colour_type = colour_type, .depth = 8};
            png.rows = noise_rows(png, 1);
            const Bytes file = build(png);
            for (const Way way : png_ways) {
                Asking asking{PELM_SOURCE_MEMORY, 7, PELM_PLACE_STRETCH, 1000000, height};
                asking.has_output = false;
                reset_work();
                EXPECT_EQ(decode(file, way, asking).result, 1) << name_of(way);
                EXPECT_LT(work().bytes_moved, 5000000u) << name_of(way) << ", " << height;
            }
        }
}

} // namespace
} // namespace pelm::test
