// Heights near and beyond what can be decoded in front of the data of a single pixel: the data decide how much is read.
#include "bmp/state.h"
#include "tests/bounds/ways.h"
#include "tests/bounds/work.h"

namespace pelm::test {
namespace {

using BmpHeights = BoundsTest;

constexpr int32_t highest = INT32_MAX / 4; // of rows of 4 bytes

struct Tall {
    int32_t height;
    uint16_t bits;
    uint32_t compression;

    Bytes file() const {
        BmpFile file;
        file.width = 1;
        file.height = height;
        file.bits = bits;
        file.compression = compression;
        if (bits == 8) file.palette = {3, 2, 1, 0, 6, 5, 4, 0};
        file.rows = {compression == 0 ? pack_row({1}, bits) : Bytes{1, 1, 0, 0}};
        return file_bytes(file);
    }
    bool is_run_length() const { return compression != 0; }
    std::string described() const {
        return std::to_string(height) + " rows, " + std::to_string(bits) + " bits, compression " +
               std::to_string(compression);
    }
};

const std::vector<Tall> &tall_ones() {
    static const std::vector<Tall> all = [] {
        std::vector<Tall> list;
        for (const int32_t height : {INT32_MAX, -INT32_MAX, INT32_MIN, highest + 1, -highest - 1, highest, -highest})
            for (const uint16_t bits : {uint16_t{8}, uint16_t{24}, uint16_t{32}}) {
                list.push_back({height, bits, 0});
                if (bits == 8) list.push_back({height, bits, 1});
            }
        return list;
    }();
    return all;
}

// Two steps know run-length codes and want all plain rows to be there; the others want the opposite.
int32_t expected_result(const Tall &tall, Way way) {
    const bool fits = tall.height >= -highest && tall.height <= highest;
    return fits && tall.is_run_length() == (way == Way::bmp_two_steps) ? 1 : 0;
}

TEST_F(BmpHeights, decodes_of_a_single_pixel_end_with_it) {
    for (const Tall &tall : tall_ones())
        for (const uint32_t kind : every_kind)
            for (const Way way : bmp_ways)
                for (const Asking &asking :
                     {Asking{kind, 7, 0, 8, 8}, Asking{kind, 1, 0x700, 8, 8}, Asking{kind, 0, 0x700 | 4, 5, 3},
                      Asking{kind, 7, 0, 1, INT32_MAX, 0, false}, Asking{kind, 7, 0x100 | 8, 1, highest, 0, false},
                      Asking{kind, 7, 0x700, 1, highest / 2, 0, false}}) {
                    // A hundred rows per call are a caller's long way, not the library's.
                    if (way == Way::bmp_iterative && !asking.has_output) continue;
                    reset_work();
                    const Bytes file = tall.file();
                    const Decoded decoded = decode(file, way, asking);
                    const std::string what = name_of(way) + ", " + tall.described() + ", kind " + std::to_string(kind);
                    EXPECT_EQ(decoded.result, expected_result(tall, way)) << what;
                    EXPECT_LE(decoded.calls, 2) << what; // turned, 5 rows of the image lie in a box of 3
                    const auto calls = static_cast<uint64_t>(decoded.calls);
                    EXPECT_LE(work().reads, 2 + 2 * calls) << what; // header, palette; pixels, their end
                    EXPECT_LE(work().bytes_read, (1 + calls) * file.size()) << what;
                    EXPECT_LE(work().seeks, 2 * calls + 1) << what;
                    EXPECT_LE(work().bytes_moved, 2048u + file.size()) << what;
                    EXPECT_LE(work().peak_bytes, sizeof(BmpState) + 1024 + 4096 + 64 + 1) << what;
                    EXPECT_TRUE(left_nothing()) << what;
                }
}

TEST_F(BmpHeights, a_call_for_a_hundred_rows_looks_no_further_than_its_data) {
    for (const Tall &tall : tall_ones()) {
        if (expected_result(tall, Way::bmp_iterative) == 0) continue;
        for (const uint32_t kind : every_kind) {
            reset_work();
            TestSource source(kind, tall.file());
            ImageDecodeInfo info{};
            info.input = &source.source;
            constexpr int32_t calls = 50;
            for (int32_t call = 0; call < calls; ++call)
                ASSERT_EQ(ZOTARPELMI_DecodeBMPIter(&info, nullptr, 1, highest), 4) << tall.described();
            EXPECT_LE(work().reads, 2u + 2u * calls);
            EXPECT_LE(work().bytes_moved, 2048u);
            EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, nullptr, 1, highest, INT32_MAX), 1);
            EXPECT_EQ(info.decoderState, nullptr);
            EXPECT_TRUE(left_nothing());
        }
    }
}

TEST_F(BmpHeights, the_one_pixel_is_written) {
    for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT}) {
        reset_work();
        const Tall tall{-highest, 24, 0};
        BmpFile file;
        file.height = tall.height;
        file.rows = {{30, 20, 10}};
        TestSource source(kind, file_bytes(file));
        ImageDecodeInfo info{};
        info.input = &source.source;
        info.outputFormat = PELM_FORMAT_RGB888;
        uint8_t pixels[6] = {1, 1, 1, 1, 1, 1};
        EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(&info, pixels, 1, highest, 2), 1);
        EXPECT_EQ(Bytes(pixels, pixels + 6), (Bytes{10, 20, 30, 1, 1, 1}));
        EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(&info, nullptr, 1, highest, INT32_MAX), 1);
        EXPECT_TRUE(left_nothing());
    }
}

} // namespace
} // namespace pelm::test
