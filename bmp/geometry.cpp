#include "bmp/geometry.h"

#include <cstdlib>

#include "frame/formats.h"
#include "frame/scaling.h"
#include "frame/sizes.h"

namespace pelm {
namespace {

// The first pixel and the steps from there, in the record's units. False when they do not fit it.
bool place_in_output(BmpState &state, Size buffer, Size scaled) {
    BytePlacement placement{};
    if (!place_bytes(state.rotation, buffer, scaled, bytes_per_pixel(state.outputFormat), placement)) return false;
    state.outputCursor = placement.first;
    state.rowStep = placement.row_step * (state.topDown != 0 ? -1 : 1);
    state.pixelStep = placement.pixel_step / pixel_step_unit(state.outputFormat);
    return true;
}

} // namespace

SetUp set_geometry(BmpState &state, ImageDecodeInfo &info, const Target &target) {
    const uint32_t mode = placement_mode(target.flags);
    const Size box = target.box;
    state.rotation = rotation_of(target.flags);
    state.requestedWidth = box.width;
    info.decodeStarted = 1;

    const Size box_for_image = turns_sideways(state.rotation) ? Size{box.height, box.width} : box;
    const Size image = {state.width, state.height};
    Scaling scaling = {box_for_image.width, box_for_image.height, false};
    if (mode != PELM_PLACE_STRETCH) {
        if (image.height == 0 && (box_for_image.width < image.width || box_for_image.height < 0)) return SetUp::refused;
        scaling = scale_to_fit(image, box_for_image);
    }
    Size scaled{};
    if (!scaling.narrow_to(scaled)) return SetUp::refused;
    state.scaledWidth = scaled.width;
    state.scaledHeight = scaled.height;
    state.oneToOne = scaling.one_to_one ? 1 : 0;

    // Required: an exact buffer has the unturned sides of the scaled image, also when it is turned (docs/oddities.md,
    // "Exact placement of turned images").
    const Size buffer = mode == PELM_PLACE_EXACT ? scaled : box;
    state.outputFormat = info.outputFormat;
    size_t bytes = 0;
    const bool fits = buffer_bytes(buffer.width, buffer.height, bytes_per_pixel(state.outputFormat), bytes);
    if (fits && (bytes == 0 || scaled.width <= 0 || scaled.height <= 0)) return SetUp::done; // nothing will be written
    if (!fits || !place_in_output(state, buffer, scaled))
        return target.output == nullptr ? SetUp::done : SetUp::refused; // a buffer that is not there need not fit
    state.output.buffer = {static_cast<uint8_t *>(target.output), target.output == nullptr ? 0 : bytes};
    return SetUp::done;
}

// Required: by the rows of this call, whatever the last one's were (docs/oddities.md, "Bands of changing height").
void advance_cursor(BmpState &state, int32_t rows) {
    const int64_t row_step = state.topDown != 0 ? -int64_t{state.rowStep} : state.rowStep;
    const int64_t cursor = band_cursor(state, state.outputCursor) + row_step * rows;
    if (std::abs(cursor) > farthest_clipped) {
        state.output.buffer.size = 0;
        return;
    }
    state.outputCursor = static_cast<intptr_t>(cursor);
    state.output.cursorCarry = cursor - state.outputCursor;
}

int64_t band_cursor(const BmpState &state, intptr_t cursor) {
    return state.output.cursorCarry + cursor;
}

} // namespace pelm
