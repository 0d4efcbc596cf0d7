#include "tools/bmp_description.h"

#include "PelmImageDecoder.h"
#include "tools/blank_picture.h"
#include "tools/bmp_refusal.h"

namespace pelm_tool {
namespace {

bool is_sequential(const FileFacts &file) {
    return file.source_kind == PELM_SOURCE_SEQUENTIAL;
}

std::string variant_words(const BmpHeader &header) {
    return size_words(header.width, header.height) + ", " + bmp_depth_words(header) + ", BMP with a " +
           std::to_string(header.header_size) + "-byte header, " + (header.top_down ? "top-down, " : "bottom-up, ") +
           bmp_compression_words(header);
}

// Of the rows of run-length codes the header tells nothing.
std::string shortage_of(const BmpHeader &header, const FileFacts &file) {
    if (has_run_length_codes(header)) return {};
    const int64_t rows = whole_rows(header, file, is_sequential(file) ? header.bytes_before : header.pixel_offset);
    if (rows >= header.height) return {};
    return "the file ends after " + std::to_string(rows) + " of " + std::to_string(header.height) + " rows";
}

std::vector<std::string> notes_on_two_steps(const BmpHeader &header, const FileFacts &file) {
    std::vector<std::string> notes;
    if (file.size < bmp_headers_size)
        notes.push_back("the file ends inside the header, and what is missing of it counts as 0");
    if (header.header_size < plain_header_size) {
        notes.push_back("the header of " + std::to_string(header.header_size) +
                        " bytes is read as one of 40 bytes, so size and depth are wrong");
    }
    if (has_palette(header) && palette_entries(header) == 0)
        notes.push_back("there is no room for a palette in front of the pixels, so all of them are black");
    if (states_run_length_codes(header) && !has_run_length_codes(header)) {
        notes.push_back(bmp_compression_words(header) + " at " + bmp_depth_words(header) +
                        " is taken for uncompressed rows");
    }
    return notes;
}

std::vector<std::string> notes_on(const BmpHeader &header, const FileFacts &file) {
    std::vector<std::string> notes;
    if (header.is_two_step) notes = notes_on_two_steps(header, file);
    if (header.header_size != plain_header_size && has_palette(header)) {
        notes.push_back("the palette behind a " + std::to_string(header.header_size) +
                        "-byte header is read from the wrong place");
    }
    if (is_sequential(file) && header.pixel_offset != header.bytes_before) {
        notes.push_back("from a pipe the rows are read at byte " + std::to_string(header.bytes_before) +
                        " instead of " + std::to_string(header.pixel_offset) + "; use --source memory");
    }
    if (is_sequential(file) && header.top_down) {
        notes.push_back("from a pipe the rows of a top-down file are written upwards; use --source memory");
    }
    return notes;
}

std::string divided_words(const ImageDescription &image, int32_t divisor) {
    const Box size = divided(image, divisor);
    return "divided by " + std::to_string(divisor) + ": " + size_words(size.width, size.height);
}

} // namespace

ImageDescription describe_bmp(Bytes head, const FileFacts &file, Mode mode) {
    ImageDescription description;
    const bool is_two_step = mode.calls == Calls::in_two_steps;
    if (static_cast<int64_t>(head.size()) < bmp_headers_size && !is_two_step) {
        description.words = "BMP";
        description.refusal = "the file ends inside the header (" + std::to_string(head.size()) + " bytes of 54)";
        return description;
    }
    const BmpHeader header = parse_bmp(head, mode.calls);
    description.words = variant_words(header);
    description.refusal = why_bmp_is_refused(header, file);
    if (!description.refusal.empty()) {
        const bool helps =
            may_fit_two_steps(header) && why_bmp_is_refused(parse_bmp(head, Calls::in_two_steps), file).empty();
        if (helps) description.refusal += "; use --mode skia";
        return description;
    }
    description.width = static_cast<int32_t>(header.width);
    description.height = static_cast<int32_t>(header.height);
    description.row_bytes = static_cast<int32_t>(stride_of(header));
    description.shortage = shortage_of(header, file);
    description.notes = notes_on(header, file);
    if (has_run_length_codes(header)) description.run_length_bits = header.bits;
    if (mode.divisor > 1) description.details.push_back(divided_words(description, mode.divisor));
    return description;
}

} // namespace pelm_tool
