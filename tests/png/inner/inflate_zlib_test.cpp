// Whatever compressors write comes back as it was: zlib with all its knobs, and the builder's own.
#include <cstdlib>

#include <gtest/gtest.h>

#include "tests/png/inner/inflating.h"

#ifdef PELM_TEST_HAS_ZLIB
#include <zlib.h>
#endif

namespace pelm::test {

namespace {

struct Sample {
    std::string name;
    Bytes bytes;
};

std::vector<Sample> samples() {
    Bytes text, skewed, steps;
    const std::string sentence = "the quick brown fox jumps over the lazy dog; ";
    for (size_t i = 0; text.size() < 100000; ++i)
        for (const char letter : sentence.substr(i * i % 40))
            text.push_back(static_cast<uint8_t>(letter));
    const Bytes noise = noise_bytes(120000, 1);
    for (const uint8_t byte : noise) {
        uint8_t zeros = 0; // each byte half as frequent as the one before: long codes
        while (zeros < 8 && (byte >> zeros & 1) == 0)
            ++zeros;
        skewed.push_back(static_cast<uint8_t>(zeros * 29));
    }
    for (size_t i = 0; i < 90000; ++i)
        steps.push_back(static_cast<uint8_t>(i / 700 + (i % 700 == 0 ? 100 : 0)));
    return {{"nothing", {}}, {"one byte", {7}},  {"zeros", Bytes(100000)}, {"noise", noise},
            {"text", text},  {"skewed", skewed}, {"steps", steps}};
}

void expect_comes_back(const Bytes &stream, const Bytes &data, const std::string &what) {
    for (const Options &options :
         {Options{}, Options{.piece = 1000, .stop_after = 777}, Options{.piece = 1, .pause_at_blocks = true}}) {
        const Outcome got = inflated(stream, options);
        ASSERT_EQ(got.stop, Stop::finished) << what;
        ASSERT_TRUE(got.bytes == data) << what;
    }
}

} // namespace

TEST(InflateOfCompressors, the_builders_own_compressor) {
    for (const Sample &sample : samples())
        for (const size_t block_size : {100u, 20000u, 1000000u}) {
            const std::string what = sample.name + " in blocks of " + std::to_string(block_size);
            ASSERT_NO_FATAL_FAILURE(
                expect_comes_back(zlib_simple(sample.bytes, block_size, {1, 2, 45, 1000, 32768}), sample.bytes, what));
        }
}

TEST(InflateOfCompressors, stored_blocks_of_every_size) {
    const Bytes data = noise_bytes(70000, 2);
    for (const size_t block_size : {1000u, 32768u, 65535u})
        ASSERT_NO_FATAL_FAILURE(expect_comes_back(zlib_stored(data, block_size), data, "stored"));
}

#ifdef PELM_TEST_HAS_ZLIB

namespace {

struct Knobs {
    int level, window_bits, memory_level, strategy, flush;
};

Bytes zlib_with(const Bytes &data, const Knobs &knobs) {
    z_stream stream{};
    if (deflateInit2(&stream, knobs.level, Z_DEFLATED, knobs.window_bits, knobs.memory_level, knobs.strategy) != Z_OK)
        abort();
    Bytes out(data.size() * 2 + 100000);
    stream.next_out = out.data();
    stream.avail_out = static_cast<uInt>(out.size());
    constexpr size_t part = 7000;
    for (size_t at = 0; at < data.size(); at += part) {
        stream.next_in = const_cast<Bytef *>(data.data() + at);
        stream.avail_in = static_cast<uInt>(std::min(part, data.size() - at));
        if (deflate(&stream, knobs.flush) != Z_OK) abort();
    }
    if (deflate(&stream, Z_FINISH) != Z_STREAM_END) abort();
    out.resize(stream.total_out);
    deflateEnd(&stream);
    return out;
}

void expect_knobs_come_back(const Knobs &knobs) {
    for (const Sample &sample : samples()) {
        const std::string what = sample.name + " level " + std::to_string(knobs.level) + " window " +
                                 std::to_string(knobs.window_bits) + " memory " + std::to_string(knobs.memory_level) +
                                 " strategy " + std::to_string(knobs.strategy) + " flush " +
                                 std::to_string(knobs.flush);
        const Bytes stream = zlib_with(sample.bytes, knobs);
        ASSERT_NO_FATAL_FAILURE(expect_comes_back(stream, sample.bytes, what));
    }
}

} // namespace

TEST(InflateOfCompressors, zlib_at_every_level) {
    for (int level = 0; level <= 9; ++level)
        ASSERT_NO_FATAL_FAILURE(expect_knobs_come_back({level, 15, 8, Z_DEFAULT_STRATEGY, Z_NO_FLUSH}));
}

TEST(InflateOfCompressors, zlib_with_every_strategy) {
    for (const int strategy : {Z_FILTERED, Z_HUFFMAN_ONLY, Z_RLE, Z_FIXED})
        ASSERT_NO_FATAL_FAILURE(expect_knobs_come_back({6, 15, 8, strategy, Z_NO_FLUSH}));
}

TEST(InflateOfCompressors, zlib_with_every_window_and_memory_level) {
    for (int window_bits = 9; window_bits <= 15; ++window_bits)
        ASSERT_NO_FATAL_FAILURE(
            expect_knobs_come_back({6, window_bits, 1 + (window_bits - 9), Z_DEFAULT_STRATEGY, Z_NO_FLUSH}));
}

TEST(InflateOfCompressors, zlib_with_flushes) {
    for (const int flush : {Z_PARTIAL_FLUSH, Z_SYNC_FLUSH, Z_FULL_FLUSH, Z_BLOCK})
        ASSERT_NO_FATAL_FAILURE(expect_knobs_come_back({6, 15, 8, Z_DEFAULT_STRATEGY, flush}));
}

#endif

} // namespace pelm::test
