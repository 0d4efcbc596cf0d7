// A whole WBMP in one call: header, size and place, and one of the two ways to draw.
#include <algorithm>

#include "frame/memory.h"
#include "frame/sampling.h"
#include "frame/sizes.h"
#include "wbmp/draw.h"
#include "wbmp/placing.h"

namespace pelm {

int32_t wbmp_pixel_bytes(uint32_t format) {
    switch (format) {
    case PELM_FORMAT_RGB565: return 2;
    case PELM_FORMAT_RGB888: return 3;
    case PELM_FORMAT_RGBA8888:
    case PELM_FORMAT_BGRA8888: return 4;
    default: return 0;
    }
}

namespace {

// What a decode allocates beside the row buffer in the source's `data`. Zeroed at birth.
struct WbmpBlocks {
    uint8_t *header; // of a stream
    uint32_t *sums[2];
};

bool read_header(InputSource &input, WbmpBlocks &blocks, WbmpHeader &header) {
    if (input.size < 4) return false;
    switch (input.kind) {
    case PELM_SOURCE_MEMORY: return input.data != nullptr && parse_header(input.data, input.size, header);
    case PELM_SOURCE_STREAM: break;
    default: return false;
    }
    blocks.header = allocate_array<uint8_t>(wbmp_header_bytes);
    if (blocks.header == nullptr) return false;
    const int32_t delivered = ZOTARPELM_Read_IO(&input, blocks.header, wbmp_header_bytes);
    return parse_header(blocks.header, std::min(delivered, wbmp_header_bytes), header);
}

bool allocate_sums(WbmpBlocks &blocks, int32_t scaled_width) {
    for (uint32_t *&sums : blocks.sums) {
        sums = allocate_array<uint32_t>(static_cast<uint32_t>(scaled_width));
        if (sums == nullptr) return false;
        ZOTARPELM_OsMemset(sums, 0, static_cast<uint32_t>(scaled_width) * 4);
    }
    return true;
}

// Where nothing can be written the rows are passed over, as far as they are needed.
bool pass_over_rows(WbmpDrawing &drawing, bool one_to_one) {
    const int32_t height = drawing.image.height;
    const int32_t last = one_to_one ? height - 1
                                    : sampled_at(drawing.scaled.height - 1, quarter_points(height).second, height,
                                                 drawing.scaled.height);
    return read_row(drawing.rows, last) != nullptr;
}

bool draw(WbmpDrawing &drawing, bool one_to_one, Size box, void *output, const WbmpBlocks &blocks) {
    if (drawing.image.width == 0 || drawing.image.height == 0) return true; // nothing to stretch
    const int32_t pixel_bytes = wbmp_pixel_bytes(drawing.format);
    size_t bytes = 0;
    if (pixel_bytes == 0 || !buffer_bytes(box.width, box.height, pixel_bytes, bytes)) return false;
    if (output == nullptr) return pass_over_rows(drawing, one_to_one);
    drawing.output = {static_cast<uint8_t *>(output), bytes};
    drawing.position = first_pixel(box, drawing.scaled) * pixel_bytes;
    drawing.row_step = int64_t{box.width} * pixel_bytes;
    return one_to_one ? copy_rows(drawing) : reduce_rows(drawing, blocks.sums);
}

int32_t decode(ImageDecodeInfo &info, WbmpBlocks &blocks, void *output, Size box) {
    InputSource &input = *info.input;
    WbmpHeader header{};
    WbmpDrawing drawing{};
    if (!read_header(input, blocks, header) || !open_rows(drawing.rows, input, header)) return PELM_RESULT_FAILED;
    if (!rows_are_there(header, input.size)) return PELM_RESULT_FAILED;

    const WbmpScaling scaling = scale_wbmp({header.width, header.height}, box, info.flags);
    if (scaling.size.width <= 0 || scaling.size.height <= 0) return PELM_RESULT_DONE;
    drawing.image = {header.width, header.height};
    drawing.scaled = scaling.size;
    drawing.format = info.outputFormat;
    if (!allocate_sums(blocks, scaling.size.width)) return PELM_RESULT_FAILED;
    if (!draw(drawing, scaling.one_to_one, box, output, blocks)) return PELM_RESULT_FAILED;
    info.outputWidth = scaling.size.width;
    info.outputHeight = scaling.size.height;
    return PELM_RESULT_DONE;
}

} // namespace
} // namespace pelm

int32_t ZOTARPELMI_DecodeWBMP(ImageDecodeInfo *info, void *outBuffer, int32_t outWidth, int32_t outHeight) {
    if (info == nullptr || info->input == nullptr) return PELM_RESULT_FAILED;
    InputSource &input = *info->input;
    const bool is_stream = input.kind == PELM_SOURCE_STREAM;
    if (is_stream) input.data = nullptr; // the library's from here on, however the decode ends
    ZOTARPELM_Seek_IO(&input, 0, 0);

    pelm::WbmpBlocks blocks{};
    const int32_t result = pelm::decode(*info, blocks, outBuffer, {outWidth, outHeight});
    pelm::free_block(blocks.header);
    if (is_stream) pelm::free_block(input.data);
    for (uint32_t *&sums : blocks.sums)
        pelm::free_block(sums);
    return result;
}
