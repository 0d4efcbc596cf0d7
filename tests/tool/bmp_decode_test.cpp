// What the tool leaves behind of a BMP's decode when memory or reads fail on the way: nothing.
#include "tools/bmp_decode.h"

#include <gtest/gtest.h>

#include "tests/support/bmp_builder.h"
#include "tests/support/test_host.h"
#include "tools/failure.h"

namespace pelm::test {
namespace {

using pelm_tool::Box;
using pelm_tool::Calls;
using pelm_tool::DecodeJob;
using pelm_tool::ImageDescription;
using pelm_tool::Mode;

constexpr int32_t width = 9, height = 250; // three bands

constexpr Mode all_modes[] = {
    {Calls::one_shot}, {Calls::iterative}, {Calls::by_lines, 7}, {Calls::by_lines, height}, {Calls::in_two_steps}};

constexpr uint32_t all_kinds[] = {PELM_SOURCE_STREAM, PELM_SOURCE_MEMORY};

struct Ran {
    int32_t result;
    int allocations;
    int reads;
};

// Fails when anything is left of the decode.
Ran run(const Bytes &bytes, uint32_t kind, Mode mode, const HostFaults &faults, uint32_t flags = 0) {
    TestHost &host = TestHost::get();
    host.reset();
    host.faults = faults;
    TestSource source(kind, bytes, 4 * width);
    ImageDescription image;
    image.width = width;
    image.height = height;
    image.row_bytes = 3 * width + 1;
    ImageDecodeInfo info = {};
    info.input = &source.source;
    info.outputFormat = PELM_FORMAT_RGBA8888;
    info.flags = flags;
    pelm_tool::Picture picture{pelm_tool::find_pixel_format("rgba"), width, height, Bytes(4 * width * height)};
    const uint64_t polls = 0;
    DecodeJob job{info, image, Box{width, height}, mode, &picture, polls};
    Ran ran{};
    try {
        ran.result = pelm_tool::decode_bmp(job);
    } catch (const pelm_tool::Failure &) {
        ran.result = PELM_RESULT_FAILED;
    }
    ran.allocations = static_cast<int>(host.allocations.size());
    ran.reads = static_cast<int>(host.reads.size());
    EXPECT_TRUE(host.live_blocks().empty());
    EXPECT_TRUE(host.violations.empty()) << host.violations.front();
    EXPECT_EQ(info.decoderState, nullptr);
    if (kind == PELM_SOURCE_STREAM) {
        EXPECT_EQ(source.source.data, nullptr);
    }
    host.reset();
    return ran;
}

Bytes file() {
    return file_bytes(noise_bmp(variant_named("twenty_four_bits"), width, height, false));
}

TEST(ToolBmpDecode, fails_and_frees_everything_when_any_allocation_fails) {
    for (const Mode mode : all_modes) {
        for (const uint32_t kind : all_kinds) {
            const Ran whole = run(file(), kind, mode, {});
            EXPECT_EQ(whole.result, PELM_RESULT_DONE);
            ASSERT_GT(whole.allocations, 1);
            for (int n = 1; n <= whole.allocations; ++n) {
                HostFaults faults;
                faults.failing_allocation = n;
                EXPECT_EQ(run(file(), kind, mode, faults).result, PELM_RESULT_FAILED) << n;
            }
        }
    }
}

TEST(ToolBmpDecode, by_lines_tells_of_a_read_that_fails_and_frees_everything) {
    for (const Mode mode : {Mode{Calls::by_lines, 1}, Mode{Calls::by_lines, 7}, Mode{Calls::by_lines, height}}) {
        const Ran whole = run(file(), PELM_SOURCE_STREAM, mode, {});
        ASSERT_GT(whole.reads, 2);
        for (int n = 2; n <= whole.reads; ++n) {
            HostFaults faults;
            faults.failing_reads_from = n;
            EXPECT_EQ(run(file(), PELM_SOURCE_STREAM, mode, faults).result, PELM_RESULT_DATA_ENDED) << n;
        }
    }
}

TEST(ToolBmpDecode, frees_everything_that_a_refusal_in_two_steps_parks) {
    Bytes cut = file();
    cut.pop_back();
    for (const uint32_t kind : all_kinds)
        EXPECT_EQ(run(cut, kind, {Calls::in_two_steps}, {}).result, PELM_RESULT_FAILED);
}

TEST(ToolBmpDecode, by_lines_refuses_to_turn_before_it_begins) {
    for (const uint32_t turn : {PELM_ROTATE_90, PELM_ROTATE_180, PELM_ROTATE_270}) {
        const Ran ran = run(file(), PELM_SOURCE_STREAM, {Calls::by_lines, 7}, {}, turn);
        EXPECT_EQ(ran.result, PELM_RESULT_FAILED);
        EXPECT_EQ(ran.allocations, 0);
    }
}

} // namespace
} // namespace pelm::test
