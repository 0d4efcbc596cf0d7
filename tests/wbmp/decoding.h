// Runs WBMP decodes against guard pages and compares what they leave behind with what was expected.
#pragma once

#include "tests/bmp/expectations.h"
#include "tests/wbmp/model.h"

namespace pelm::test {

inline constexpr uint32_t wbmp_kinds[] = {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM};
inline constexpr uint32_t wbmp_formats[] = {0, 1, 7, 8};
inline constexpr int32_t untouched = 0x7A7A7A7A; // words 7 and 8 before the decode

struct WbmpDecode {
    int32_t result;
    ImageDecodeInfo info;
    Bytes output;
    std::string misbehaviour; // empty: none. Also that blocks are left, or a pointer in a stream's data word

    bool is_untouched() const;
};

// Decodes into a buffer of the box's size full of background, at the given edge. The host is not reset.
WbmpDecode decode_wbmp(TestSource &source, const WbmpRequest &request, Edge edge = Edge::end);

// Decodes with a NULL output.
WbmpDecode decode_wbmp_to_null(TestSource &source, const WbmpRequest &request);

// Resets the host and compares with the model.
::testing::AssertionResult decodes_as_modelled(const Picture &picture, uint32_t kind, const WbmpRequest &request,
                                               Edge edge = Edge::end);

// Resets the host and expects 0 with nothing written, nothing left, and words 7 and 8 as they were.
::testing::AssertionResult is_refused(const Bytes &bytes, uint32_t kind, const WbmpRequest &request = {1, 0, 40, 40});

} // namespace pelm::test
