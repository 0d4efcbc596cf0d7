// The parts of the GIF model: input, block walk, code reader, rows. Only the model's own files include this.
#pragma once

#include <algorithm>

#include "tests/gif/support/gif_model.h"

namespace pelm::test {

struct Colour {
    uint8_t r = 0, g = 0, b = 0;
    bool painted = true; // false: a canvas pixel on which nothing was ever painted
};
using Table = std::array<Colour, 256>;

// The read buffer of 16384 bytes over a source that delivers at most so many bytes per read.
struct ModelInput {
    const Bytes *file;
    int32_t most_per_read;
    size_t delivered = 0; // of the file
    Bytes held;
    size_t used = 0; // of what is held

    size_t left() const { return held.size() - used; }
    bool at_end() const { return delivered == file->size(); }
    uint8_t take() { return held[used++]; }
    uint32_t take_word();
    void refill();           // keeps what is left, reads once to fill the rest
    bool need(size_t count); // refills when there is less; false when that is not enough
};

struct ModelImage {
    int64_t left = 0, top = 0, width = 0, height = 0;
    int pass = 0; // interlaced: 1 to 4 while rows are missing
    int min_code_size = 0;
    bool has_local_table = false;
};

struct ModelControl {
    int disposal = 0;
    bool transparency = false;
    int transparent = -1;
    uint32_t delay_ms = 0;
};

enum class Read { code, ended_well, failed };

struct ModelDecoder {
    ModelDecoder(const Bytes &file, const GifRequest &wanted, int32_t most_per_read)
        : input{&file, most_per_read, 0, {}, 0}, request(wanted) {}

    // Header and screen. False: refused.
    bool start(bool animated_, std::optional<Bytes> *raw_copy_);
    // To the next image: 1; trailer: 3; refused: 0.
    int32_t walk();

    // Still and frame data. `rows_wanted` is for lines.
    enum class Driver { one_shot, iterative, line };
    int32_t decode_all(Bytes &output);
    void begin_iterative(); // reads up to the first pixel
    int32_t decode_slice(Bytes &output);
    int32_t decode_lines(Bytes &output, int32_t rows_wanted, bool first);

    void clear_unreached_rows(Bytes &output) const;
    void write_canvas_row(Bytes &output, int64_t row);
    void write_canvas_rows(Bytes &output, int64_t from, int64_t to);

    ModelInput input;
    GifRequest request;

    int64_t screen_width = 0, screen_height = 0;
    uint8_t background = 0;
    Table global{}, local{};
    ModelImage image;
    ModelControl control;
    std::optional<Bytes> *raw_copy = nullptr; // where raw tables go, if anywhere
    bool animated = false;
    GifSize scaled{};

    int64_t source_row = 0;
    int64_t rows_done = 0;

private:
    bool parse_header();
    bool read_table(size_t entries, Table &table);
    bool read_extension();
    bool read_control();
    bool skip_extension(uint32_t size);
    bool read_descriptor();

    // Codes.
    int32_t begin_data();
    Read next_code(uint32_t &code);
    Read next_root(uint32_t &code);
    Read decode_code();
    Read clear();
    void put_root(uint32_t code);
    uint8_t put_string(uint32_t code);
    void put(uint8_t pixel) { pixels.at(pixel_count++) = pixel; }
    void take_row();
    bool row_is_complete() const { return static_cast<int64_t>(pixel_count) >= image.width; }
    bool more_rows_in_buffer() const;
    int32_t fill_a_row();
    int32_t run(Driver driver, Bytes &output, int32_t rows_wanted);
    bool emit(Driver driver, Bytes &output, int32_t rows_wanted, int32_t &result);
    bool offer_line(Bytes &output);

    // Rows.
    void write_row(Bytes &output);
    void write_still(Bytes &output) const;
    void write_composed(Bytes &output) const;
    void compose_row();
    void advance_row();
    Colour shown(size_t pixel) const;
    void draw_row(Bytes &output, const std::vector<Colour> &colours) const;
    void draw_reduced(Bytes &output, const std::vector<Colour> &colours) const;
    void store(Bytes &output, int64_t pixel, Colour colour) const;
    int64_t first_pixel() const;
    int64_t row_step() const;
    int64_t pixel_step() const;
    GifBufferShape shape() const { return gif_buffer_shape(screen_width, screen_height, request); }

    struct Entry {
        uint32_t prefix = 0;
        uint8_t suffix = 0;
        uint32_t length = 0;
    };
    std::array<Entry, 4096> entries{};
    uint32_t next_entry = 0, previous = 0;
    int code_size = 0;
    uint8_t first_pixel_of_string = 0;
    uint64_t bits = 0;
    int bit_count = 0;
    uint32_t block_left = 0;
    size_t pixel_count = 0;
    std::vector<uint8_t> pixels;    // as long as image width + 4096, or the screen's when that is more
    std::optional<int32_t> outcome; // of data that ended before the first pixel

    int64_t rows_out = 0;
    int64_t line_position = 0;

    std::vector<Colour> canvas, composed;
    bool from_canvas = false; // writers show the canvas row instead of the composed one
};

} // namespace pelm::test
