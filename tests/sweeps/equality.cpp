#include "tests/sweeps/equality.h"

#include <algorithm>
#include <iterator>

namespace pelm::sweeps {
namespace {

using fuzz::Call;
using fuzz::Format;

constexpr uint32_t memory_and_streams[] = {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT,
                                           PELM_SOURCE_SEQUENTIAL};

bool is_call(const OtherWay &way, const char *name) {
    return std::string(name) == way.call->name;
}

int32_t little_i32(const Bytes &bytes, size_t at) {
    uint32_t value = 0;
    for (size_t i = 4; i-- > 0;)
        value = value << 8 | bytes[at + i];
    return static_cast<int32_t>(value);
}

bool takes_rows(const Call &call) {
    return std::string(call.name).ends_with("Line");
}

bool is_turned(const Setting &setting) {
    return setting.rotation != PELM_ROTATE_0;
}

bool is_grey_of_8_bits(const Input &png) {
    return png.bytes[24] == 8 && png.bytes[25] == 0;
}

bool is_interlaced_png(const Input &png) {
    return png.bytes[28] == 1;
}

bool may_blend(const Input &png) {
    constexpr uint8_t with_alpha = 4; // of the colour type
    constexpr uint8_t transparency[] = {'t', 'R', 'N', 'S'};
    const bool has_transparency = std::search(png.bytes.begin(), png.bytes.end(), std::begin(transparency),
                                              std::end(transparency)) != png.bytes.end();
    return (png.bytes[25] & with_alpha) != 0 || has_transparency;
}

bool is_own_size(const Input &input, const Setting &setting, const Reply &scaled) {
    return scaled.width == input.width && scaled.height == input.height && setting.placement != PELM_PLACE_STRETCH;
}

bool is_larger(const Input &input, const Reply &scaled) {
    return scaled.width > input.width || scaled.height > input.height;
}

std::string bmp_exception(const OtherWay &way, const Input &input, const Setting &setting) {
    constexpr size_t header_size = 14, height = 22;
    const bool is_core = input.bytes[header_size] == 12;
    if (way.kind == PELM_SOURCE_SEQUENTIAL && is_core) return "Sequential sources";
    if (way.kind == PELM_SOURCE_SEQUENTIAL && little_i32(input.bytes, height) < 0)
        return "Top-down files on sequential sources";
    if (is_call(way, "PreInitBMP")) return is_core ? "Headers in two steps" : "";
    if (is_call(way, "DecodeBMP")) return "";
    if (way.kind == PELM_SOURCE_SEQUENTIAL) return "Bands of sequential sources";
    const bool is_turned_exactly = is_turned(setting) && setting.placement == PELM_PLACE_EXACT;
    if (!is_call(way, "DecodeBMPLine")) return is_turned_exactly ? "Exact placement of turned images" : "";
    return is_turned(setting) || setting.placement == PELM_PLACE_EXACT ? "Bands by the line call" : "";
}

std::string png_exception(const OtherWay &way, const Input &input, const Setting &setting, const Reply &scaled) {
    if (is_call(way, "DecodePNG")) return "";
    const bool is_reduced = !is_own_size(input, setting, scaled);
    if (is_call(way, "DecodePNGIter")) {
        const bool has_blocks = input.name == "png_many_blocks" || input.name.starts_with("sunset");
        if (!has_blocks || !is_reduced || scaled.height == 0) return "";
        if (is_grey_of_8_bits(input)) return "Reduced grey images of 8 bits";
        // Two rows come with the first block, and none of the output may be complete then.
        const bool is_too_short = input.height < 50 && 3 * input.height / (4 * scaled.height) + 1 > 2;
        return is_too_short ? "Iterative PNG decodes that start over" : "";
    }
    if (is_interlaced_png(input)) return "Interlaced images";
    if (!is_reduced) return "";
    if (is_grey_of_8_bits(input)) return "Reduced grey images of 8 bits";
    if (is_turned(setting) || is_larger(input, scaled)) return "Line calls";
    // A band blends over the band before it, in the one buffer that they have here.
    return setting.format <= PELM_FORMAT_RGB888 && may_blend(input) ? "Transparency in formats without alpha" : "";
}

std::string gif_exception(const OtherWay &way, const Input &input, const Setting &setting) {
    if (input.name == "gif_empty") return "No image";
    if (!is_call(way, "DecodeGIFLine")) return "";
    const bool is_interlaced = input.name.find("interlaced") != std::string::npos;
    if (is_interlaced || is_turned(setting) || setting.placement == PELM_PLACE_EXACT) return "Line calls";
    const bool fills_the_screen =
        input.name == "gif_whole" || input.name == "gif_frames" || !input.name.starts_with("g");
    return fills_the_screen ? "" : "Still images fill the screen";
}

} // namespace

std::vector<OtherWay> other_ways(const Input &input, Format calls, bool thoroughly) {
    std::vector<OtherWay> ways;
    bool is_first = true;
    for (const Call &call : fuzz::decoding_calls(calls)) {
        for (const uint32_t kind : memory_and_streams) {
            const bool is_taken = calls != Format::wbmp || kind <= PELM_SOURCE_MEMORY;
            const bool is_the_measure = is_first && kind == PELM_SOURCE_MEMORY;
            if (!is_taken || is_the_measure) continue;
            if (!takes_rows(call)) {
                ways.push_back({&call, kind, 1});
                continue;
            }
            const int32_t most = thoroughly ? input.height + 1 : 3;
            for (int32_t i = 1; i <= most; ++i)
                ways.push_back({&call, kind, thoroughly ? i : i * i * input.height / 9 + 1});
        }
        is_first = false;
    }
    return ways;
}

bool gives_bands(const OtherWay &way, const Input &input, const Setting &setting, const Reply &scaled) {
    if (is_call(way, "DecodePNGLine")) return !is_own_size(input, setting, scaled);
    return is_call(way, "DecodeBMPLine") || is_call(way, "DecodeGIFLine");
}

std::string exception_of(const OtherWay &way, const Input &input, const Setting &setting, const Reply &scaled) {
    switch (input.format) {
    case Format::bmp: return bmp_exception(way, input, setting);
    case Format::wbmp: return "";
    case Format::png: return png_exception(way, input, setting, scaled);
    default: return gif_exception(way, input, setting);
    }
}

} // namespace pelm::sweeps
