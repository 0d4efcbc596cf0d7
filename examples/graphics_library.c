/*
 * Decodes a BMP in two steps, as a graphics library does: the first one tells the size, then a divisor and a buffer are
 * chosen, and the second one decodes straight into that buffer. Writes a PPM.
 *
 *     graphics_library FILE.bmp MOST_WIDTH MOST_HEIGHT OUTPUT.ppm
 */
#include <stdlib.h>

#include "PelmHost.h"

enum { PIXEL_BYTES = 3, WIDEST = 1 << 20 };

static int32_t divided(int32_t size, int32_t divisor) {
    return size < divisor ? 1 : size / divisor;
}

/* The smallest power of two that brings the image below the limits. */
static int32_t divisor_for(const ImageDecodeInfo *info, int32_t most_width, int32_t most_height) {
    int32_t divisor = 1;
    while (divided(info->imageWidth, divisor) > most_width || divided(info->imageHeight, divisor) > most_height)
        divisor *= 2;
    return divisor;
}

/* A row buffer that the library owns from the second step on. No pixel has more than four bytes. */
static int give_staging(InputSource *source, const ImageDecodeInfo *info) {
    if (source->bufferSize < 4 * info->imageWidth) source->bufferSize = 4 * info->imageWidth;
    source->data = ZOTARPELM_OsMalloc((uint32_t)source->bufferSize);
    return source->data != NULL;
}

/* `info` holds the parked record. Returns what went wrong, or NULL. */
static const char *decode_parked(ImageDecodeInfo *info, uint8_t *pixels, int32_t width, int32_t height, FILE *file) {
    if (pixels == NULL || !give_staging(info->input, info)) {
        PELMI_BMP_DestroyBMP(info);
        return "no memory";
    }
    info->outputFormat = PELM_FORMAT_RGB888;
    if (ZOTARPELMI_DecodeBMPSKIA(info, pixels, width, height) != PELM_RESULT_DONE) {
        info->decoderState = NULL; /* it points at a record that is gone */
        return "not a BMP that is decoded, or no memory";
    }
    fprintf(file, "P6\n%d %d\n255\n", (int)width, (int)height);
    const size_t row_bytes = (size_t)width * PIXEL_BYTES;
    const size_t rows = (size_t)height;
    return fwrite(pixels, row_bytes, rows, file) == rows ? NULL : "the output could not be written";
}

static const char *decode_in_two_steps(InputSource *source, int32_t most_width, int32_t most_height, FILE *file) {
    ImageDecodeInfo info = {0};
    info.input = source;
    if (ZOTARPELMI_PreInitBMP(&info, 1) != PELM_RESULT_DONE) return "not a BMP";
    if (info.imageWidth <= 0 || info.imageWidth > WIDEST || info.imageHeight <= 0) {
        PELMI_BMP_DestroyBMP(&info);
        return "a size that cannot be shown";
    }

    const int32_t divisor = divisor_for(&info, most_width, most_height);
    const int32_t width = divided(info.imageWidth, divisor);
    const int32_t height = divided(info.imageHeight, divisor);
    uint8_t *const pixels = calloc((size_t)height, (size_t)width * PIXEL_BYTES);
    const char *const problem = decode_parked(&info, pixels, width, height, file);
    free(pixels);
    return problem;
}

int main(int count, char **arguments) {
    InputSource source;
    const char *problem = "usage: graphics_library FILE.bmp MOST_WIDTH MOST_HEIGHT OUTPUT.ppm";
    const int32_t most_width = count == 5 ? atoi(arguments[2]) : 0;
    const int32_t most_height = count == 5 ? atoi(arguments[3]) : 0;
    if (most_width > 0 && most_height > 0) {
        FILE *file = fopen(arguments[4], "wb");
        problem = "the input or the output cannot be had";
        if (file != NULL && PelmHost_OpenFile(&source, arguments[1], 0) == 0) {
            problem = decode_in_two_steps(&source, most_width, most_height, file);
            PelmHost_Close(&source);
        }
        if (file != NULL && fclose(file) != 0 && problem == NULL) problem = "the output could not be written";
    }
    if (problem != NULL) fprintf(stderr, "graphics_library: %s\n", problem);
    return problem != NULL;
}
