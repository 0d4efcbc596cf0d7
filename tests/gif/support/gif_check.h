// Runs the library and the model side by side: the same calls over the same bytes, and after each of them everything
// that can be seen is compared. A difference is told as a bug report.
#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "PelmImageDecoder.h"
#include "tests/gif/support/gif_builder.h"
#include "tests/gif/support/gif_model.h"
#include "tests/support/test_host.h"

namespace pelm::test {

inline constexpr uint8_t gif_background = 0x5A;
inline constexpr uint32_t gif_formats[] = {0, 1, 5, 7, 8, 10, 11, 12};
inline constexpr uint32_t gif_source_kinds[] = {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT,
                                                PELM_SOURCE_SEQUENTIAL};

enum class GifCall { one_shot, iterative, line, frame, frame_iterative };
std::string name_of(GifCall call);

// How the bytes arrive and where the output lies.
struct GifSetting {
    uint32_t kind = PELM_SOURCE_MEMORY;
    int32_t most_per_read = INT32_MAX;
    Edge edge = Edge::end;
    size_t bytes_behind = 0;    // between the output and the inaccessible page: gives it any alignment
    bool has_raw_table = false; // word 20 names a buffer of the caller's
    bool no_output = false;
};

class SideBySide {
public:
    SideBySide(const Bytes &file, const GifRequest &request, const GifSetting &setting = {});
    ~SideBySide();
    SideBySide(const SideBySide &) = delete;
    SideBySide &operator=(const SideBySide &) = delete;

    // One call of both. Empty when nothing differs.
    std::string call(GifCall which, int32_t rows = 0);
    std::string abort();
    // Calls until the image (or, frame by frame, the last frame) is finished; line calls ask for `rows` each.
    std::string all_calls(GifCall which, int32_t rows = 0);

    int32_t result() const { return result_; }
    size_t calls() const { return calls_; }
    const Bytes &expected() const { return expected_; }
    const ImageDecodeInfo &info() const { return info_; }
    InputSource &source() { return source_.source; }
    const GifWords &words() const { return model_.words; }

private:
    int32_t real(GifCall which, int32_t rows);
    int32_t modelled(GifCall which, int32_t rows);
    void make_output(size_t size);
    std::string compare(const std::string &what, int32_t real_result, int32_t model_result);
    std::string different_words() const;
    std::string different_table(const char *name, const void *got, const std::optional<Bytes> &expected) const;
    std::string different_pixels() const;
    std::string misbehaviour() const;

    Bytes file_;
    GifRequest request_;
    GifSetting setting_;
    TestSource source_;
    GifModel model_;
    ImageDecodeInfo info_{};
    Bytes raw_table_;
    std::unique_ptr<GuardedBuffer> memory_;
    uint8_t *output_ = nullptr;
    Bytes expected_;
    int32_t result_ = -1;
    size_t calls_ = 0;
};

// A whole decode both ways, in fresh buffers. Empty when nothing differs.
std::string gif_difference(const Bytes &file, const GifRequest &request, GifCall which = GifCall::one_shot,
                           const GifSetting &setting = {}, int32_t rows = 0);

// The same, failing the test when something differs; what the output holds at the end, for expectations of one's own.
struct GifOutcome {
    int32_t result; // of the last call
    Bytes output;
    GifWords words;
};
GifOutcome checked_decode(const Bytes &file, const GifRequest &request, GifCall which = GifCall::one_shot,
                          const GifSetting &setting = {});

// Format 1: the colours of the indices.
Bytes rgb_of(const Bytes &indices, const ColourTable &table);

// The box of the screen's own size.
GifRequest own_size(uint16_t width, uint16_t height, uint32_t format = 7);

// Resets the host round every test.
class GifTest : public ::testing::Test {
protected:
    GifTest() { host.reset(); }
    ~GifTest() override { host.reset(); }
    TestHost &host = TestHost::get();
};

} // namespace pelm::test
