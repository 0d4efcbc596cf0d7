// The GIF model's code reader and the three ways to run it.
#include "tests/gif/support/model_decoder.h"

namespace pelm::test {

namespace {
constexpr uint32_t table_end = 4096;
constexpr int widest = 12;
constexpr uint32_t longest_string = 4096;
} // namespace

int32_t ModelDecoder::begin_data() {
    if (image.min_code_size > 11) return 0;
    const uint32_t clear_code = 1u << image.min_code_size;
    for (uint32_t i = 0; i < table_end; ++i)
        entries[i] = i <= clear_code + 1 ? Entry{0, static_cast<uint8_t>(i), 1} : Entry{};
    code_size = image.min_code_size + 1;
    next_entry = clear_code + 2;
    bits = 0;
    bit_count = 0;
    block_left = 0;
    pixel_count = 0;
    rows_done = 0;
    if (!input.need(1)) return 0;
    input.refill();
    uint32_t code = 0;
    const Read read = next_root(code);
    if (read != Read::code) return read == Read::ended_well ? 1 : 0;
    put_root(code);
    return 4;
}

Read ModelDecoder::next_code(uint32_t &code) {
    while (bit_count < code_size) {
        if (block_left == 0) {
            const uint32_t size = input.take();
            if (size >= input.left()) {
                input.refill();
                if (input.left() < 1) return Read::failed;
                if (size >= input.left()) return input.at_end() ? Read::ended_well : Read::failed;
            }
            block_left = size;
        } else {
            bits |= static_cast<uint64_t>(input.take()) << bit_count;
            bit_count += 8;
            --block_left;
        }
    }
    code = static_cast<uint32_t>(bits & ((1u << code_size) - 1));
    bits >>= code_size;
    bit_count -= code_size;
    return Read::code;
}

// The first code that does not clear; an end code ends well.
Read ModelDecoder::next_root(uint32_t &code) {
    const uint32_t clear_code = 1u << image.min_code_size;
    Read read;
    do
        read = next_code(code);
    while (read == Read::code && code == clear_code);
    return read == Read::code && code == clear_code + 1 ? Read::ended_well : read;
}

void ModelDecoder::put_root(uint32_t code) {
    first_pixel_of_string = static_cast<uint8_t>(code);
    put(first_pixel_of_string);
    previous = code;
}

uint8_t ModelDecoder::put_string(uint32_t code) {
    const size_t start = pixel_count;
    pixel_count += entries[code].length;
    for (size_t at = pixel_count; at > start; --at) {
        pixels.at(at - 1) = entries[code].suffix;
        code = entries[code].prefix;
    }
    return pixels[start];
}

Read ModelDecoder::clear() {
    code_size = image.min_code_size + 1;
    uint32_t code = 0;
    const Read read = next_root(code);
    if (read != Read::code) return read;
    put_root(code);
    next_entry = (1u << image.min_code_size) + 2;
    return Read::code;
}

Read ModelDecoder::decode_code() {
    const uint32_t clear_code = 1u << image.min_code_size;
    uint32_t code = 0;
    if (const Read read = next_code(code); read != Read::code) return read;
    if (code == clear_code) return clear();
    if (code == clear_code + 1) return Read::ended_well;
    uint32_t joined = previous;
    if (code < next_entry) {
        if (entries[code].length > longest_string) code = 0;
        first_pixel_of_string = put_string(code);
    } else {
        if (previous >= next_entry || entries[previous].length > longest_string) joined = 0;
        put_string(joined);
        put(first_pixel_of_string);
    }
    if (next_entry < table_end) {
        entries[next_entry] = {joined, first_pixel_of_string, entries[joined].length + 1};
        ++next_entry;
    }
    if (next_entry == 1u << code_size && code_size < widest) ++code_size;
    previous = code;
    return Read::code;
}

// 4: there is a whole row.
int32_t ModelDecoder::fill_a_row() {
    while (!row_is_complete()) {
        const Read read = decode_code();
        if (read != Read::code) return read == Read::ended_well ? 1 : 0;
    }
    return 4;
}

void ModelDecoder::take_row() {
    ++rows_done;
    pixel_count -= static_cast<size_t>(image.width);
    for (size_t i = 0; i < pixel_count; ++i)
        pixels[i] = pixels[i + static_cast<size_t>(image.width)];
}

// A row of no pixels is always complete: there are as many as the image is high.
bool ModelDecoder::more_rows_in_buffer() const {
    return row_is_complete() && (image.width > 0 || rows_done < image.height);
}

bool ModelDecoder::emit(Driver driver, Bytes &output, int32_t rows_wanted, int32_t &result) {
    do {
        if (driver == Driver::line) {
            if (image.pass != 0 && rows_out < rows_wanted) {
                result = 0;
                return false;
            }
            bool consumed = false;
            while (!consumed && rows_out < rows_wanted)
                consumed = offer_line(output);
            if (consumed) take_row();
            if (rows_out >= rows_wanted) {
                result = 1;
                return false;
            }
        } else {
            write_row(output);
            take_row();
        }
    } while (more_rows_in_buffer());
    return true;
}

int32_t ModelDecoder::run(Driver driver, Bytes &output, int32_t rows_wanted) {
    int cycles = 0;
    while (rows_done < image.height) {
        int32_t result = fill_a_row();
        if (result != 4) {
            if (driver == Driver::line) outcome = 0; // a further call has nothing to go on with
            return result;
        }
        if (!emit(driver, output, rows_wanted, result)) return result;
        if (driver == Driver::iterative && ++cycles == 16) return 4;
    }
    return 1;
}

int32_t ModelDecoder::decode_all(Bytes &output) {
    const int32_t begun = begin_data();
    return begun == 4 ? run(Driver::one_shot, output, 0) : begun;
}

void ModelDecoder::begin_iterative() {
    rows_done = 0;
    const int32_t begun = begin_data();
    outcome = begun == 4 ? std::nullopt : std::optional(begun);
}

int32_t ModelDecoder::decode_slice(Bytes &output) {
    if (rows_done >= image.height) return 1;
    return outcome.has_value() ? *outcome : run(Driver::iterative, output, 0);
}

int32_t ModelDecoder::decode_lines(Bytes &output, int32_t rows_wanted, bool first) {
    rows_out = 0;
    if (first) {
        line_position = scaled.height * image.top / screen_height + (screen_height >> 1);
        const int32_t begun = begin_data();
        if (begun != 4) {
            outcome = 0;
            return begun;
        }
    } else if (outcome.has_value()) {
        return 0; // the data had ended before
    }
    return run(Driver::line, output, rows_wanted);
}

} // namespace pelm::test
