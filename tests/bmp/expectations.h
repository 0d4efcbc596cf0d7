// What the BMP tests have in common: a fixture that watches over the host, and assertions that print bug reports.
#pragma once

#include <gtest/gtest.h>

#include "tests/support/bmp_check.h"

namespace pelm::test {

// How test results name the variant that they are about.
inline void PrintTo(const BmpVariant &variant, std::ostream *out) {
    *out << variant.name;
}

// The host starts afresh; at the end the library must have done nothing that it must not do.
class HostedTest : public ::testing::Test {
protected:
    void SetUp() override { host.reset(); }
    void TearDown() override {
        for (const std::string &violation : host.violations)
            ADD_FAILURE() << "the library " << violation;
        host.reset();
    }

    TestHost &host = TestHost::get();
};

inline ::testing::AssertionResult decodes_as_computed(BmpSubject &subject, const BmpRequest &request,
                                                      Edge edge = Edge::end) {
    const std::string report = subject.difference(request, edge);
    return report.empty() ? ::testing::AssertionSuccess() : ::testing::AssertionFailure() << report;
}

// Both ends of the output against an inaccessible page in turn.
inline ::testing::AssertionResult decodes_as_computed_at_both_edges(BmpSubject &subject, const BmpRequest &request) {
    const ::testing::AssertionResult at_end = decodes_as_computed(subject, request, Edge::end);
    return at_end ? decodes_as_computed(subject, request, Edge::start) : at_end;
}

inline constexpr uint32_t bmp_formats[] = {0, 1, 5, 6, 7, 8};
inline constexpr uint32_t all_kinds[] = {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT,
                                         PELM_SOURCE_SEQUENTIAL};
inline constexpr uint32_t stream_kinds[] = {PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT, PELM_SOURCE_SEQUENTIAL};

// A box that a picture of this size just fills after turning, widened by the given margins.
inline BmpRequest request_for(int32_t width, int32_t height, uint32_t format, int quarter_turns, uint32_t placement,
                              int32_t more_width = 0, int32_t more_height = 0) {
    const bool turned = quarter_turns % 2 == 1;
    return {format, quarter_turns, placement, (turned ? height : width) + more_width,
            (turned ? width : height) + more_height};
}

} // namespace pelm::test
