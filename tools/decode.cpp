#include "tools/decode.h"

#include <cerrno>
#include <new>

#include "tools/failure.h"
#include "tools/interrupt.h"

namespace pelm_tool {
namespace {

constexpr uint64_t largest_output = uint64_t{1} << 31; // bytes

int32_t tell_progress(void *user, const InputSource *source) {
    if (source != nullptr && source->size > 0) {
        static_cast<Progress *>(user)->at(static_cast<double>(source->consumed) / source->size);
    }
    return 0;
}

bool is_quarter_turn(const Options &options) {
    return options.rotation == PELM_ROTATE_90 || options.rotation == PELM_ROTATE_270;
}

Box box_for(const Options &options, const ImageDescription &image) {
    if (options.box) return *options.box;
    if (is_quarter_turn(options)) return {image.height, image.width};
    return {image.width, image.height};
}

std::string size_words(int64_t width, int64_t height) {
    return std::to_string(width) + "x" + std::to_string(height);
}

void refuse_huge(const Box &box, const PixelFormat &format) {
    const uint64_t bytes =
        static_cast<uint64_t>(box.width) * static_cast<uint64_t>(box.height) * static_cast<uint64_t>(format.bytes);
    if (static_cast<uint64_t>(box.width) * static_cast<uint64_t>(box.height) > largest_output ||
        bytes > largest_output) {
        throw Failure("an output of " + size_words(box.width, box.height) + " pixels is larger than 2 GiB");
    }
}

Picture blank_picture(const Options &options, int32_t width, int32_t height) {
    Picture picture{options.format, static_cast<size_t>(width), static_cast<size_t>(height), {}};
    try {
        picture.bytes.resize(picture.width * picture.height * options.format->bytes);
    } catch (const std::exception &) { // bad_alloc, or length_error where addresses have 32 bits
        throw Failure("not enough memory for an output of " + size_words(width, height) + " pixels");
    }
    if (options.background) {
        const uint32_t rgb = *options.background;
        fill(picture, {static_cast<uint8_t>(rgb >> 16), static_cast<uint8_t>(rgb >> 8 & 0xFF),
                       static_cast<uint8_t>(rgb & 0xFF), 255});
    }
    return picture;
}

// What to decode, and with what.
struct Decoding {
    Input &input;
    const ImageFormat &image;
    const Options &options;
    const Session &session;
    Box box;
};

std::string memory_failure(const Options &options) {
    if (options.max_memory == 0) return "not enough memory";
    return "the decoder needs more memory than --max-memory allows";
}

// The library also reports success when it had to leave rows out, so success is looked at as well.
void throw_if_failed(const Decoding &decoding, int32_t result) {
    decoding.session.throw_if_stopped();
    if (decoding.session.counters().failedAllocations > 0) throw Failure(memory_failure(decoding.options));
    const int read_error = PelmHost_ReadError(decoding.input.source());
    if (read_error != 0) throw system_failure("cannot read", read_error);
    if (result != PELM_RESULT_DONE) throw Failure("the decoder refuses it");
}

struct ScaledSize {
    int32_t width;
    int32_t height;
};

ScaledSize run(const Decoding &decoding, uint8_t *output) {
    ImageDecodeInfo info = {};
    info.input = decoding.input.source();
    info.outputFormat = decoding.options.format->code;
    info.flags = decoding.options.rotation | decoding.options.placement;
    const int32_t result = decoding.image.decode(&info, output, decoding.box.width, decoding.box.height);
    throw_if_failed(decoding, result);
    if (info.outputWidth <= 0 || info.outputHeight <= 0) {
        throw Failure("nothing is left of the image in a box of " +
                      size_words(decoding.box.width, decoding.box.height) + " pixels");
    }
    return {info.outputWidth, info.outputHeight};
}

// The buffer must have exactly the size that the library gives the image: a first run without output tells it.
Picture decode_exact(const Decoding &decoding) {
    const ScaledSize size = run(decoding, nullptr);
    Picture picture = blank_picture(decoding.options, size.width, size.height);
    run(decoding, picture.bytes.data());
    return picture;
}

Picture decode_into_box(const Decoding &decoding) {
    Picture picture = blank_picture(decoding.options, decoding.box.width, decoding.box.height);
    run(decoding, picture.bytes.data());
    return picture;
}

} // namespace

Session::Session(const Options &options, Progress &progress) : control_(PelmHost_NewControl()) {
    if (control_ == nullptr) throw std::bad_alloc();
    PelmHost_SetMemoryLimits(control_, options.max_memory, 0);
    PelmHost_SetDeadline(control_, options.deadline);
    PelmHost_SetProgress(control_, tell_progress, &progress);
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

Picture decode(Input &input, const ImageFormat &image, const ImageDescription &description, const Options &options,
               const Session &session) {
    if (!description.refusal.empty()) throw Failure(description.refusal);
    if (!writes(image, *options.format)) {
        throw Failure(std::string("the ") + image.name + " decoder does not write the format " + options.format->name);
    }
    const Decoding decoding{input, image, options, session, box_for(options, description)};
    refuse_huge(decoding.box, *options.format);
    return options.placement == PELM_PLACE_EXACT ? decode_exact(decoding) : decode_into_box(decoding);
}

} // namespace pelm_tool
