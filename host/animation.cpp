// The frames of a GIF as the decoder walks through them: which bytes it takes for blocks, and which it steps over.
#include "PelmAnimation.h"

#include <algorithm>
#include <cerrno>
#include <cstring>

#include "host/gif_data.h"
#include "host/gif_reader.h"

namespace pelm::host {
namespace {

enum class Step { go_on, trailer, cut, damaged };

constexpr int32_t header_size = 13;
constexpr uint32_t shortest_delay = 20;   // milliseconds; what is below
constexpr uint32_t usual_delay = 100;     // is shown this long
constexpr uint32_t unused_code_size = 13; // and above: refused before the image data

// The frame list of the caller, and the values that a frame has from the last graphic control block.
struct Walk {
    GifReader &reader;
    PelmAnimation &animation;
    PelmAnimationFrame *frames;
    uint32_t room;
    PelmAnimationFrame current;
};

bool is_digit(uint8_t byte) {
    return byte >= '0' && byte <= '9';
}

bool is_gif_header(const uint8_t *bytes) {
    return memcmp(bytes, "GIF", 3) == 0 && is_digit(bytes[3]) && is_digit(bytes[4]) && bytes[5] >= 'A' &&
           bytes[5] <= 'z';
}

uint32_t colours_of(uint8_t packed) {
    return (packed & 0x80) == 0 ? 0 : 2u << (packed & 7);
}

bool skip_colours(GifReader &reader, uint32_t colours) {
    const int32_t size = static_cast<int32_t>(3 * colours);
    if (!reader.hold(size)) return false;
    reader.skip(size);
    return true;
}

bool read_header(GifReader &reader, PelmAnimation &animation) {
    if (!reader.hold(header_size) || !is_gif_header(reader.next())) return false;
    const uint8_t *const bytes = reader.next();
    animation.screenWidth = le16(bytes + 6);
    animation.screenHeight = le16(bytes + 8);
    animation.globalColours = colours_of(bytes[10]);
    animation.backgroundIndex = bytes[11];
    animation.loopCount = -1;
    animation.plays = 1;
    reader.skip(header_size);
    return skip_colours(reader, animation.globalColours);
}

bool names_loop_block(const uint8_t *application) {
    return memcmp(application, "NETSCAPE2.0", 11) == 0 || memcmp(application, "ANIMEXTS1.0", 11) == 0;
}

void take_loop_block(PelmAnimation &animation, const uint8_t *block, int32_t size) {
    if (size < 3 || (block[0] & 7) != 1) return;
    const uint32_t count = le16(block + 1);
    animation.loopCount = static_cast<int32_t>(count);
    animation.plays = count == 0 ? 0 : count + 1;
}

// Sub-blocks up to the empty one. Those of an application block may hold a loop count.
Step skip_blocks(Walk &walk, int32_t size, bool is_application) {
    bool loops = false;
    for (bool is_first = true; size != 0; is_first = false) {
        if (!walk.reader.hold(size + 1)) return Step::cut;
        const uint8_t *const block = walk.reader.next();
        if (is_first) {
            loops = is_application && size == 11 && names_loop_block(block);
        } else if (loops) {
            take_loop_block(walk.animation, block, size);
        }
        walk.reader.skip(size);
        size = walk.reader.take();
    }
    return Step::go_on;
}

Step take_graphic_control(Walk &walk, int32_t size) {
    if (size != 4) return Step::damaged;
    if (!walk.reader.hold(5)) return Step::cut;
    const uint8_t *const bytes = walk.reader.next();
    walk.reader.skip(5);
    PelmAnimationFrame &frame = walk.current;
    frame.disposal = bytes[0] >> 2 & 7;
    frame.delay = le16(bytes + 1) * 10;
    frame.shownDelay = PelmAnimation_ShownDelay(frame.delay);
    frame.transparentIndex = (bytes[0] & 1) != 0 ? bytes[3] : -1;
    return bytes[4] == 0 ? Step::go_on : Step::damaged;
}

// The body of an unknown extension is not stepped over: the decoder looks for blocks in it.
Step take_extension(Walk &walk) {
    constexpr uint8_t plain_text = 0x01, graphic_control = 0xF9, comment = 0xFE, application = 0xFF;
    if (!walk.reader.hold(2)) return Step::cut;
    const uint8_t label = walk.reader.take();
    if (label != graphic_control && label != plain_text && label != comment && label != application) return Step::go_on;
    const int32_t size = walk.reader.take();
    return label == graphic_control ? take_graphic_control(walk, size) : skip_blocks(walk, size, label == application);
}

void take_image_data(Walk &walk, uint32_t code_size) {
    PelmAnimationFrame &frame = walk.current;
    const uint64_t wanted = uint64_t{frame.width} * frame.height;
    const uint64_t pixels = follow_gif_data(walk.reader, code_size, wanted);
    const bool is_whole = pixels >= wanted;
    frame.completeRows = is_whole ? frame.height : static_cast<uint32_t>(pixels / frame.width);
}

Step take_image(Walk &walk) {
    if (!walk.reader.hold(9)) return Step::cut;
    const uint8_t *const bytes = walk.reader.next();
    walk.reader.skip(9);
    PelmAnimationFrame &frame = walk.current;
    frame.left = le16(bytes);
    frame.top = le16(bytes + 2);
    frame.width = le16(bytes + 4);
    frame.height = le16(bytes + 6);
    frame.interlaced = bytes[8] >> 6 & 1;
    frame.localColours = colours_of(bytes[8]);
    if (!skip_colours(walk.reader, frame.localColours) || !walk.reader.hold(1)) return Step::cut;
    const uint32_t code_size = walk.reader.take();
    if (code_size >= unused_code_size) return Step::damaged;
    take_image_data(walk, code_size);
    if (walk.animation.frameCount < walk.room) walk.frames[walk.animation.frameCount] = frame;
    ++walk.animation.frameCount;
    return Step::go_on;
}

Step take_next(Walk &walk) {
    if (!walk.reader.hold(1)) return Step::cut;
    switch (walk.reader.take()) {
    case ',': return take_image(walk);
    case '!': return take_extension(walk);
    case ';': return Step::trailer;
    default: return Step::go_on;
    }
}

uint32_t ending_of(Step last) {
    switch (last) {
    case Step::trailer: return PELM_ANIMATION_TRAILER;
    case Step::damaged: return PELM_ANIMATION_DAMAGED;
    default: return PELM_ANIMATION_CUT;
    }
}

bool rewind(InputSource &source) {
    ZOTARPELM_Seek_IO(&source, 0, 0);
    return source.consumed == 0;
}

// Found out with a few bytes, before more of what cannot be had again is read.
bool can_rewind(InputSource &source) {
    uint8_t bytes[header_size];
    if (!rewind(source)) return false;
    ZOTARPELM_Read_IO(&source, bytes, header_size);
    return rewind(source);
}

int describe(InputSource &source, Walk &walk) {
    if (!can_rewind(source)) return ESPIPE;
    if (!read_header(walk.reader, walk.animation)) return EINVAL;
    Step last = Step::go_on;
    while (last == Step::go_on)
        last = take_next(walk);
    walk.animation.ending = ending_of(last);
    return 0;
}

} // namespace
} // namespace pelm::host

int PelmAnimation_Describe(InputSource *source, PelmAnimation *animation, PelmAnimationFrame *frames, uint32_t count) {
    using namespace pelm::host;
    if (animation == nullptr) return EINVAL;
    *animation = {};
    if (source == nullptr) return EINVAL;
    GifReader reader(*source);
    Walk walk{reader, *animation, frames, frames == nullptr ? 0 : count, {}};
    walk.current.shownDelay = PelmAnimation_ShownDelay(0);
    walk.current.transparentIndex = -1;
    const int error = describe(*source, walk);
    if (error != 0) *animation = {};
    if (error != ESPIPE) rewind(*source);
    return error;
}

uint32_t PelmAnimation_ShownDelay(uint32_t delay) {
    return delay < pelm::host::shortest_delay ? pelm::host::usual_delay : delay;
}
