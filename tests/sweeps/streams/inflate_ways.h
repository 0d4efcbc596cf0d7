// Decompressions by the library's core beside the model: the bytes that come out, the outcome, and where it ended, in
// every way that bytes arrive and rows stop it.
#pragma once

#include <span>
#include <string>

#include "PelmHostTesting.h"
#include "png/inflate/state.h"
#include "tests/png/support/inflate_model.h"
#include "tests/sweeps/random.h"

namespace pelm::sweeps {

using test::Bytes;

struct Way {
    std::vector<uint32_t> pieces = {}; // sizes, in which the input arrives; the last one again and again. None: at once
    uint32_t stop_after = 0;           // the rows stop it after every so many bytes; 0: never
    bool pause_at_blocks = false;

    std::string name() const;
};

// Keeps its memory for the next stream. Whatever is read ends at an inaccessible page.
class InflateWays {
public:
    InflateWays();
    InflateWays(const InflateWays &) = delete;
    InflateWays &operator=(const InflateWays &) = delete;
    ~InflateWays();

    // What comes out otherwise than the model says; "" when nothing does.
    std::string difference(const Bytes &stream, const test::Inflation &expected, const Way &way);

    // The same for the whole stream at once and for two ways that `random` chooses. With the model's own inflation.
    std::string difference(const Bytes &stream, Random &random);

    test::InflateModel model;
    uint64_t decodes = 0;

private:
    uint8_t *flush(std::span<const uint8_t> bytes); // a copy that ends at the page

    PelmTestArea area_{};
    InflateState state_{};
    HuffmanNodePool *pool_ = nullptr;
};

// A zlib stream of these deflated bytes, without a checksum.
Bytes zlib_of(const Bytes &deflated);

} // namespace pelm::sweeps
