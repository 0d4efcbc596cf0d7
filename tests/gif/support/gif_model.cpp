// The GIF model's calls: who begins, continues and ends a decode, and what the request's words say afterwards.
#include "tests/gif/support/gif_model.h"

#include <sstream>

#include "tests/gif/support/model_decoder.h"

namespace pelm::test {

namespace {

// What a still decode allocates: record, input record, its buffer, two colour tables, the record of the string tables,
// the three of them, the pixels, the row; an animated one its canvas too.
constexpr size_t still_blocks = 11, animated_blocks = 12;

constexpr size_t table_bytes = 1024;

} // namespace

std::string GifRequest::described() const {
    std::ostringstream text;
    text << "format " << format << ", turned " << 90 * quarter_turns << ", placement 0x" << std::hex << placement
         << std::dec << ", box " << box_width << " x " << box_height;
    return text.str();
}

int64_t gif_pixel_bytes(uint32_t format) {
    switch (format) {
    case 0:
    case 10: return 2;
    case 1:
    case 11: return 3;
    case 5:
    case 7:
    case 8:
    case 12: return 4;
    default: return 0;
    }
}

GifSize gif_scaled_size(int64_t w, int64_t h, const GifRequest &request) {
    const bool sideways = request.quarter_turns % 2 == 1;
    const int64_t bw = sideways ? request.box_height : request.box_width;
    const int64_t bh = sideways ? request.box_width : request.box_height;
    if (request.placement == 0x700) return {bw, bh, bw == w && bh == h};
    if (bw >= w && bh >= h) return {w, h, true};
    const int64_t fitting_height = h * bw / w, fitting_width = w * bh / h;
    const bool fits_exactly = fitting_height == bh || fitting_width == bw;
    if (fits_exactly && bw <= w && bh <= h) return {bw, bh, false};
    if (bw < w && fitting_height <= bh) return {bw, fitting_height, false};
    return {fitting_width, bh, false};
}

size_t GifBufferShape::bytes() const {
    if (row_pixels <= 0 || rows <= 0) return 0;
    const int64_t most_pixels =
        INT64_MAX / pixel_bytes; // absurd sizes: more than any memory has, and no more than that
    return row_pixels > most_pixels / rows ? SIZE_MAX : static_cast<size_t>(row_pixels * rows * pixel_bytes);
}

GifBufferShape gif_buffer_shape(int64_t screen_width, int64_t screen_height, const GifRequest &request) {
    const int64_t pixel = gif_pixel_bytes(request.format) == 0 ? 4 : gif_pixel_bytes(request.format);
    if (request.placement != 0x100) return {request.box_width, request.box_height, pixel};
    const GifSize scaled = gif_scaled_size(screen_width, screen_height, request);
    return {scaled.width, scaled.height, pixel};
}

GifModel::GifModel(Bytes file, const GifRequest &request, int32_t most_per_read)
    : file_(std::move(file)), request_(request), most_per_read_(most_per_read) {}

GifModel::~GifModel() = default;

void GifModel::observe() {
    words.has_state = decoder_ != nullptr;
    words.consumed = consumed_;
    words.live_blocks = decoder_ == nullptr ? words.live_blocks : decoder_->animated ? animated_blocks : still_blocks;
}

// The state is gone.
int32_t GifModel::end(int32_t result) {
    if (decoder_ != nullptr) consumed_ = static_cast<int32_t>(decoder_->input.delivered);
    decoder_.reset();
    words.live_blocks = 0;
    observe();
    return result;
}

// 1: an image follows; 3: none; 0: refused, and -1: so early that there is no state.
int32_t GifModel::begin(bool animated, Style style) {
    style_ = style;
    decoder_ = std::make_unique<ModelDecoder>(file_, request_, most_per_read_);
    if (!decoder_->start(animated, &words.global_table)) {
        end(0);
        return -1;
    }
    const GifSize &scaled = decoder_->scaled;
    words.size_known =
        scaled.width == static_cast<int32_t>(scaled.width) && scaled.height == static_cast<int32_t>(scaled.height);
    words.output_width = static_cast<int32_t>(scaled.width);
    words.output_height = static_cast<int32_t>(scaled.height);
    if (style == Style::animated) {
        words.local_table = Bytes(table_bytes, 0);
        decoder_->raw_copy = &words.local_table;
    }
    return decoder_->walk();
}

int32_t GifModel::one_shot(Bytes &output) {
    const int32_t found = begin(false, Style::still);
    if (found < 0) return 0;
    if (found == 0) { // nobody frees what was allocated
        end(0);
        words.live_blocks = still_blocks;
        return 0;
    }
    words.has_transparency = decoder_->control.transparency;
    decoder_->source_row = decoder_->image.top;
    const int32_t result = decoder_->decode_all(output);
    decoder_->clear_unreached_rows(output);
    return end(result);
}

int32_t GifModel::iterative(Bytes &output) {
    if (decoder_ == nullptr) {
        const int32_t found = begin(false, Style::still);
        if (found < 0) return 0;
        if (found == 0) {
            end(0);
            words.live_blocks = still_blocks;
            return 0;
        }
        words.has_transparency = decoder_->control.transparency;
        decoder_->source_row = decoder_->image.top;
        decoder_->begin_iterative();
    } else {
        const int32_t result = decoder_->decode_slice(output);
        if (result != 4) return end(result);
    }
    consumed_ = static_cast<int32_t>(decoder_->input.delivered);
    observe();
    return 4;
}

int32_t GifModel::line(Bytes &output, int32_t rows_wanted) {
    const bool first = decoder_ == nullptr;
    if (first) {
        if (begin(false, Style::line) <= 0) return end(0);
        decoder_->source_row = decoder_->image.top;
    }
    const int32_t result = decoder_->decode_lines(output, rows_wanted, first);
    if (result == 0) return end(0);
    if (decoder_->rows_done >= decoder_->image.height) return end(1);
    consumed_ = static_cast<int32_t>(decoder_->input.delivered);
    observe();
    return 1;
}

int32_t GifModel::frame(Bytes &output) {
    if (decoder_ == nullptr) {
        words.global_table = Bytes(table_bytes, 0);
        words.local_table = Bytes(table_bytes, 0);
        if (begin(true, Style::animated) <= 0) return end(0);
        // With nothing but a trailer one frame is shown all the same: an empty one.
    }
    ModelDecoder &decoder = *decoder_;
    const int64_t below = decoder.image.top + decoder.image.height;
    decoder.write_canvas_rows(output, 0, decoder.image.top);
    decoder.source_row = decoder.image.top;
    decoder.decode_all(output);
    words.frame_delay = decoder.control.delay_ms;
    words.colour_table_state = decoder.image.has_local_table;
    decoder.write_canvas_rows(output, below, decoder.screen_height);
    words.local_table = Bytes(table_bytes, 0);
    return next_frame();
}

int32_t GifModel::next_frame() {
    const int32_t found = decoder_->walk();
    if (style_ == Style::animated_iterative) words.has_transparency = decoder_->control.transparency;
    if (found != 1) return end(found);
    consumed_ = static_cast<int32_t>(decoder_->input.delivered);
    observe();
    return 1;
}

int32_t GifModel::frame_iterative(Bytes &output) {
    if (decoder_ == nullptr) {
        if (begin(true, Style::animated_iterative) <= 0) return end(0);
        frame_phase_ = 0;
    }
    ModelDecoder &decoder = *decoder_;
    int32_t result = 4;
    if (frame_phase_ != 2) {
        decoder.write_canvas_rows(output, 0, decoder.image.top);
        decoder.source_row = decoder.image.top;
        decoder.begin_iterative();
        frame_phase_ = 2;
    } else {
        result = decoder.decode_slice(output);
        if (result != 4) {
            decoder.write_canvas_rows(output, decoder.image.top + decoder.image.height, decoder.screen_height);
            frame_phase_ = 1;
            return next_frame();
        }
    }
    consumed_ = static_cast<int32_t>(decoder.input.delivered);
    observe();
    return result;
}

int32_t GifModel::abort() {
    end(1);
    return 1;
}

} // namespace pelm::test
