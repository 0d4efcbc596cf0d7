// The description of an animation against what the decoder delivers, for sound files and for damaged ones.
#include <algorithm>
#include <random>
#include <vector>

#include "PelmAnimation.h"
#include "tests/gif/support/lzw_encoder.h"
#include "tests/host/support.h"
#include "tests/support/quick.h"
#include "tests/support/small_gif.h"

namespace pelm::host_test {
namespace {

using Bytes = std::vector<uint8_t>;
using test::SmallFrame;
using test::SmallGif;

constexpr uint32_t room = 64;

struct Description {
    PelmAnimation animation = {};
    std::vector<PelmAnimationFrame> frames = std::vector<PelmAnimationFrame>(room);
};

struct Delivery {
    size_t frames = 0; // without the one that a failure may have come with
    int32_t last_result = PELM_RESULT_DONE;
    std::vector<uint32_t> delays;
};

Description described(InputSource &source) {
    Description got;
    EXPECT_EQ(PelmAnimation_Describe(&source, &got.animation, got.frames.data(), room), 0);
    got.frames.resize(std::min(got.animation.frameCount, room));
    return got;
}

Delivery delivered(InputSource &source) {
    Delivery got;
    ImageDecodeInfo info = {};
    info.input = &source;
    info.outputFormat = PELM_FORMAT_RGBA8888;
    Bytes output(64 * 64 * 4);
    while (got.last_result == PELM_RESULT_DONE) {
        got.last_result = ZOTARPELMI_DecodeAGIF(&info, output.data(), 64, 64);
        if (got.last_result == PELM_RESULT_FAILED) break;
        ++got.frames;
        got.delays.push_back(info.frameDelay);
    }
    PelmAnimation_Restart(&info, ZOTARPELMI_AborAGIF);
    return got;
}

void expect_agreement(const Description &told, const Delivery &got) {
    const bool is_sound = told.animation.ending == PELM_ANIMATION_TRAILER;
    EXPECT_EQ(got.last_result, is_sound ? PELM_RESULT_LAST_FRAME : PELM_RESULT_FAILED);
    EXPECT_EQ(got.frames + (is_sound ? 0 : 1), told.animation.frameCount);
    for (size_t i = 0; i < std::min(got.frames, told.frames.size()); ++i)
        EXPECT_EQ(got.delays[i], told.frames[i].delay) << "frame " << i + 1;
}

// Of files without an image the decoder delivers an empty one.
bool is_comparable(const Description &told) {
    return told.animation.frameCount > 0 && told.animation.screenWidth > 0 && told.animation.screenHeight > 0;
}

bool compare(Bytes bytes, uint32_t kind) {
    Source source;
    EXPECT_EQ(PelmHost_OpenMemory(&source, kind, bytes.data(), static_cast<int32_t>(bytes.size())), 0);
    const Description told = described(source);
    if (!is_comparable(told)) return false;
    expect_agreement(told, delivered(source));
    return true;
}

uint32_t below(uint32_t limit, std::mt19937 &random) {
    return static_cast<uint32_t>(random() % limit);
}

Bytes noise(std::mt19937 &random, size_t size) {
    Bytes bytes(size);
    for (uint8_t &byte : bytes)
        byte = static_cast<uint8_t>(random() & 3);
    return bytes;
}

SmallGif animation_of(std::mt19937 &random) {
    SmallGif gif;
    gif.width = gif.height = 40;
    gif.frames.clear();
    for (uint32_t i = 0; i < 5; ++i) {
        SmallFrame frame;
        frame.left = below(30, random), frame.top = below(30, random);
        frame.width = 1 + below(40, random), frame.height = 1 + below(20, random);
        frame.indices = noise(random, size_t{frame.width} * frame.height);
        frame.delay = static_cast<int>(below(50, random));
        frame.disposal = static_cast<int>(below(4, random));
        gif.frames.push_back(frame);
    }
    return gif;
}

void append_blocks(Bytes &bytes, const Bytes &data) {
    for (size_t at = 0; at < data.size(); at += 255) {
        const auto from = data.begin() + static_cast<ptrdiff_t>(at);
        const auto size = static_cast<uint8_t>(std::min<size_t>(255, data.size() - at));
        bytes.push_back(size);
        bytes.insert(bytes.end(), from, from + size);
    }
    bytes.push_back(0);
}

constexpr uint32_t kinds[] = {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM};

TEST(AnimationDecode, delivers_the_frames_that_are_told_of_sound_files) {
    std::mt19937 random(1);
    for (int round = 0; round < 100; ++round)
        EXPECT_TRUE(compare(gif_bytes(animation_of(random)), kinds[round % 2]));
}

TEST(AnimationDecode, delivers_the_frames_that_are_told_of_files_cut_anywhere) {
    std::mt19937 random(2);
    const Bytes whole = gif_bytes(animation_of(random));
    size_t compared = 0;
    for (size_t size = 13 + 12; size < whole.size(); ++size) {
        SCOPED_TRACE(size);
        compared += compare({whole.begin(), whole.begin() + static_cast<ptrdiff_t>(size)}, kinds[size % 2]);
        if (testing::Test::HasFailure()) return;
    }
    EXPECT_GT(compared, whole.size() / 2);
}

// More codes than the table has entries, cleared when it is full or not.
TEST(AnimationDecode, delivers_the_frames_that_are_told_of_full_tables) {
    std::mt19937 random(4);
    Bytes pixels(120 * 120);
    for (uint8_t &pixel : pixels)
        pixel = static_cast<uint8_t>(random());
    for (const bool clears : {false, true})
        for (const int bits : {2, 8}) {
            SmallGif gif;
            gif.width = gif.height = 120;
            Bytes bytes = gif_header(gif);
            for (int frame = 0; frame < 2; ++frame) {
                const Bytes descriptor = {',', 0, 0, 0, 0, 120, 0, 120, 0, 0, static_cast<uint8_t>(bits)};
                bytes.insert(bytes.end(), descriptor.begin(), descriptor.end());
                Bytes reduced = pixels;
                for (uint8_t &pixel : reduced)
                    pixel = static_cast<uint8_t>(pixel & ((1 << bits) - 1));
                append_blocks(bytes, test::lzw_data(reduced, bits, {.clears_full_table = clears}));
            }
            bytes.push_back(';');
            for (const uint32_t kind : kinds)
                EXPECT_TRUE(compare(bytes, kind)) << bits << " bits";
        }
}

// Codes that stand for anything, data that goes on behind the last pixel, blocks in places where none belongs.
TEST(AnimationDecode, delivers_the_frames_that_are_told_of_damaged_files) {
    std::mt19937 random(3);
    size_t compared = 0;
    const int rounds = pelm::test::quick() ? 300 : 3000;
    for (int round = 0; round < rounds; ++round) {
        SCOPED_TRACE(round);
        Bytes bytes = gif_bytes(animation_of(random));
        for (uint32_t i = 0; i < 1 + random() % 8; ++i)
            bytes[25 + random() % (bytes.size() - 25)] = static_cast<uint8_t>(random());
        compared += compare(bytes, kinds[round % 2]);
        if (testing::Test::HasFailure()) return;
    }
    EXPECT_GT(compared, static_cast<size_t>(rounds / 2));
}

// Behind each clear code the first entry extends itself: it grows beyond what the decoder takes, and is used then.
TEST(AnimationDecode, delivers_the_frames_that_are_told_of_strings_that_are_too_long) {
    constexpr uint32_t clear = 4, first_entry = 6, code_bits = 3;
    for (const int clears : {4090, 4093, 4094, 4095, 4096, 4097, 4100, 4200}) {
        Bytes data(5000);
        size_t bits = 0;
        const auto put = [&](uint32_t code) {
            for (uint32_t i = 0; i < code_bits; ++i, ++bits)
                data[bits / 8] = static_cast<uint8_t>(data[bits / 8] | (code >> i & 1) << bits % 8);
        };
        for (int i = 0; i < clears; ++i)
            for (const uint32_t code : {clear, first_entry, 0u})
                put(code);
        put(first_entry);
        data.resize((bits + 7) / 8);
        SmallGif gif;
        gif.width = gif.height = 100;
        Bytes bytes = gif_header(gif);
        for (int frame = 0; frame < 2; ++frame) {
            const Bytes descriptor = {',', 0, 0, 0, 0, 100, 0, 100, 0, 0, 2};
            bytes.insert(bytes.end(), descriptor.begin(), descriptor.end());
            append_blocks(bytes, data);
        }
        bytes.push_back(';');
        for (const uint32_t kind : kinds)
            EXPECT_TRUE(compare(bytes, kind)) << clears;
    }
}

// Codes of any value, most of them none of the table's, behind a clear code and each other.
TEST(AnimationDecode, delivers_the_frames_that_are_told_of_data_of_any_codes) {
    std::mt19937 random(5);
    const int rounds = pelm::test::quick() ? 2000 : 20000;
    for (int round = 0; round < rounds; ++round) {
        SCOPED_TRACE(round);
        SmallGif gif;
        gif.width = gif.height = 40;
        Bytes bytes = gif_header(gif);
        for (int frame = 0; frame < 3; ++frame) {
            const uint32_t bits = 2 + below(3, random);
            const Bytes descriptor = {',',
                                      0,
                                      0,
                                      0,
                                      0,
                                      static_cast<uint8_t>(1 + below(40, random)),
                                      0,
                                      static_cast<uint8_t>(1 + below(40, random)),
                                      0,
                                      static_cast<uint8_t>(0x40 * below(2, random)),
                                      static_cast<uint8_t>(bits)};
            bytes.insert(bytes.end(), descriptor.begin(), descriptor.end());
            Bytes data = {static_cast<uint8_t>(1u << bits)};
            const uint32_t size = 2 + below(400, random);
            while (data.size() < size)
                data.push_back(static_cast<uint8_t>(random()));
            append_blocks(bytes, data);
        }
        bytes.push_back(';');
        EXPECT_TRUE(compare(bytes, kinds[round % 2]));
        if (testing::Test::HasFailure()) return;
    }
}

} // namespace
} // namespace pelm::host_test
