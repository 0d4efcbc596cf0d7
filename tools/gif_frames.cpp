#include "tools/gif_frames.h"

#include "tools/blank_picture.h"
#include "tools/failure.h"
#include "tools/gif_decode.h"
#include "tools/gif_description.h"

namespace pelm_tool {
namespace {

// The request, whose state and colour tables go away with it.
class Player {
public:
    Player(InputSource *source, const Options &options, Box box) : box_(box), calls_(options.mode.calls) {
        info_.input = source;
        info_.outputFormat = options.format->code;
        info_.flags = options.rotation | options.placement;
    }
    ~Player() { PelmAnimation_Restart(&info_, ZOTARPELMI_AborAGIF); }
    Player(const Player &) = delete;
    Player &operator=(const Player &) = delete;

    Picture blank_picture_for(const Options &options);
    int32_t next_frame(Picture &picture); // PELM_RESULT_

private:
    ImageDecodeInfo info_ = {};
    Box box_;
    Calls calls_;
};

// An exact buffer is as large as the decoder makes the frames.
Picture Player::blank_picture_for(const Options &options) {
    if (options.placement != PELM_PLACE_EXACT) return blank_picture(options, box_.width, box_.height);
    if (measure_gif(info_, box_) != PELM_RESULT_DONE || info_.outputWidth <= 0 || info_.outputHeight <= 0)
        throw Failure("the decoder refuses it");
    return blank_picture(options, info_.outputWidth, info_.outputHeight);
}

int32_t Player::next_frame(Picture &picture) {
    uint8_t *const to = picture.bytes.data();
    if (calls_ == Calls::one_shot) return ZOTARPELMI_DecodeAGIF(&info_, to, box_.width, box_.height);
    int32_t result = PELM_RESULT_MORE;
    while (result == PELM_RESULT_MORE)
        result = ZOTARPELMI_DecodeAGIFIter(&info_, to, box_.width, box_.height);
    return result;
}

void refuse(const ImageFormat &image, const ImageDescription &description, const Options &options) {
    if (!description.refusal.empty()) throw Failure(description.refusal);
    if (!image.has_frames) throw Failure(std::string("a ") + image.name + " file has no frames");
    if (!writes(image, *options.format))
        throw Failure(std::string("the ") + image.name + " decoder does not write the format " + options.format->name);
    if (options.mode.calls == Calls::by_lines) throw Failure("frames cannot be decoded by lines");
    const size_t count = description.animation.frameCount;
    if (options.frame > count) {
        throw Failure("there is no frame " + std::to_string(options.frame) + ": the file has " + std::to_string(count) +
                      (count == 1 ? " frame" : " frames"));
    }
}

uint32_t delay_of(const ImageDescription &description, size_t index) {
    return index < description.frames.size() ? description.frames[index].shownDelay : PelmAnimation_ShownDelay(0);
}

// The decoder reports a file that does not end as it should together with its last frame, as a failure.
bool is_delivered(int32_t result, const ImageDescription &description, size_t index) {
    if (result == PELM_RESULT_DONE || result == PELM_RESULT_LAST_FRAME) return true;
    const bool is_last = index + 1 == description.animation.frameCount;
    return is_last && description.animation.ending != PELM_ANIMATION_TRAILER;
}

Remarks remarks_on(const ImageDescription &description, const Options &options, Box box, size_t frames) {
    Remarks result{broken_frame_words(description, frames), gif_notes(options, description, box)};
    const bool is_whole_file = frames == description.animation.frameCount;
    if (result.shortage.empty() && is_whole_file) result.shortage = ending_words(description);
    return result;
}

} // namespace

Remarks play(Input &input, const ImageFormat &image, const ImageDescription &description, const Options &options,
             Session &session, const TakeFrame &take) {
    refuse(image, description, options);
    const Box box = box_for(options, description);
    refuse_huge(box, *options.format);
    const size_t count = options.frame > 0 ? options.frame : description.animation.frameCount;
    session.show_frames(count);
    Player player(input.source(), options, box);
    Picture picture = player.blank_picture_for(options);
    for (size_t index = 0; index < count; ++index) {
        const int32_t result = player.next_frame(picture);
        session.throw_if_stopped();
        session.throw_if_out_of_memory();
        input.throw_if_unreadable();
        if (!is_delivered(result, description, index))
            throw Failure("the decoder fails at frame " + std::to_string(index + 1));
        if (options.frame == 0 || index + 1 == count) take(picture, index, delay_of(description, index));
        session.frames_done(index + 1);
        if (result == PELM_RESULT_LAST_FRAME && index + 1 < count)
            throw Failure("the decoder ends after frame " + std::to_string(index + 1) + " of " + std::to_string(count));
    }
    return remarks_on(description, options, box, count);
}

} // namespace pelm_tool
