// What GIF decodes must do, worked out from the rules on plain arrays, pixel by pixel and slowly. Shares nothing with
// the library. One model is one request over one source; its calls are those of the library, in the same order.
#pragma once

#include <array>
#include <memory>
#include <optional>

#include "tests/support/bmp_builder.h"

namespace pelm::test {

struct GifRequest {
    uint32_t format = 7;
    uint32_t quarter_turns = 0; // clockwise
    uint32_t placement = 0;     // bits 8 to 10 of the flags
    int32_t box_width = 0;
    int32_t box_height = 0;

    uint32_t flags() const { return quarter_turns << 2 | placement; }
    std::string described() const;
};

// 0 for a format that is not written.
int64_t gif_pixel_bytes(uint32_t format);

// Size after scaling, in the image's orientation; in 64 bits, since absurd boxes give absurd sizes.
struct GifSize {
    int64_t width, height;
    bool one_to_one;
};
GifSize gif_scaled_size(int64_t screen_width, int64_t screen_height, const GifRequest &request);

// Pixels of the caller's buffer and how many bytes each takes there (4 where the format is not written).
struct GifBufferShape {
    int64_t row_pixels, rows, pixel_bytes;
    size_t bytes() const;
};
GifBufferShape gif_buffer_shape(int64_t screen_width, int64_t screen_height, const GifRequest &request);

// The words of the request that decodes write, and what else can be seen of one.
struct GifWords {
    int32_t output_width = 0, output_height = 0;
    bool size_known = true; // false: absurd sizes that do not fit the words
    uint32_t has_transparency = 0;
    bool has_state = false;
    uint32_t frame_delay = 0, colour_table_state = 0;
    std::optional<Bytes> global_table, local_table; // words 20 and 21: none when NULL
    int32_t consumed = 0;
    size_t live_blocks = 0; // the library's, without those of words 20 and 21
};

struct ModelDecoder;

class GifModel {
public:
    // Every read delivers at most `most_per_read` bytes.
    GifModel(Bytes file, const GifRequest &request, int32_t most_per_read = INT32_MAX);
    ~GifModel();
    GifModel(const GifModel &) = delete;
    GifModel &operator=(const GifModel &) = delete;

    // The caller's buffer, as large as the caller made it. Results are those of the public calls.
    int32_t one_shot(Bytes &output);
    int32_t iterative(Bytes &output);
    int32_t line(Bytes &output, int32_t rows_wanted);
    int32_t frame(Bytes &output);
    int32_t frame_iterative(Bytes &output);
    int32_t abort();

    GifWords words; // global_table may be set before the first call, as a caller may

private:
    enum class Style { still, line, animated, animated_iterative };

    int32_t begin(bool animated, Style style);
    int32_t end(int32_t result);
    int32_t first_frame();
    int32_t next_frame();
    void observe();

    Bytes file_;
    GifRequest request_;
    int32_t most_per_read_;
    int32_t consumed_ = 0;
    Style style_ = Style::still;
    int frame_phase_ = 0;
    std::unique_ptr<ModelDecoder> decoder_; // word 15
};

} // namespace pelm::test
