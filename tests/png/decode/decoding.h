// Runs decodes against guard pages and a host that keeps account, and builds the files that they read.
#pragma once

#include <gtest/gtest.h>

#include <memory>

#include "PelmImageDecoder.h"
#include "tests/png/decode/expected.h"
#include "tests/png/decode/polling.h"
#include "tests/png/support/png_builder.h"
#include "tests/support/test_host.h"

namespace pelm::test {

inline constexpr uint32_t all_source_kinds[] = {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT,
                                                PELM_SOURCE_SEQUENTIAL};

// How the image data of a file is compressed.
enum class Blocks { stored, fixed, dynamic, mixed };
std::string name_of(Blocks blocks);

// A PNG of the picture, filters by turns. The rest of the description can be changed before it is built.
Png png_of(const Picture &picture);
Bytes file_of(const Picture &picture);

// Literals and matches (of nearby distances, and of one row above) that stand for the data.
Tokens tokens_of(const Bytes &data, const std::vector<uint32_t> &distances);

// A zlib stream of the data in blocks that each hold `block_size` bytes.
Bytes stream_of_blocks(const Bytes &data, Blocks blocks, size_t block_size, uint32_t row_length);
Bytes file_of_blocks(const Picture &picture, Blocks blocks, size_t block_size);

// A buffer flush against an inaccessible page, or a number of bytes before it.
class Output {
public:
    explicit Output(size_t size, size_t bytes_behind = 0);
    uint8_t *data() { return area_; }
    size_t size() const { return size_; }
    Bytes bytes() const { return {area_, area_ + size_}; }
    void fill(const Bytes &bytes);
    bool intact() const;

private:
    GuardedBuffer memory_;
    size_t size_;
    size_t behind_;
    uint8_t *area_;
};

enum class Call { one_shot, iterative, line };
std::string name_of(Call call);

// One request over one source. Between calls its words may be looked at and changed.
struct Decode {
    Decode(const Bytes &file, uint32_t kind, const Request &request);
    ~Decode();
    Decode(const Decode &) = delete;
    Decode &operator=(const Decode &) = delete;

    int32_t one_shot(void *output);
    int32_t iterative(void *output);
    int32_t line(void *output, int32_t rows);
    int32_t call(Call which, void *output, int32_t rows);
    bool started() const { return info.decoderState != nullptr; }

    TestSource source;
    Request request;
    ImageDecodeInfo info{};
};

// A whole decode into a fresh buffer of background.
struct Outcome {
    int32_t result = -1;
    std::vector<int32_t> results; // of every call
    Bytes output;
    ImageDecodeInfo info{};
    size_t live_blocks = 0;
    std::string trouble; // what was done that must not be done; empty: nothing
};

// Calls until the result is not 4, at most `most_calls` times. `rows` is for line calls.
Outcome run(const Bytes &file, uint32_t kind, const Request &request, size_t output_size, Call call = Call::one_shot,
            int32_t rows = 0, int most_calls = 1000, size_t bytes_behind = 0);

// Result 1, nothing alive, decoderState NULL, no trouble. Empty when so.
std::string flaws(const Outcome &outcome, int32_t expected_result = PELM_RESULT_DONE);

// Resets host and polling round every test.
class PngDecoding : public ::testing::Test {
protected:
    PngDecoding() { reset(); }
    ~PngDecoding() override { reset(); }
    static void reset() {
        TestHost::get().reset();
        Polling::get().reset();
    }
    TestHost &host = TestHost::get();
    Polling &polling = Polling::get();
};

// Decodes the picture's file by a one-shot call and compares with the model. Empty when equal.
std::string one_shot_difference(const Picture &picture, const Bytes &file, uint32_t kind, const Request &request,
                                size_t bytes_behind = 0);

} // namespace pelm::test
