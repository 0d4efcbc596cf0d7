#include "tests/gif/animated/frames.h"

#include <algorithm>

namespace pelm::test {

Bytes Animation::pixels_of(size_t frame) const {
    const Frame &wanted = frames[frame];
    if (!wanted.pixels.empty()) return wanted.pixels;
    return noise_pixels(size_t{wanted.place.width} * wanted.place.height, 1u << bits,
                        seed * 100 + static_cast<uint32_t>(frame));
}

Bytes Animation::file() const {
    GifFile file;
    file.screen(width, height, table(), background);
    file.extension(0xFF, {Bytes{'N', 'E', 'T', 'S', 'C', 'A', 'P', 'E', '2', '.', '0'}, {1, 0, 0}});
    for (size_t i = 0; i < frames.size(); ++i) {
        if (frames[i].has_control) file.control(frames[i].control);
        file.image(frames[i].place, pixels_of(i), std::max(bits, 2), frames[i].local);
    }
    if (has_trailer) file.trailer();
    return file.bytes;
}

std::vector<DeliveredFrame> frames_of(const Bytes &file, const GifRequest &request, GifCall which,
                                      const GifSetting &setting) {
    SideBySide both(file, request, setting);
    std::vector<DeliveredFrame> frames;
    for (int calls = 0; calls < 5000; ++calls) {
        const std::string difference = both.call(which);
        EXPECT_EQ(difference, "");
        if (!difference.empty()) break;
        if (both.result() == PELM_RESULT_MORE) continue;
        frames.push_back({both.result(), both.expected(), both.words()});
        if (both.result() != PELM_RESULT_DONE) break;
    }
    return frames;
}

} // namespace pelm::test
