// Thousands of files and requests that look random and are the same in every run, against the model.
#include "tests/gif/support/gif_check.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

constexpr GifCall stills[] = {GifCall::one_shot, GifCall::iterative, GifCall::line};

uint32_t cases(uint32_t all) {
    return quick() ? all / 25 : all;
}

class RandomGif {
public:
    explicit RandomGif(uint32_t seed) : noise_(seed) {}

    Bytes file() {
        GifFile file;
        width_ = between(1, 24);
        height_ = between(1, 24);
        const int bits = static_cast<int>(noise_.below(8)) + 1;
        file.screen(width_, height_, one_in(9) ? ColourTable{} : distinct_table(size_t{1} << bits, noise_.next()),
                    static_cast<uint8_t>(noise_.next()));
        if (one_in(3)) file.extension(one_in(2) ? 0xFE : 0x44, {noise_bytes(30)});
        if (one_in(3)) file.control({static_cast<uint8_t>(noise_.below(8)), one_in(2) ? -1 : 1, 3});
        if (one_in(5)) file.raw(noise_bytes(4));
        const ImagePlace place = somewhere();
        file.descriptor(place, one_in(4) ? distinct_table(size_t{1} << bits, noise_.next()) : ColourTable{});
        add_data(file, place, bits);
        if (one_in(8)) file.bytes.resize(noise_.below(static_cast<uint32_t>(file.bytes.size()) + 1));
        return file.bytes;
    }

    GifRequest request() {
        static constexpr uint32_t formats[] = {0, 1, 5, 7, 8, 10, 11, 12, 6, 3};
        static constexpr uint32_t placements[] = {0, 0, 0x100, 0x700, 0x700, 0x200, 0x600};
        GifRequest request;
        request.format = formats[noise_.below(one_in(10) ? 10 : 8)];
        request.quarter_turns = noise_.below(4);
        request.placement = placements[noise_.below(7)];
        request.box_width = static_cast<int32_t>(noise_.below(60)) - (one_in(9) ? 30 : 0);
        request.box_height = static_cast<int32_t>(noise_.below(60)) - (one_in(9) ? 30 : 0);
        if (one_in(5)) {
            request.box_width = width_;
            request.box_height = height_;
        }
        return request;
    }

    GifSetting setting() {
        GifSetting setting;
        setting.kind = gif_source_kinds[noise_.below(4)];
        if (one_in(6)) setting.most_per_read = 1 + static_cast<int32_t>(noise_.below(900));
        setting.edge = one_in(2) ? Edge::start : Edge::end;
        setting.bytes_behind = noise_.below(5);
        setting.has_raw_table = one_in(4);
        return setting;
    }

    uint32_t below(uint32_t limit) { return noise_.below(limit); }

private:
    bool one_in(uint32_t count) { return (noise_.next() >> 7) % count == 0; }
    uint16_t between(uint32_t low, uint32_t high) {
        return static_cast<uint16_t>(low + (noise_.next() >> 5) % (high - low + 1));
    }
    Bytes noise_bytes(uint32_t most) {
        Bytes bytes;
        for (uint32_t left = noise_.below(most + 1); left > 0; --left)
            bytes.push_back(static_cast<uint8_t>(noise_.next() >> 9));
        return bytes;
    }
    ImagePlace somewhere() {
        ImagePlace place{0, 0, width_, height_, one_in(3)};
        if (one_in(2)) return place;
        place.left = between(0, 30);
        place.top = between(0, one_in(2) ? 4 : 30);
        place.width = between(one_in(6) ? 0 : 1, 30);
        place.height = between(one_in(6) ? 0 : 1, 30);
        return place;
    }
    void add_data(GifFile &file, const ImagePlace &place, int bits) {
        const size_t pixels = size_t{place.width} * place.height;
        const int size = one_in(12) ? static_cast<int>(noise_.below(13)) : std::max(bits, 2);
        SubBlockSizes cuts{static_cast<uint8_t>(noise_.next())};
        while (one_in(2))
            cuts.push_back(static_cast<uint8_t>(noise_.below(one_in(2) ? 4 : 256)));
        if (cuts.back() == 0) cuts.back() = 255;
        LzwOptions options;
        options.clear_every = one_in(3) ? 1 + noise_.below(40) : 0;
        options.begins_with_clear = !one_in(5);
        options.ends = !one_in(5);
        Bytes packed = lzw_data(noise_pixels(pixels, 1u << std::min(size, 8), noise_.next()), size, options);
        const bool broken = one_in(4);
        if (broken && !packed.empty())
            for (uint32_t i = 1 + noise_.below(5); i > 0; --i)
                packed[noise_.below(static_cast<uint32_t>(packed.size()))] = static_cast<uint8_t>(noise_.next() >> 3);
        if (one_in(10)) packed = noise_bytes(400);
        file.data_in(size, packed, cuts).trailer();
        if (one_in(3)) file.raw(noise_bytes(40));
    }

    Noise noise_;
    uint16_t width_ = 1, height_ = 1;
};

class GifSweep : public GifTest {};

TEST_F(GifSweep, random_files_and_requests_do_as_the_model) {
    const uint32_t seeds = cases(12000);
    for (uint32_t seed = 0; seed < seeds && !HasFailure(); ++seed) {
        RandomGif random(seed);
        const Bytes file = random.file();
        const GifRequest request = random.request();
        const GifSetting setting = random.setting();
        const GifCall call = stills[random.below(3)];
        EXPECT_EQ(gif_difference(file, request, call, setting, static_cast<int32_t>(random.below(9)) + 1), "")
            << "seed " << seed;
    }
}

TEST_F(GifSweep, random_code_streams_do_as_the_model) {
    const uint32_t seeds = cases(3000);
    for (uint32_t seed = 0; seed < seeds && !HasFailure(); ++seed) {
        Noise noise(seed + 77777);
        const int size = static_cast<int>(seed % 13);
        const uint16_t width = static_cast<uint16_t>(1 + noise.below(20));
        const uint16_t height = static_cast<uint16_t>(1 + noise.below(40));
        GifFile file;
        file.screen(20, 40, distinct_table(256)).descriptor({0, 0, width, height});
        Bytes packed;
        const bool dense = noise.below(2) == 0; // random bits, or codes around the next free one
        if (dense) {
            for (uint32_t i = noise.below(3000); i > 0; --i)
                packed.push_back(static_cast<uint8_t>(noise.next() >> 11));
        } else {
            Codes codes;
            uint32_t next = first_free_code(size);
            for (uint32_t i = 0; i < 600; ++i) {
                const uint32_t kind = noise.below(60);
                codes.push_back(kind == 0 ? clear_code(size) : noise.next() / 8 % (next + (kind < 6 ? 9 : 1)));
                next = codes.back() == clear_code(size) ? first_free_code(size) : std::min(next + 1, 4095u);
                if (codes.back() == end_code(size)) codes.back() = 0;
            }
            packed = packed_codes(codes, size);
        }
        file.data(size, packed, static_cast<uint8_t>(1 + noise.below(255))).trailer();
        EXPECT_EQ(gif_difference(file.bytes, own_size(20, 40, 1), stills[seed % 3], {}, 7), "") << "seed " << seed;
    }
}

TEST_F(GifSweep, long_streams_that_break_late_do_as_the_model) {
    const uint32_t seeds = cases(2500);
    for (uint32_t seed = 0; seed < seeds && !HasFailure(); ++seed) {
        Noise noise(seed + 555);
        const auto below = [&noise](uint32_t limit) { return (noise.next() >> 6) % limit; };
        const int size = static_cast<int>(2 + below(7));
        const uint16_t width = static_cast<uint16_t>(1 + below(below(3) == 0 ? 9 : 90));
        const uint16_t height = static_cast<uint16_t>(1 + below(120));
        const LzwOptions options{.begins_with_clear = below(6) > 0,
                                 .clear_every = below(2) == 0 ? 0 : 20 + below(900),
                                 .clears_full_table = below(3) > 0};
        Codes codes = lzw_codes(pixel_runs(size_t{width} * height, 1u << size, 1 + below(40), noise), size, options);
        for (uint32_t breaks = below(4); breaks > 0; --breaks) {
            const size_t at = below(static_cast<uint32_t>(codes.size()));
            const auto place = codes.begin() + static_cast<ptrdiff_t>(at);
            const uint32_t any = below(1u << code_widths(codes, size)[at]);
            switch (below(4)) {
            case 0: *place = any == end_code(size) ? 0 : any; break;
            case 1: codes.insert(place, any == end_code(size) ? 0 : any); break;
            case 2: codes.insert(place, {clear_code(size), first_free_code(size) + below(clear_code(size) - 2)}); break;
            default: codes.erase(place);
            }
            if (codes.empty()) codes.push_back(end_code(size));
        }
        GifFile file;
        const uint16_t screen_width = below(3) == 0 ? static_cast<uint16_t>(width + below(20)) : width;
        file.screen(screen_width, height, distinct_table(256)).descriptor({0, 0, width, height, below(5) == 0});
        file.data(size, packed_codes(codes, size), static_cast<uint8_t>(below(3) == 0 ? 1 + below(40) : 255)).trailer();
        const GifRequest request = below(2) == 0 ? own_size(screen_width, height, gif_formats[below(8)])
                                                 : GifRequest{gif_formats[below(8)], below(4), 0, 40, 30};
        const GifCall call = stills[seed % 3];
        EXPECT_EQ(gif_difference(file.bytes, request, call, {}, static_cast<int32_t>(1 + below(20))), "")
            << "seed " << seed;
    }
}

TEST_F(GifSweep, random_bytes_behind_a_header_do_as_the_model) {
    const uint32_t seeds = cases(4000);
    static constexpr uint8_t tempting[] = {0x2C, 0x21, 0x3B, 0xF9, 0xFE, 0xFF, 0x01, 0, 1, 2, 4, 8, 0x80, 0x40};
    for (uint32_t seed = 0; seed < seeds && !HasFailure(); ++seed) {
        Noise noise(seed + 99991);
        GifFile file;
        file.screen(static_cast<uint16_t>(1 + noise.below(9)), static_cast<uint16_t>(1 + noise.below(9)),
                    distinct_table(4));
        for (uint32_t i = noise.below(300); i > 0; --i) {
            const uint32_t value = noise.next() >> 6;
            file.raw({noise.below(3) > 0 ? tempting[value % sizeof tempting] : static_cast<uint8_t>(value)});
        }
        const GifRequest request{gif_formats[seed % 8], noise.below(4), noise.below(3) == 0 ? 0x700u : 0u,
                                 static_cast<int32_t>(noise.below(12)), static_cast<int32_t>(noise.below(12))};
        for (const GifCall call : stills)
            EXPECT_EQ(gif_difference(file.bytes, request, call, {}, 3), "") << "seed " << seed;
    }
}

} // namespace
} // namespace pelm::test
