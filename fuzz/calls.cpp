// The lists of calls.
#include "fuzz/calls.h"

namespace pelm::fuzz {
namespace {

using Decode = int32_t (*)(ImageDecodeInfo *, void *, int32_t, int32_t);
using DecodeRows = int32_t (*)(ImageDecodeInfo *, void *, int32_t, int32_t, int32_t);
using End = int32_t (*)(ImageDecodeInfo *);

template <Decode decode>
int32_t in_box(ImageDecodeInfo *info, void *output, const Step &step) {
    return decode(info, output, step.width, step.height);
}

template <DecodeRows decode>
int32_t by_rows(ImageDecodeInfo *info, void *output, const Step &step) {
    return decode(info, output, step.width, step.height, step.rows);
}

template <End end>
int32_t ending(ImageDecodeInfo *info, void *, const Step &) {
    return end(info);
}

int32_t ask_for_alpha(ImageDecodeInfo *info, void *, const Step &) {
    return static_cast<int32_t>(PELMI_GetAlphaTrFlag(info));
}

constexpr uint32_t failed = 1u << PELM_RESULT_FAILED;
constexpr uint32_t done = 1u << PELM_RESULT_DONE;
constexpr uint32_t last_frame = 1u << PELM_RESULT_LAST_FRAME;
constexpr uint32_t more = 1u << PELM_RESULT_MORE;
constexpr uint32_t data_ended = 1u << PELM_RESULT_DATA_ENDED;

int32_t pre_init(ImageDecodeInfo *info, void *, const Step &step) {
    return ZOTARPELMI_PreInitBMP(info, step.rows);
}

// Words of the request, told again.
int32_t ask_for_words(ImageDecodeInfo *info, void *, const Step &) {
    const ImageDecodeInfo words = info != nullptr ? *info : ImageDecodeInfo{};
    const bool right = ZOTARPELMI_GetAGIFDelayTime(info) == words.frameDelay &&
                       ZOTARPELMI_GetAGIFColorTableState(info) == words.colorTableState &&
                       ZOTARPELMI_GetAGIFGlobalColorTable(info) == words.globalColorTable &&
                       ZOTARPELMI_GetAGIFLocalColorTable(info) == words.localColorTable;
    return info != nullptr && right ? 1 : info == nullptr && right ? 0 : -1;
}

int32_t make_transparency_record(ImageDecodeInfo *, void *, const Step &step) {
    PngTrInfo *const record = step.null_request ? nullptr : PELMI_FastImgCreatePngTrInfo();
    if (record == nullptr) return 0;
    if (step.rows % 2 != 0) {
        record->block = ZOTARPELM_OsMalloc(16);
        record->ownsBlock = 1;
    }
    return PELMI_FastImgDestroyPngTrInfo(record);
}

constexpr Call bmp_calls[] = {
    {"DecodeBMP", in_box<ZOTARPELMI_DecodeBMP>, Output::box, Progress::needs_idle, State::none, Leaks::refused_bmp, 0,
     failed | done},
    {"DecodeBMPIter", in_box<ZOTARPELMI_DecodeBMPIter>, Output::kept, Progress::steps, State::bmp_bands,
     Leaks::refused_bmp, failed | more, done, 100},
    {"DecodeBMPIterLine", by_rows<ZOTARPELMI_DecodeBMPIterLine>, Output::kept, Progress::steps, State::bmp_bands,
     Leaks::refused_bmp, failed | done, done},
    {"DecodeBMPLine", by_rows<ZOTARPELMI_DecodeBMPLine>, Output::own_rows, Progress::steps, State::bmp_bands,
     Leaks::refused_bmp, done | data_ended, failed | done | data_ended},
    {"PreInitBMP", pre_init, Output::none, Progress::parks, State::bmp_parked, Leaks::unsigned_bmp, done, failed},
    {"DecodeBMPSKIA", in_box<ZOTARPELMI_DecodeBMPSKIA>, Output::box, Progress::resumes, State::bmp_parked,
     Leaks::nothing, 0, failed | done},
    {"AbortBMPIter", ending<ZOTARPELMI_AbortBMPIter>, Output::none, Progress::gives_up, State::none, Leaks::all, 0,
     failed | done},
    {"DestroyBMP", ending<PELMI_BMP_DestroyBMP>, Output::none, Progress::gives_up_any, State::none,
     Leaks::all_but_palette, 0, failed | done},
};

constexpr Call wbmp_calls[] = {
    {"DecodeWBMP", in_box<ZOTARPELMI_DecodeWBMP>, Output::box, Progress::whole, State::none, Leaks::nothing, 0,
     failed | done},
};

constexpr Call png_calls[] = {
    {"DecodePNG", in_box<ZOTARPELMI_DecodePNG>, Output::box, Progress::steps, State::png, Leaks::nothing, 0,
     failed | done},
    {"DecodePNGIter", in_box<ZOTARPELMI_DecodePNGIter>, Output::box, Progress::steps, State::png, Leaks::nothing, more,
     failed | done},
    {"DecodePNGLine", by_rows<ZOTARPELMI_DecodePNGLine>, Output::box, Progress::steps, State::png, Leaks::nothing, more,
     failed | done},
    {"DestroyPNGInfo", ending<ZOTARPELMI_DestroyPNGInfo>, Output::none, Progress::gives_up, State::none, Leaks::nothing,
     0, failed | done},
    {"AbortPNGIter", ending<ZOTARPELMI_AbortPNGIter>, Output::none, Progress::gives_up, State::none, Leaks::nothing, 0,
     failed | done},
    {"GetAlphaTrFlag", ask_for_alpha, Output::none, Progress::apart, State::none, Leaks::read_buffer, 0, failed | done},
    {"CreatePngTrInfo", make_transparency_record, Output::none, Progress::apart, State::none, Leaks::nothing, 0,
     failed | done},
};

constexpr Call gif_calls[] = {
    {"DecodeGIF", in_box<ZOTARPELMI_DecodeGIF>, Output::box, Progress::whole, State::none, Leaks::broken_gif, 0,
     failed | done},
    {"DecodeGIFIter", in_box<ZOTARPELMI_DecodeGIFIter>, Output::kept, Progress::steps, State::gif_slices,
     Leaks::broken_gif, more, failed | done},
    {"DecodeGIFLine", by_rows<ZOTARPELMI_DecodeGIFLine>, Output::rows, Progress::steps, State::gif_lines,
     Leaks::nothing, done, failed | done},
    {"DecodeAGIF", in_box<ZOTARPELMI_DecodeAGIF>, Output::kept, Progress::steps, State::frames, Leaks::nothing, done,
     failed | last_frame},
    {"DecodeAGIFIter", in_box<ZOTARPELMI_DecodeAGIFIter>, Output::kept, Progress::steps, State::frame_slices,
     Leaks::nothing, done | more, failed | last_frame},
    {"AbortGIFIter", ending<ZOTARPELMI_AbortGIFIter>, Output::none, Progress::gives_up, State::none, Leaks::nothing, 0,
     failed | done},
    {"AborAGIF", ending<ZOTARPELMI_AborAGIF>, Output::none, Progress::gives_up, State::none, Leaks::nothing, 0,
     failed | done},
    {"the words of animations", ask_for_words, Output::none, Progress::apart, State::none, Leaks::nothing, 0,
     failed | done},
};

size_t bytes_in_gif_formats(uint32_t output_format) {
    switch (output_format) {
    case PELM_FORMAT_RGB565:
    case PELM_FORMAT_BGR565: return 2;
    case PELM_FORMAT_RGB888:
    case PELM_FORMAT_BGR888: return 3;
    case PELM_FORMAT_ARGB8888:
    case PELM_FORMAT_RGBA8888:
    case PELM_FORMAT_BGRA8888:
    case PELM_FORMAT_BGRX8888: return 4;
    default: return 0;
    }
}

size_t bytes_in_wbmp_formats(uint32_t output_format) {
    switch (output_format) {
    case PELM_FORMAT_RGB565: return 2;
    case PELM_FORMAT_RGB888: return 3;
    case PELM_FORMAT_RGBA8888:
    case PELM_FORMAT_BGRA8888: return 4;
    default: return 0;
    }
}

size_t bytes_in_full_colour_formats(uint32_t output_format) {
    switch (output_format) {
    case PELM_FORMAT_RGB565: return 2;
    case PELM_FORMAT_RGB888:
    case PELM_FORMAT_RGB565_A8: return 3;
    case PELM_FORMAT_ARGB8888:
    case PELM_FORMAT_RGBA8888:
    case PELM_FORMAT_BGRA8888: return 4;
    default: return 0;
    }
}

} // namespace

std::span<const Call> calls_of(Format format) {
    switch (format) {
    case Format::bmp: return bmp_calls;
    case Format::wbmp: return wbmp_calls;
    case Format::png: return png_calls;
    default: return gif_calls;
    }
}

std::span<const Call> decoding_calls(Format format) {
    switch (format) {
    case Format::bmp: return std::span(bmp_calls).first(5);
    case Format::wbmp: return wbmp_calls;
    case Format::png: return std::span(png_calls).first(3);
    case Format::gif: return std::span(gif_calls).first(3);
    default: return std::span(gif_calls).subspan(3, 2);
    }
}

const Call &resuming_call() {
    return bmp_calls[5];
}

void give_up(Format format, ImageDecodeInfo &info) {
    switch (format) {
    case Format::bmp: PELMI_BMP_DestroyBMP(&info); return;
    case Format::wbmp: return;
    case Format::png: ZOTARPELMI_DestroyPNGInfo(&info); return;
    default: ZOTARPELMI_AborAGIF(&info); return;
    }
}

size_t bytes_per_output_pixel(Format format, uint32_t output_format) {
    switch (format) {
    case Format::bmp:
    case Format::png: return bytes_in_full_colour_formats(output_format);
    case Format::wbmp: return bytes_in_wbmp_formats(output_format);
    default: return bytes_in_gif_formats(output_format);
    }
}

bool knows_exact_buffers(Format format) {
    return format != Format::wbmp;
}

} // namespace pelm::fuzz
