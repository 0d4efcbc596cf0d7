#include "tools/png_description.h"

#include <limits>

#include "tools/png_chunks.h"

namespace pelm_tool {
namespace {

constexpr uint32_t longest_palette = 768;

// Above it the decoder's rows and sums no longer fit their memory, and what it does depends on the output.
constexpr uint32_t longest_side = (1u << 30) - 1;

enum : uint32_t { grey = 0, rgb = 2, palette = 3, grey_alpha = 4, rgb_alpha = 6 };

// What the chunks so far have said. Later ones win.
struct PngFacts {
    bool has_header = false;
    uint32_t width = 0, height = 0;
    uint32_t depth = 0, colour_type = 0;
    uint32_t compression = 0, filter = 0, interlace = 0;
    bool has_palette = false; // read as one, that is, in a palette image
    uint32_t colours = 0;
    bool has_transparency = false;
    uint32_t alphas = 0; // of the palette
    uint32_t data_chunks = 0;
    uint32_t zlib_method = 0x08, zlib_flags = 0; // the first two bytes of the image data
    bool data_is_split = false;                  // by other chunks
    std::string last_type;
};

std::string counted(uint64_t count, const std::string &thing) {
    return std::to_string(count) + " " + thing + (count == 1 ? "" : "s");
}

std::string size_words(const PngFacts &facts) {
    return std::to_string(facts.width) + "x" + std::to_string(facts.height);
}

std::string depth_words(const PngFacts &facts) {
    return counted(facts.depth, "bit");
}

std::string colour_type_words(uint32_t type) {
    switch (type) {
    case grey: return "grey";
    case rgb: return "RGB";
    case palette: return "palette";
    case grey_alpha: return "grey with alpha";
    case rgb_alpha: return "RGB with alpha";
    default: return "colour type " + std::to_string(type);
    }
}

std::string colour_words(const PngFacts &facts) {
    return depth_words(facts) + (facts.colour_type == palette ? " per pixel" : " per sample");
}

std::string transparency_words(const PngFacts &facts) {
    if (facts.colour_type == palette) return "alpha for " + counted(facts.alphas, "colour");
    return facts.colour_type == grey ? "a transparent grey" : "a transparent colour";
}

std::string header_words(const PngFacts &facts) {
    if (!facts.has_header) return "PNG";
    return size_words(facts) + ", " + colour_type_words(facts.colour_type) + ", " + colour_words(facts) + ", PNG, " +
           (facts.interlace == 0 ? "not interlaced" : "interlaced");
}

std::string all_words(const PngFacts &facts) {
    std::string words = header_words(facts);
    if (facts.has_palette) words += ", " + counted(facts.colours, "colour");
    if (facts.has_transparency) words += ", " + transparency_words(facts);
    return words + ", " + counted(facts.data_chunks, "IDAT chunk");
}

bool depth_exists(const PngFacts &facts) {
    const uint32_t depth = facts.depth;
    const bool wide = depth == 8 || depth == 16;
    const bool narrow = depth == 1 || depth == 2 || depth == 4;
    switch (facts.colour_type) {
    case grey: return narrow || wide;
    case palette: return narrow || depth == 8;
    default: return wide;
    }
}

bool has_alpha_channel(const PngFacts &facts) {
    return facts.colour_type == grey_alpha || facts.colour_type == rgb_alpha;
}

// The chunks, each with the reason why it is refused; empty when it is not.

std::string take_header(PngFacts &facts, const PngChunk &chunk) {
    if (chunk.length != 13) return "an IHDR chunk of " + std::to_string(chunk.length) + " bytes instead of 13";
    facts.width = read_be32(chunk.data, 0);
    facts.height = read_be32(chunk.data, 4);
    facts.depth = chunk.data[8];
    facts.colour_type = chunk.data[9];
    facts.compression = chunk.data[10];
    facts.filter = chunk.data[11];
    facts.interlace = chunk.data[12];
    facts.has_header = true;
    if (facts.width == 0) return "a width of 0 pixels";
    if (facts.height == 0) return "a height of 0 pixels";
    if (facts.compression != 0) return "compression method " + std::to_string(facts.compression) + " does not exist";
    if (facts.filter != 0) return "filter method " + std::to_string(facts.filter) + " does not exist";
    if (facts.interlace > 1) return "interlace method " + std::to_string(facts.interlace) + " does not exist";
    if (facts.colour_type > rgb_alpha || facts.colour_type == 1 || facts.colour_type == 5)
        return colour_type_words(facts.colour_type) + " does not exist";
    if (!depth_exists(facts))
        return colour_type_words(facts.colour_type) + " of " + colour_words(facts) + " does not exist";
    return {};
}

std::string take_palette(PngFacts &facts, const PngChunk &chunk) {
    if (!facts.has_header) return shown_chunk(chunk) + " stands before the IHDR chunk";
    if (facts.colour_type != palette) return {}; // only a suggestion
    if (chunk.length % 3 != 0 || chunk.length > longest_palette)
        return "a PLTE chunk of " + std::to_string(chunk.length) + " bytes";
    facts.has_palette = true;
    facts.colours = chunk.length / 3;
    return {};
}

std::string take_transparency(PngFacts &facts, const PngChunk &chunk) {
    if (!facts.has_header) return shown_chunk(chunk) + " stands before the IHDR chunk";
    if (has_alpha_channel(facts)) return "a tRNS chunk in an image with an alpha channel";
    if (facts.colour_type == palette && !facts.has_palette) return shown_chunk(chunk) + " stands before the PLTE chunk";
    const uint32_t key_size = facts.colour_type == grey ? 2 : 6;
    if (facts.colour_type != palette && chunk.length != key_size)
        return "a tRNS chunk of " + std::to_string(chunk.length) + " bytes instead of " + std::to_string(key_size);
    facts.has_transparency = true;
    facts.alphas = chunk.length;
    return {};
}

void take_image_data(PngFacts &facts, const PngChunk &chunk) {
    if (chunk.length == 0) return; // ends the file
    if (facts.data_chunks == 0 && chunk.length >= 2) {
        facts.zlib_method = chunk.data[0];
        facts.zlib_flags = chunk.data[1];
    }
    if (facts.data_chunks > 0 && facts.last_type != "IDAT") facts.data_is_split = true;
    ++facts.data_chunks;
}

std::string take_chunk(PngFacts &facts, const PngChunk &chunk) {
    std::string why;
    if (chunk.type == "IHDR") why = take_header(facts, chunk);
    if (chunk.type == "PLTE") why = take_palette(facts, chunk);
    if (chunk.type == "tRNS") why = take_transparency(facts, chunk);
    if (chunk.type == "IDAT") take_image_data(facts, chunk);
    if (chunk.type == "IEND" && chunk.length != 0) why = "an IEND chunk with data";
    facts.last_type = chunk.type;
    return why;
}

// The first reason in the order in which the decoder looks. Any chunk without data ends the file.
std::string take_all(PngFacts &facts, PngChunks &chunks) {
    std::string why = chunks.read_signature();
    PngChunk chunk;
    do {
        if (why.empty()) why = chunks.read_next(chunk);
        if (why.empty()) why = take_chunk(facts, chunk);
    } while (why.empty() && chunk.length != 0);
    return why;
}

uint64_t row_bytes(const PngFacts &facts) {
    const uint32_t colours = facts.colour_type == rgb || facts.colour_type == rgb_alpha ? 3 : 1;
    const uint32_t channels = colours + (has_alpha_channel(facts) ? 1 : 0);
    return (uint64_t{facts.width} * channels * facts.depth + 7) / 8 + 1;
}

std::string why_size_is_refused(const PngFacts &facts) {
    const bool rows_fit = 2 * (row_bytes(facts) + facts.width) <= std::numeric_limits<uint32_t>::max();
    if (facts.width <= longest_side && facts.height <= longest_side && rows_fit) return {};
    return size_words(facts) + " pixels are too many";
}

std::string why_data_is_refused(const PngFacts &facts) {
    const uint32_t method = facts.zlib_method & 15;
    if (method != 8) return "image data compressed by method " + std::to_string(method) + " is not supported";
    if (facts.zlib_method >> 4 > 7) return "image data with a window above 32 KB is not supported";
    if ((facts.zlib_flags & 0x20) != 0) return "image data with a preset dictionary is not supported";
    return {};
}

std::string why_image_is_refused(const PngFacts &facts) {
    if (!facts.has_header) return "there is no IHDR chunk";
    if (facts.data_chunks == 0) return "there is no image data";
    const std::string why = why_size_is_refused(facts);
    return why.empty() ? why_data_is_refused(facts) : why;
}

// A pass has rows only where it has columns too.
int32_t rows_of_passes(const PngFacts &facts) {
    constexpr struct {
        uint32_t x_start, y_start, x_step, y_step;
    } passes[] = {{0, 0, 8, 8}, {4, 0, 8, 8}, {0, 4, 4, 8}, {2, 0, 4, 4}, {0, 2, 2, 4}, {1, 0, 2, 2}, {0, 1, 1, 2}};
    uint32_t rows = 0;
    for (const auto &pass : passes) {
        if (facts.width > pass.x_start && facts.height > pass.y_start)
            rows += (facts.height - pass.y_start - 1) / pass.y_step + 1;
    }
    return static_cast<int32_t>(rows);
}

std::vector<std::string> notes_on(const PngFacts &facts, const InputSource &source) {
    std::vector<std::string> notes;
    if (facts.last_type != "IEND")
        notes.push_back("the file is taken to end at an empty " + facts.last_type + " chunk");
    if (facts.colour_type == palette && !facts.has_palette)
        notes.push_back("there is no palette: every pixel is black");
    if (facts.data_is_split && source.kind != PELM_SOURCE_MEMORY)
        notes.push_back("chunks between the IDAT chunks are taken for image data; use --source memory");
    return notes;
}

} // namespace

bool begins_like_png(Bytes head) {
    return matching_signature_bytes(head) >= 4;
}

ImageDescription describe_png(InputSource &source) {
    ImageDescription description;
    PngFacts facts;
    PngChunks chunks(source);
    description.refusal = take_all(facts, chunks);
    const bool all_read = description.refusal.empty();
    description.words = all_read && facts.has_header ? all_words(facts) : header_words(facts);
    if (all_read) description.refusal = why_image_is_refused(facts);
    if (!description.refusal.empty()) return description;
    description.width = static_cast<int32_t>(facts.width);
    description.height = static_cast<int32_t>(facts.height);
    description.is_interlaced = facts.interlace != 0;
    description.stored_rows = description.is_interlaced ? rows_of_passes(facts) : description.height;
    description.is_grey_8 = facts.colour_type == grey && facts.depth == 8 && !description.is_interlaced;
    description.notes = notes_on(facts, source);
    return description;
}

} // namespace pelm_tool
