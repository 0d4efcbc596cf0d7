// The GIF model's input buffer and its walk from block to block.
#include "tests/gif/support/model_decoder.h"

namespace pelm::test {

namespace {
constexpr size_t buffer_size = 16384;
}

uint32_t ModelInput::take_word() {
    const uint32_t low = take();
    return low | static_cast<uint32_t>(take()) << 8;
}

void ModelInput::refill() {
    held.erase(held.begin(), held.begin() + static_cast<ptrdiff_t>(used));
    used = 0;
    const size_t asked = buffer_size - held.size();
    const size_t got = std::min({asked, static_cast<size_t>(most_per_read), file->size() - delivered});
    const auto from = file->begin() + static_cast<ptrdiff_t>(delivered);
    held.insert(held.end(), from, from + static_cast<ptrdiff_t>(got));
    delivered += got;
}

bool ModelInput::need(size_t count) {
    if (left() < count) refill();
    return left() >= count;
}

bool ModelDecoder::start(bool animated_, std::optional<Bytes> *raw_copy_) {
    animated = animated_;
    raw_copy = raw_copy_;
    if (!parse_header() || screen_width == 0 || screen_height == 0) return false;
    scaled = gif_scaled_size(screen_width, screen_height, request);
    pixels.assign(static_cast<size_t>(screen_width) + 4096, 0);
    composed.assign(static_cast<size_t>(screen_width), Colour{});
    const Colour never{255, 255, 255, false};
    if (animated) canvas.assign(static_cast<size_t>(screen_width * screen_height), never);
    return true;
}

bool ModelDecoder::parse_header() {
    if (!input.need(13)) return false;
    uint8_t signature[6];
    for (uint8_t &byte : signature)
        byte = input.take();
    const auto is_digit = [](uint8_t byte) { return byte >= '0' && byte <= '9'; };
    const bool good = signature[0] == 'G' && signature[1] == 'I' && signature[2] == 'F' && is_digit(signature[3]) &&
                      is_digit(signature[4]) && signature[5] >= 65 && signature[5] <= 122;
    if (!good) return false;
    screen_width = input.take_word();
    screen_height = input.take_word();
    const uint32_t packed = input.take();
    background = input.take();
    input.take(); // aspect ratio
    return packed < 128 || read_table(size_t{2} << (packed & 7), global);
}

bool ModelDecoder::read_table(size_t entries_wanted, Table &table) {
    if (!input.need(entries_wanted * 3)) return false;
    for (size_t i = 0; i < entries_wanted * 3; ++i) {
        const uint8_t byte = input.take();
        if (raw_copy != nullptr && raw_copy->has_value()) (**raw_copy)[i] = byte;
        Colour &colour = table[i / 3];
        (i % 3 == 0 ? colour.r : i % 3 == 1 ? colour.g : colour.b) = byte;
    }
    return true;
}

int32_t ModelDecoder::walk() {
    while (input.need(1)) {
        const uint8_t byte = input.take();
        if (byte == 0x3B) return 3;
        if (byte == 0x2C) return read_descriptor() ? 1 : 0;
        if (byte == 0x21 && !read_extension()) return 0;
    }
    return 0;
}

bool ModelDecoder::read_extension() {
    if (!input.need(2)) return false;
    const uint8_t label = input.take();
    switch (label) {
    case 0xF9: return read_control();
    case 0x01:
    case 0xFE:
    case 0xFF: return skip_extension(input.take());
    default: return true; // its size and body are looked at like anything between blocks
    }
}

bool ModelDecoder::read_control() {
    if (input.take() != 4 || !input.need(5)) return false;
    const uint32_t packed = input.take();
    const uint32_t delay = input.take_word();
    const int index = input.take();
    control.disposal = static_cast<int>(packed >> 2 & 7);
    control.transparency = packed % 2 == 1;
    control.delay_ms = delay * 10;
    control.transparent = control.transparency ? index : -1;
    return input.take() == 0;
}

bool ModelDecoder::skip_extension(uint32_t size) {
    while (size > 0) {
        if (!input.need(size + 1)) return false;
        input.used += size;
        size = input.take();
    }
    return true;
}

bool ModelDecoder::read_descriptor() {
    if (!input.need(9)) return false;
    image.left = input.take_word();
    image.top = input.take_word();
    image.width = input.take_word();
    image.height = input.take_word();
    const uint32_t packed = input.take();
    image.has_local_table = packed > 127;
    if (image.has_local_table && !read_table(size_t{2} << (packed & 7), local)) return false;
    image.pass = static_cast<int>(packed >> 6 & 1);
    if (!input.need(1)) return false;
    image.min_code_size = input.take();
    source_row = 0;
    const size_t pixels_needed = static_cast<size_t>(image.width) + 4096;
    if (pixels_needed > pixels.size()) pixels.assign(pixels_needed, 0);
    return image.min_code_size <= 12;
}

} // namespace pelm::test
