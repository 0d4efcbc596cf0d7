#include "tests/sweeps/memory_limit.h"

#include <algorithm>
#include <numeric>
#include <string_view>

#include "bmp/state.h"
#include "frame/bytes.h"
#include "png/state.h"
#include "tests/gif/support/gif_blocks.h"
#include "tests/png/support/memory.h"
#include "tests/png/support/png_builder.h"

namespace pelm::sweeps {
namespace {

using fuzz::Format;

uint64_t not_negative(int64_t value) {
    return static_cast<uint64_t>(std::max<int64_t>(value, 0));
}

// The width that an image of `width` pixels is reduced to at most, or stretched to.
uint64_t most_scaled_width(const Setting &setting, bool is_turned, int64_t width) {
    const bool is_sideways = is_turned && (setting.rotation & PELM_ROTATE_90) != 0;
    const int64_t box = is_sideways ? setting.height : setting.width;
    return not_negative(setting.placement == PELM_PLACE_STRETCH ? box : std::min(box, width));
}

uint64_t bmp_limit(const Decode &decode, const Setting &setting, const uint8_t *bytes) {
    const std::string_view call = decode.call->name;
    const bool has_core_header = bytes[14] == 12 && call != "PreInitBMP";
    const int64_t width =
        has_core_header ? int64_t{read_u16le(bytes + 18)} : int64_t{static_cast<int32_t>(read_u32le(bytes + 18))};
    const uint64_t bits = read_u16le(bytes + (has_core_header ? 24 : 28));
    const uint64_t stride = (not_negative(width) * bits + 31) / 32 * 4;
    const uint64_t entries = (read_u32le(bytes + 10) - 54) >> 2 & 0xFFFF;
    const uint64_t palette = bits <= 8 ? std::max<uint64_t>(1024, 4 * (entries <= 0x7FFF ? entries : 0)) : 0;
    const uint64_t rows = std::max(not_negative(setting.buffer_size), stride);
    const uint64_t sums = 8 * most_scaled_width(setting, call != "DecodeBMPLine", width);
    const uint64_t indices = call == "PreInitBMP" ? not_negative(width) : 0;
    const bool has_staging = setting.kind != PELM_SOURCE_MEMORY;
    return sizeof(BmpState) + palette + (has_staging ? rows : 0) + sums + indices;
}

uint64_t wbmp_limit(const Setting &setting, const Bytes &file) {
    int64_t width = 0;
    for (size_t at = 2; at < std::min<size_t>(file.size(), 6); ++at) {
        width = width << 7 | (file[at] & 127);
        if ((file[at] & 128) == 0) break;
    }
    const uint64_t stream = setting.kind == PELM_SOURCE_STREAM ? 20 + not_negative(width + 7) / 8 : 0;
    const bool stretches = setting.placement == PELM_PLACE_STRETCH && setting.rotation == PELM_ROTATE_0;
    // Fitted, it may come out a pixel larger than it should.
    const int64_t scaled = stretches ? setting.width : std::min<int64_t>(setting.width, width) + 1;
    return stream + 8 * not_negative(scaled);
}

uint64_t png_limit(const Decode &decode, const uint8_t *bytes, const ImageDecodeInfo &info) {
    constexpr uint64_t channels[8] = {1, 1, 3, 1, 2, 1, 4, 2};
    const uint64_t width = test::read_u32be(bytes + 16);
    const uint64_t bits = bytes[24] * channels[bytes[25] & 7];
    const uint64_t scaled_width = static_cast<uint32_t>(info.outputWidth);
    const uint64_t scaled_height = static_cast<uint32_t>(info.outputHeight);
    const uint64_t reader = sizeof(PngDecodeState) + sizeof(PngInputBuffer) + 16384;
    constexpr uint64_t pool = 50008, tables = sizeof(void *) == 4 ? 20828 : 20848;
    const uint64_t palette = 768 + 2 * 768;
    const uint64_t index = 2048 * sizeof(PngIdatEntry);
    const uint64_t rows = test::row_buffer_bytes((width * bits + 7) / 8 + 1, width);
    const bool is_interlaced = bytes[28] != 0;
    const uint64_t frame = is_interlaced && decode.flags != 0 ? 4 * scaled_width * scaled_height : 0;
    const uint64_t sums = is_interlaced ? frame + 8 * width : 4 * width + 4 * scaled_width;
    return reader + palette + index + rows + sums + test::window_bytes + 2 * pool + tables;
}

uint64_t gif_limit(const Decode &decode, const uint8_t *bytes) {
    const uint64_t width = read_u16le(bytes + 6), height = read_u16le(bytes + 8);
    const std::vector<uint32_t> blocks = test::gif_still_blocks(static_cast<uint32_t>(width));
    const uint64_t still = std::accumulate(blocks.begin(), blocks.end(), uint64_t{0});
    const uint64_t wider_image = 65535 + 4104; // beside the block that it takes the place of
    const bool is_animated = std::string_view(decode.call->name).find("AGIF") != std::string_view::npos;
    return still + wider_image + (is_animated ? 4 * width * height + 2048 : 0);
}

} // namespace

uint64_t memory_limit(const Decode &decode, const Setting &setting, const Bytes &file, const ImageDecodeInfo &info) {
    switch (decode.input->format) {
    case Format::bmp: return bmp_limit(decode, setting, file.data());
    case Format::wbmp: return wbmp_limit(setting, file);
    case Format::png: return png_limit(decode, file.data(), info);
    default: return gif_limit(decode, file.data());
    }
}

} // namespace pelm::sweeps
