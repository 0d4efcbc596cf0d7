// What an interlaced decode allocates, in order, and each of it failing.
#include "tests/png/decode/blocks.h"
#include "tests/png/interlaced/passes.h"

namespace pelm::test {
namespace {

using PngInterlacedMemory = PngDecoding;

TEST_F(PngInterlacedMemory, a_decode_allocates_the_row_of_zeros_and_the_frame_but_no_accumulators) {
    for (const Layout layout : all_layouts)
        for (const uint32_t kind : all_source_kinds)
            for (const Blocks compressed : {Blocks::stored, Blocks::fixed, Blocks::dynamic})
                for (const uint32_t flags : {0u, 0x1000u})
                    for (const int32_t side : {30, 9})
                        for (const Call call : {Call::one_shot, Call::iterative}) {
                            reset();
                            const Picture picture = interlaced_noise(layout, true, 21, 14);
                            const Request request{7, flags, side, side};
                            const Bytes file = interlaced_file_of_blocks(picture, compressed, 300);
                            EXPECT_EQ(flaws(run(file, kind, request, buffer_size(picture, request), call)), "");
                            EXPECT_EQ(host.allocations,
                                      sizes_of(expected_blocks(picture, kind, request, compressed, Passes::adam7)))
                                << picture.described() << ", " << name_of(compressed);
                        }
}

TEST_F(PngInterlacedMemory, every_failing_allocation_but_the_frames_fails_the_decode_and_leaves_nothing) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{indexed, 4}, Layout{grey, 8}})
        for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM})
            for (const Call call : {Call::one_shot, Call::iterative, Call::line})
                for (const uint32_t flags : {0u, 0x1000u})
                    for (const int32_t side : {30, 9})
                        for (const bool from_then_on : {false, true}) {
                            const Picture picture = interlaced_noise(layout, false, 21, 14);
                            const Request request{7, flags, side, side};
                            const Bytes file = interlaced_file_of_blocks(picture, Blocks::dynamic, 5000);
                            const size_t size = buffer_size(picture, request);
                            const std::vector<Block> blocks =
                                expected_blocks(picture, kind, request, Blocks::dynamic, Passes::adam7);
                            for (size_t n = 1; n <= blocks.size(); ++n) {
                                reset();
                                (from_then_on ? host.faults.failing_allocations_from : host.faults.failing_allocation) =
                                    static_cast<int>(n);
                                const Outcome outcome = run(file, kind, request, size, call);
                                const bool survives = blocks[n - 1].name == std::string("frame") && !from_then_on;
                                const std::string what = picture.described() + ", " + name_of(call) + " without " +
                                                         blocks[n - 1].name + ", " + request.described();
                                EXPECT_EQ(flaws(outcome, survives ? 1 : 0), "") << what;
                                EXPECT_EQ(outcome.output,
                                          survives && side == 30 ? expected_bytes(picture, request) : background(size))
                                    << what;
                            }
                        }
}

TEST_F(PngInterlacedMemory, rows_are_polled_although_there_is_no_frame) {
    const Picture picture = interlaced_noise({rgb, 8}, false, 21, 14);
    const Request request{7, PELM_INTERLACE_FRAME, 9, 9};
    host.faults.failing_allocation = 4; // state, reader, index, frame
    EXPECT_EQ(flaws(run(interlaced_file_of(picture), PELM_SOURCE_MEMORY, request, 324)), "");
    EXPECT_EQ(polling.polls, static_cast<int>(pass_rows_of(picture).size()));
}

} // namespace
} // namespace pelm::test
