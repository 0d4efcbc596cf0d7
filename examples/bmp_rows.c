/*
 * Decodes a BMP a few rows at a time, reduced to fit a box, and writes it as a PPM: for displays and printers that take
 * rows, and where there is no room for a whole picture.
 *
 *     bmp_rows FILE.bmp WIDTH HEIGHT OUTPUT.ppm
 */
#include <stdlib.h>
#include <string.h>

#include "PelmHost.h"

enum { BAND_ROWS = 8, PIXEL_BYTES = 3 };

/* The picture's columns of each row; what lies beside them is not part of it. */
static int write_rows(FILE *file, const uint8_t *rows, int32_t count, int32_t row_pixels, int32_t width) {
    const int32_t margin = (row_pixels - width) / 2;
    for (int32_t y = 0; y < count; ++y) {
        const uint8_t *first = rows + ((size_t)y * (size_t)row_pixels + (size_t)margin) * PIXEL_BYTES;
        if (fwrite(first, PIXEL_BYTES, (size_t)width, file) != (size_t)width) return 0;
    }
    return 1;
}

/* `band` has BAND_ROWS rows of `box_width` pixels. Returns what went wrong, or NULL. */
static const char *decode_by_rows(InputSource *source, uint8_t *band, int32_t box_width, int32_t box_height,
                                  FILE *file) {
    ImageDecodeInfo info = {0};
    int32_t done = 0;
    info.input = source;
    info.outputFormat = PELM_FORMAT_RGB888;
    do {
        /* Rows that a truncated file lacks are black. */
        memset(band, 0, (size_t)box_width * BAND_ROWS * PIXEL_BYTES);
        const int32_t result = ZOTARPELMI_DecodeBMPLine(&info, band, box_width, box_height, BAND_ROWS);
        if (result == PELM_RESULT_FAILED) return "not a BMP that is decoded, or no memory";
        if (done == 0) fprintf(file, "P6\n%d %d\n255\n", (int)info.outputWidth, (int)info.outputHeight);

        /* The size is known from the first call on. The last band may be lower. */
        const int32_t left = info.outputHeight - done;
        const int32_t count = left < BAND_ROWS ? left : BAND_ROWS;
        const int written = write_rows(file, band, count, box_width, info.outputWidth);
        done += count;
        if (!written || result == PELM_RESULT_DATA_ENDED) {
            /* Finish the decode, so that it frees what it holds. */
            while (info.decoderState != NULL)
                ZOTARPELMI_DecodeBMPLine(&info, NULL, box_width, box_height, BAND_ROWS);
            return written ? "the file could not be read to its end" : "the output could not be written";
        }
    } while (info.decoderState != NULL);
    return NULL;
}

int main(int count, char **arguments) {
    InputSource source;
    const char *problem = "usage: bmp_rows FILE.bmp WIDTH HEIGHT OUTPUT.ppm";
    const int32_t box_width = count == 5 ? atoi(arguments[2]) : 0;
    const int32_t box_height = count == 5 ? atoi(arguments[3]) : 0;
    if (box_width > 0 && box_width <= 65536 && box_height > 0) {
        uint8_t *band = calloc((size_t)box_width * BAND_ROWS, PIXEL_BYTES);
        FILE *file = fopen(arguments[4], "wb");
        problem = "the input, the output or memory cannot be had";
        if (band != NULL && file != NULL && PelmHost_OpenFile(&source, arguments[1], 0) == 0) {
            problem = decode_by_rows(&source, band, box_width, box_height, file);
            PelmHost_Close(&source);
        }
        if (file != NULL && fclose(file) != 0 && problem == NULL) problem = "the output could not be written";
        free(band);
    }
    if (problem != NULL) fprintf(stderr, "bmp_rows: %s\n", problem);
    return problem != NULL;
}
