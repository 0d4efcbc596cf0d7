#include "tools/gif_description.h"

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cstdio>
#include <cstring>

#include "tools/failure.h"

namespace pelm_tool {
namespace {

constexpr size_t signature_size = 6;
constexpr uint32_t most_listed = 100'000; // frames; a hostile file may have one per dozen bytes

std::string counted(uint64_t count, const std::string &thing) {
    return std::to_string(count) + " " + thing + (count == 1 ? "" : "s");
}

std::string size_words(uint32_t width, uint32_t height) {
    return std::to_string(width) + "x" + std::to_string(height);
}

std::string seconds_words(uint64_t milliseconds) {
    char words[32];
    std::snprintf(words, sizeof words, "%.2f s", static_cast<double>(milliseconds) / 1000);
    return words;
}

std::string version_words(Bytes head) {
    std::string words;
    for (const uint8_t byte : head.first(std::min(head.size(), signature_size)))
        words += byte > ' ' && byte <= '~' ? static_cast<char>(byte) : '?';
    return words;
}

bool has_timing(const PelmAnimation &animation) {
    return animation.frameCount > 1 || animation.loopCount >= 0;
}

std::string plays_words(const PelmAnimation &animation) {
    const std::string stored = " (loop count " + std::to_string(animation.loopCount) + ")";
    if (animation.plays == 0) return "played for ever" + stored;
    if (animation.plays == 1) return "played once";
    return "played " + counted(animation.plays, "time") + stored;
}

std::string timing_words(const ImageDescription &image) {
    uint64_t length = 0;
    for (const PelmAnimationFrame &frame : image.frames)
        length += frame.shownDelay;
    const bool is_listed = image.frames.size() == image.animation.frameCount;
    return (is_listed ? ", " + seconds_words(length) : "") + ", " + plays_words(image.animation);
}

std::string all_words(const ImageDescription &image, Bytes head) {
    const PelmAnimation &animation = image.animation;
    std::string words = size_words(animation.screenWidth, animation.screenHeight) + ", " + version_words(head);
    words += animation.globalColours == 0 ? ", no global colours" : ", " + counted(animation.globalColours, "colour");
    words += ", " + counted(animation.frameCount, "frame");
    return has_timing(animation) ? words + timing_words(image) : words;
}

const char *disposal_words(uint32_t disposal) {
    switch (disposal) {
    case 0: return "disposal 0 (unspecified)";
    case 1: return "disposal 1 (keep)";
    case 2: return "disposal 2 (clear)";
    case 3: return "disposal 3 (restore)";
    default: return "disposal above 3 (taken for keep)";
    }
}

std::string delay_words(const PelmAnimationFrame &frame) {
    const std::string stored = std::to_string(frame.delay) + " ms";
    return frame.delay == frame.shownDelay ? stored : stored + " (shown for " + std::to_string(frame.shownDelay) + ")";
}

bool is_whole(const PelmAnimationFrame &frame) {
    return frame.completeRows >= frame.height;
}

std::string rows_of_all(const PelmAnimationFrame &frame) {
    return std::to_string(frame.completeRows) + " of " + std::to_string(frame.height) + " rows";
}

std::string place_words(const PelmAnimationFrame &frame) {
    return size_words(frame.width, frame.height) + " at " + std::to_string(frame.left) + "," +
           std::to_string(frame.top);
}

std::string frame_words(const PelmAnimationFrame &frame, size_t number, bool has_timing) {
    std::string words = "frame " + std::to_string(number) + ": " + place_words(frame);
    if (has_timing) words += ", " + delay_words(frame);
    words += std::string(", ") + disposal_words(frame.disposal);
    words += frame.transparentIndex < 0 ? ", opaque" : ", transparent index " + std::to_string(frame.transparentIndex);
    if (frame.interlaced != 0) words += ", interlaced";
    if (frame.localColours != 0) words += ", " + counted(frame.localColours, "colour") + " of its own";
    if (!is_whole(frame)) words += ", only " + rows_of_all(frame);
    return words;
}

std::vector<std::string> details_of(const ImageDescription &image) {
    std::vector<std::string> details;
    for (const PelmAnimationFrame &frame : image.frames)
        details.push_back(frame_words(frame, details.size() + 1, has_timing(image.animation) || frame.delay > 0));
    if (image.frames.size() < image.animation.frameCount)
        details.push_back("and " + counted(image.animation.frameCount - image.frames.size(), "more frame"));
    const std::string ending = ending_words(image);
    if (!ending.empty()) details.push_back(ending);
    return details;
}

bool covers_screen(const ImageDescription &image) {
    const PelmAnimationFrame &first = image.frames.front();
    return first.left == 0 && first.top == 0 && first.width >= image.animation.screenWidth &&
           first.height >= image.animation.screenHeight;
}

// About the call that decodes the first image as it is, without composing anything.
std::vector<std::string> notes_on(const ImageDescription &image) {
    std::vector<std::string> notes;
    if (image.animation.frameCount > 1)
        notes.push_back("only the first of " + counted(image.animation.frameCount, "frame") +
                        " is decoded; use --frame, --all-frames or --animate");
    if (!covers_screen(image))
        notes.push_back("the image does not cover its screen, and is not put in its place there; use --frame 1");
    if (image.frames.front().transparentIndex >= 0)
        notes.push_back("transparent pixels are written in their colour; use --frame 1 to leave them clear");
    return notes;
}

std::string header_refusal(Bytes head) {
    const bool is_digits = head.size() > 4 && std::isdigit(head[3]) != 0 && std::isdigit(head[4]) != 0;
    const bool is_signature = head.size() >= signature_size && is_digits && head[5] >= 'A' && head[5] <= 'z';
    return is_signature ? "the file ends inside its header" : "the GIF signature is damaged";
}

std::string refusal_of(const PelmAnimation &animation) {
    if (animation.screenWidth == 0 || animation.screenHeight == 0)
        return "a screen of " + size_words(animation.screenWidth, animation.screenHeight) + " pixels";
    if (animation.frameCount > 0) return {};
    switch (animation.ending) {
    case PELM_ANIMATION_CUT: return "the file ends before its first image";
    case PELM_ANIMATION_DAMAGED: return "a block before the first image is damaged";
    default: return "there is no image";
    }
}

// Both calls read the source from its first byte.
int list_frames(InputSource &source, ImageDescription &image) {
    const int error = PelmAnimation_Describe(&source, &image.animation, nullptr, 0);
    if (error != 0) return error;
    const uint32_t count = std::min(image.animation.frameCount, most_listed);
    image.frames.resize(count);
    return PelmAnimation_Describe(&source, &image.animation, image.frames.data(), count);
}

} // namespace

bool begins_like_gif(Bytes head) {
    return head.size() >= 3 && std::memcmp(head.data(), "GIF", 3) == 0;
}

std::string broken_frame_words(const ImageDescription &image, size_t last) {
    for (size_t i = 0; i < std::min(last, image.frames.size()); ++i) {
        const PelmAnimationFrame &frame = image.frames[i];
        if (is_whole(frame)) continue;
        const std::string which = image.animation.frameCount == 1 ? "the image data" : "frame " + std::to_string(i + 1);
        return which + " breaks off after " + rows_of_all(frame);
    }
    return {};
}

std::string ending_words(const ImageDescription &image) {
    const std::string after = " after frame " + std::to_string(image.animation.frameCount);
    switch (image.animation.ending) {
    case PELM_ANIMATION_CUT: return "the file ends without its trailer" + after;
    case PELM_ANIMATION_DAMAGED: return "a damaged block ends the file" + after;
    default: return {};
    }
}

ImageDescription describe_gif(InputSource &source, Bytes head) {
    ImageDescription image;
    image.words = version_words(head);
    const int error = list_frames(source, image);
    if (error == ESPIPE) throw Failure("cannot be read twice");
    if (error != 0) image.refusal = header_refusal(head);
    if (error != 0) return image;
    image.words = all_words(image, head);
    image.details = details_of(image);
    image.refusal = refusal_of(image.animation);
    if (!image.refusal.empty()) return image;
    image.width = static_cast<int32_t>(image.animation.screenWidth);
    image.height = static_cast<int32_t>(image.animation.screenHeight);
    image.is_interlaced = image.frames.front().interlaced != 0;
    image.stored_rows = static_cast<int32_t>(image.frames.front().height);
    image.shortage = broken_frame_words(image, 1);
    image.notes = notes_on(image);
    return image;
}

} // namespace pelm_tool
