#include "tools/decode.h"

#include <cerrno>
#include <new>

#include "tools/blank_picture.h"
#include "tools/failure.h"
#include "tools/interrupt.h"
#include "tools/png_decode.h"

namespace pelm_tool {
namespace {

// What to decode, and with what.
struct Decoding {
    Input &input;
    const ImageFormat &image;
    const ImageDescription &description;
    const Options &options;
    Session &session;
    Box box;
};

bool keeps_its_size(const Decoding &decoding) {
    return pelm_tool::keeps_its_size(decoding.description, decoding.box,
                                     decoding.options.rotation | decoding.options.placement);
}

// A reduced interlaced image looks better through the frame buffer.
uint32_t flags_of(const Decoding &decoding) {
    const uint32_t flags = decoding.options.rotation | decoding.options.placement;
    const bool framed =
        decoding.options.frame_buffer || (decoding.description.is_interlaced && !keeps_its_size(decoding));
    return framed ? flags | PELM_INTERLACE_FRAME : flags;
}

std::string rows_of_all(const Decoding &decoding, int64_t rows) {
    return std::to_string(rows) + " of " + std::to_string(decoding.description.stored_rows) + " rows";
}

// Whether the decoder takes the same bytes from memory.
bool is_decoded_from_memory(const Decoding &decoding) {
    std::vector<uint8_t> bytes = decoding.input.all_bytes();
    InputSource source = {};
    if (PelmHost_OpenMemory(&source, PELM_SOURCE_MEMORY, bytes.data(), static_cast<int32_t>(bytes.size())) != 0)
        return false;
    ImageDecodeInfo info = {};
    info.input = &source;
    DecodeJob job{info, decoding.description, decoding.box, {}, nullptr, decoding.session.polls()};
    const bool decoded = decoding.image.decode(job) == PELM_RESULT_DONE;
    PelmHost_Close(&source);
    return decoded;
}

// Why a file is refused that looks sound from the outside.
Failure refusal_of(const Decoding &decoding, const DecodeJob &job, int32_t result) {
    if (result == PELM_RESULT_DATA_ENDED) return Failure("the input has become shorter while it was read");
    if (!decoding.image.polls_rows) return Failure("the decoder refuses it");
    const bool is_stream = decoding.input.source()->kind != PELM_SOURCE_MEMORY;
    if (is_stream && is_decoded_from_memory(decoding))
        return Failure("the decoder cannot read it from a file or pipe (a chunk begins across its buffer); use "
                       "--source memory");
    return Failure("the image data is damaged or cut short after " + rows_of_all(decoding, job.complete_rows));
}

// The library also reports success when it had to leave rows out, so success is looked at as well.
void throw_if_failed(const Decoding &decoding, const DecodeJob &job, int32_t result) {
    decoding.session.throw_if_stopped();
    decoding.session.throw_if_out_of_memory();
    decoding.input.throw_if_unreadable();
    if (result != PELM_RESULT_DONE) throw refusal_of(decoding, job, result);
}

struct RunResult {
    int32_t width; // after scaling
    int32_t height;
    int64_t complete_rows;
};

RunResult run(const Decoding &decoding, Picture *picture) {
    ImageDecodeInfo info = {};
    info.input = decoding.input.source();
    info.outputFormat = decoding.options.format->code;
    info.flags = flags_of(decoding);
    DecodeJob job{info, decoding.description, decoding.box, decoding.options.mode, picture, decoding.session.polls()};
    const int32_t result = decoding.image.decode(job);
    throw_if_failed(decoding, job, result);
    if (info.outputWidth <= 0 || info.outputHeight <= 0) {
        throw Failure("nothing is left of the image in a box of " +
                      size_words(decoding.box.width, decoding.box.height) + " pixels");
    }
    return {info.outputWidth, info.outputHeight, job.complete_rows};
}

std::string shortage_after(const Decoding &decoding, const RunResult &result) {
    const bool is_whole = !decoding.image.polls_rows || result.complete_rows >= decoding.description.stored_rows;
    if (is_whole) return decoding.description.shortage;
    return "the image data breaks off after " + rows_of_all(decoding, result.complete_rows);
}

// The buffer must have exactly the size that the library gives the image: a first run without output tells it.
Picture blank_picture_for(const Decoding &decoding) {
    if (decoding.options.placement != PELM_PLACE_EXACT)
        return blank_picture(decoding.options, decoding.box.width, decoding.box.height);
    const RunResult first = run(decoding, nullptr);
    return blank_picture(decoding.options, first.width, first.height);
}

// What the decoder does to this kind of image with these options.
std::vector<std::string> notes_on(const Decoding &decoding) {
    std::vector<std::string> notes = decoding.description.notes;
    if (decoding.image.black_is_clear && decoding.options.format->has_alpha && keeps_its_size(decoding))
        notes.push_back("the decoder writes black as transparent; use --format rgb");
    if (decoding.image.notes != nullptr) {
        const auto more = decoding.image.notes(decoding.options, decoding.description, decoding.box);
        notes.insert(notes.end(), more.begin(), more.end());
    }
    if (!decoding.image.turns_only_reduced) return notes;
    const bool keeps_size = keeps_its_size(decoding);
    const bool is_grey_8 = decoding.description.is_grey_8;
    if (decoding.options.rotation != PELM_ROTATE_0 && (keeps_size || is_grey_8))
        notes.push_back(std::string("the decoder does not turn a PNG ") +
                        (is_grey_8 ? "with 8 bits of grey" : "at its own size"));
    if (!keeps_size && is_grey_8)
        notes.push_back("the decoder fills only a part of the place of a reduced PNG with 8 bits of grey");
    return notes;
}

} // namespace

int32_t Session::on_progress(void *session, const InputSource *source) {
    Session &self = *static_cast<Session *>(session);
    const bool is_poll = source == nullptr;
    if (is_poll) ++self.polls_;
    if (self.frames_shown_ > 0) return 0;
    if (self.rows_shown_ > 0) {
        self.progress_.at(static_cast<double>(self.polls_) / self.rows_shown_);
    } else if (!is_poll && source->size > 0) {
        self.progress_.at(static_cast<double>(source->consumed) / source->size);
    }
    return 0;
}

void Session::frames_done(size_t count) {
    progress_.at(static_cast<double>(count) / static_cast<double>(frames_shown_));
}

Session::Session(const Options &options, Progress &progress)
    : control_(PelmHost_NewControl()), progress_(progress), has_memory_limit_(options.max_memory != 0) {
    if (control_ == nullptr) throw std::bad_alloc();
    PelmHost_SetMemoryLimits(control_, options.max_memory, 0);
    PelmHost_SetDeadline(control_, options.deadline);
    PelmHost_SetProgress(control_, on_progress, this);
    PelmHost_UseForProcess(control_);
    cancel_on_interrupt(control_);
}

Session::~Session() {
    cancel_on_interrupt(nullptr);
    PelmHost_UseForProcess(nullptr);
    PelmHost_ReleaseControl(control_);
}

PelmHostCounters Session::counters() const {
    PelmHostCounters counters;
    PelmHost_GetCounters(control_, &counters);
    return counters;
}

void Session::throw_if_stopped() const {
    throw_if_interrupted();
    if (PelmHost_StopReason(control_) == ETIMEDOUT) throw Failure("not done before the deadline");
}

void Session::throw_if_out_of_memory() const {
    if (counters().failedAllocations == 0) return;
    throw Failure(has_memory_limit_ ? "the decoder needs more memory than --max-memory allows" : "not enough memory");
}

Decoded decode(Input &input, const ImageFormat &image, const ImageDescription &description, const Options &options,
               Session &session) {
    if (!description.refusal.empty()) throw Failure(description.refusal);
    if (!writes(image, *options.format)) {
        throw Failure(std::string("the ") + image.name + " decoder does not write the format " + options.format->name);
    }
    if (image.never_turns && options.rotation != PELM_ROTATE_0)
        throw Failure(std::string("the ") + image.name + " decoder does not turn images");
    const Decoding decoding{input, image, description, options, session, box_for(options, description)};
    refuse_huge(decoding.box, *options.format);
    if (image.polls_rows) session.show_rows(description.height);
    Picture picture = blank_picture_for(decoding);
    const RunResult result = run(decoding, &picture);
    return {std::move(picture), {shortage_after(decoding, result), notes_on(decoding)}};
}

} // namespace pelm_tool
