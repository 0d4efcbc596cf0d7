#include "bench/gif_bench.h"

#include "bench/contest.h"
#include "bench/copy_peer.h"
#include "bench/gif_pictures.h"
#include "bench/large_works.h"
#include "bench/own_decoder.h"
#include "bench/peers.h"

namespace bench {
namespace {

Box size_of(const Bytes &gif) {
    return {gif[6] | gif[7] << 8, gif[8] | gif[9] << 8};
}

// The first image, or all frames.
struct Kind {
    Call call;
    bool (*decode)(const Request &request, const Bytes &gif, uint8_t *output);
    bool (*with_giflib)(const Bytes &gif, uint8_t *output);
    bool (*with_stb)(const Bytes &gif);
};

constexpr Kind still = {ZOTARPELMI_DecodeGIF, decode_memory, giflib_decode, stb_decode};
constexpr Kind animation = {ZOTARPELMI_DecodeAGIF, play_memory, giflib_decode_frames, stb_decode_frames};

Contestant pelm_into(Format format, const Kind &kind) {
    return {"pelm", [=](const Bytes &gif) {
                const Box box = size_of(gif);
                return kind.decode({kind.call, format, box}, gif, output_of(bytes_of(format, box)));
            }};
}

Contestant giflib(const Kind &kind) {
    return {"giflib", [=](const Bytes &gif) { return kind.with_giflib(gif, output_of(bytes_of(rgba, size_of(gif)))); }};
}

// The picture, or the last frame.
bool equals_giflib(const Bytes &gif, const Kind &kind) {
    const Box box = size_of(gif);
    Bytes expected(bytes_of(rgba, box), 1), got(bytes_of(rgba, box), 2);
    return kind.with_giflib(gif, expected.data()) && kind.decode({kind.call, rgba, box}, gif, got.data()) &&
           expected == got;
}

void add(const std::string &name, const Kind &kind, const SharedWork &work,
         const std::vector<Contestant> &others = {}) {
    std::vector<Contestant> contestants = {pelm_into(rgba, kind), giflib(kind), {"stb", kind.with_stb}};
    contestants.insert(contestants.end(), others.begin(), others.end());
    add_contest("gif/" + name + "/rgba", work, contestants, [=](const Bytes &gif) { return equals_giflib(gif, kind); });
    add_contest("gif/" + name + "/rgb565", work, {pelm_into(rgb565, kind)});
}

} // namespace

void add_gif_benchmarks() {
    add("photo dithered", still, gif_photo_hd());
    add("screenshot", still, gif_screenshot_hd(), {copy_of_output(rgba, {1920, 1080})});
    add("text two colours", still, file_made_by([] { return gif_picture(Motif::text, Colours::two, 2400, 3400); }),
        {copy_of_output(rgba, {2400, 3400})});
    add("animation full frames", animation,
        file_made_by([] { return gif_of_full_frames(Motif::photo, 800, 600, 12); }));
    add("animation small changes", animation,
        file_made_by([] { return gif_of_small_changes(Motif::screenshot, 1280, 800, 24); }),
        {copy_of_output(rgba, {1280, 800}, 24)});
}

} // namespace bench
