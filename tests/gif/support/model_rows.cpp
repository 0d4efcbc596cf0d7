// The GIF model's rows: composed over the canvas, looked up, sampled and placed.
#include "tests/gif/support/model_decoder.h"

namespace pelm::test {

namespace {

// As many bytes as gif_pixel_bytes says.
std::array<uint8_t, 4> packed_colour(Colour c, uint32_t format) {
    const uint8_t opaque = 255;
    if (!c.painted) return format == 7 ? std::array<uint8_t, 4>{} : std::array<uint8_t, 4>{255, 255, 255, 255};
    const auto halves = [](uint32_t high, uint32_t green, uint32_t low) {
        const uint32_t value = high / 8 * 2048 + green / 4 * 32 + low / 8;
        return std::array<uint8_t, 4>{static_cast<uint8_t>(value % 256), static_cast<uint8_t>(value / 256)};
    };
    switch (format) {
    case 0: return halves(c.r, c.g, c.b);
    case 10: return halves(c.b, c.g, c.r);
    case 1: return {c.r, c.g, c.b};
    case 11: return {c.b, c.g, c.r};
    case 5: return {opaque, c.r, c.g, c.b};
    case 7: return {c.r, c.g, c.b, opaque};
    default: return {c.b, c.g, c.r, opaque};
    }
}

} // namespace

int64_t ModelDecoder::row_step() const {
    const int64_t stride = shape().row_pixels;
    const int64_t steps[] = {stride, -1, -stride, 1};
    return steps[request.quarter_turns];
}

int64_t ModelDecoder::pixel_step() const {
    const int64_t stride = shape().row_pixels;
    const int64_t steps[] = {1, stride, -1, -stride};
    return steps[request.quarter_turns];
}

// As a count of pixels from the start of the buffer.
int64_t ModelDecoder::first_pixel() const {
    const GifBufferShape buffer = shape();
    const int64_t w = scaled.width, h = scaled.height;
    const bool sideways = request.quarter_turns % 2 == 1;
    const int64_t placed_width = sideways ? h : w, placed_height = sideways ? w : h;
    const int64_t left = (buffer.row_pixels - placed_width) >> 1, top = (buffer.rows - placed_height) >> 1;
    const bool from_right = request.quarter_turns == 1 || request.quarter_turns == 2;
    const bool from_below = request.quarter_turns >= 2;
    const int64_t column = left + (from_right ? placed_width - 1 : 0);
    const int64_t row = top + (from_below ? placed_height - 1 : 0);
    return row * buffer.row_pixels + column;
}

// A pixel that does not lie wholly in the buffer is dropped, and no other.
void ModelDecoder::store(Bytes &output, int64_t pixel, Colour colour) const {
    const int64_t size = gif_pixel_bytes(request.format);
    const int64_t at = pixel * size;
    if (size == 0 || at < 0 || at + size > static_cast<int64_t>(output.size())) return;
    const std::array<uint8_t, 4> bytes = packed_colour(colour, request.format);
    std::copy_n(bytes.begin(), size, output.begin() + static_cast<ptrdiff_t>(at));
}

Colour ModelDecoder::shown(size_t pixel) const {
    return (image.has_local_table ? local : global)[pixels[pixel]];
}

void ModelDecoder::draw_row(Bytes &output, const std::vector<Colour> &colours) const {
    if (output.empty() || gif_pixel_bytes(request.format) == 0) return;
    if (!scaled.one_to_one) return draw_reduced(output, colours);
    const bool forward = request.format == 5 || request.format == 7 || request.format == 8;
    const int64_t start = first_pixel() + source_row * row_step(), step = forward ? 1 : pixel_step();
    for (size_t x = 0; x < colours.size(); ++x)
        store(output, start + static_cast<int64_t>(x) * step, colours[x]);
}

void ModelDecoder::draw_reduced(Bytes &output, const std::vector<Colour> &colours) const {
    for (int64_t row = 0; row < scaled.height; ++row) {
        if ((row * screen_height + (screen_height >> 1)) / scaled.height != source_row) continue;
        for (int64_t column = 0; column < scaled.width; ++column) {
            const int64_t x = (column * screen_width + (screen_width >> 1)) / scaled.width;
            if (x < static_cast<int64_t>(colours.size()))
                store(output, first_pixel() + row * row_step() + column * pixel_step(),
                      colours[static_cast<size_t>(x)]);
        }
    }
}

// Own size: as many pixels as the screen is wide, whatever lies there. Reduced: those of the image.
void ModelDecoder::write_still(Bytes &output) const {
    const int64_t count = scaled.one_to_one ? screen_width : std::min(image.width, screen_width);
    std::vector<Colour> colours;
    for (int64_t x = 0; x < count; ++x)
        colours.push_back(shown(static_cast<size_t>(x)));
    draw_row(output, colours);
}

void ModelDecoder::write_composed(Bytes &output) const {
    if (!from_canvas) return draw_row(output, composed);
    const auto row = canvas.begin() + static_cast<ptrdiff_t>(source_row * screen_width);
    draw_row(output, {row, row + static_cast<ptrdiff_t>(screen_width)});
}

void ModelDecoder::compose_row() {
    if (source_row >= screen_height) return;
    Colour *const row = &canvas[static_cast<size_t>(source_row * screen_width)];
    std::copy_n(row, screen_width, composed.begin());
    const int64_t visible = std::clamp<int64_t>(screen_width - image.left, 0, image.width);
    for (int64_t x = 0; x < visible; ++x) {
        const Colour colour = shown(static_cast<size_t>(x));
        Colour &kept = row[image.left + x];
        Colour &out = composed[static_cast<size_t>(image.left + x)];
        const bool transparent = control.transparency && pixels[static_cast<size_t>(x)] == control.transparent;
        out = transparent ? kept : colour;
        if (control.disposal == 2)
            kept = control.transparency ? Colour{255, 255, 255, false} : global[background];
        else if (control.disposal != 3)
            kept = out;
    }
}

void ModelDecoder::write_row(Bytes &output) {
    if (animated && !from_canvas) compose_row();
    if (source_row < screen_height) animated ? write_composed(output) : write_still(output);
    advance_row();
}

void ModelDecoder::write_canvas_row(Bytes &output, int64_t row) {
    source_row = row;
    write_row(output);
}

void ModelDecoder::write_canvas_rows(Bytes &output, int64_t from, int64_t to) {
    from_canvas = true;
    for (int64_t row = from; row < to; ++row)
        write_canvas_row(output, row);
    from_canvas = false;
}

void ModelDecoder::advance_row() {
    const int64_t end = image.top + image.height;
    if (image.pass == 0) {
        ++source_row;
    } else if (image.height < 5) {
        constexpr int64_t of_two[] = {1}, of_three[] = {2, 1}, of_others[] = {2, 1, 3};
        const int64_t *const rows = image.height == 2 ? of_two : image.height == 3 ? of_three : of_others;
        const int last_pass = image.height == 2 ? 2 : image.height == 3 ? 3 : 4;
        const bool done = image.pass == last_pass;
        source_row = done ? end : image.top + rows[image.pass - 1];
        image.pass = done ? 0 : image.pass + 1;
    } else {
        constexpr int64_t step[] = {8, 8, 4, 2}, next_start[] = {4, 2, 1};
        source_row += step[image.pass - 1];
        if (source_row < end) return;
        if (image.pass < 4) source_row = image.top + next_start[image.pass - 1];
        image.pass = image.pass == 4 ? 0 : image.pass + 1;
    }
}

// Offers the row in hand to the line's next output row. True when the row is used up.
bool ModelDecoder::offer_line(Bytes &output) {
    if (!scaled.one_to_one) {
        const int64_t distance = line_position - scaled.height * source_row;
        if (distance < 0 || distance >= scaled.height) {
            ++source_row;
            return true;
        }
    }
    const int64_t columns = std::min<int64_t>(scaled.one_to_one ? image.width : scaled.width, request.box_width);
    for (int64_t column = 0; column < columns; ++column) {
        const int64_t x = scaled.one_to_one ? column : (column * screen_width + (screen_width >> 1)) / scaled.width;
        if (x < image.width) store(output, rows_out * request.box_width + column, shown(static_cast<size_t>(x)));
    }
    ++rows_out;
    if (!scaled.one_to_one) {
        line_position += screen_height;
        return false;
    }
    ++source_row;
    return true;
}

void ModelDecoder::clear_unreached_rows(Bytes &output) const {
    const int64_t end = image.top + image.height, pixel = gif_pixel_bytes(request.format);
    if (end > screen_height || source_row >= end || pixel == 0 || request.quarter_turns != 0) return;
    if (request.box_width <= 0 || request.box_height <= 0) return;
    const int64_t row = scaled.height * source_row / screen_height;
    const int64_t step = pixel == 2 ? 1 : pixel; // counts halves of a pixel where one has two bytes
    const int64_t from = first_pixel() * pixel + row * step * request.box_width;
    const int64_t to = from + step * request.box_width * (request.box_height - row);
    for (int64_t at = std::max<int64_t>(from, 0); at < std::min<int64_t>(to, static_cast<int64_t>(output.size())); ++at)
        output[static_cast<size_t>(at)] = 0;
}

} // namespace pelm::test
