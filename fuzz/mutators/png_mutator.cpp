#include "fuzz/mutators/png_mutator.h"

#include <algorithm>
#include <random>
#include <string>

#include "fuzz/target.h"
#include "png/crc32.h"

namespace pelm::fuzz {
namespace {

constexpr uint8_t signature[8] = {0x89, 'P', 'N', 'G', 0x0D, 0x0A, 0x1A, 0x0A};
constexpr size_t chunk_frame = 12; // length, type, CRC

struct Chunk {
    Bytes type_and_data;
};

using Random = std::minstd_rand;

size_t below(Random &random, size_t limit) {
    return limit == 0 ? 0 : random() % limit;
}

uint32_t big_endian(const uint8_t *at) {
    return uint32_t{at[0]} << 24 | uint32_t{at[1]} << 16 | uint32_t{at[2]} << 8 | at[3];
}

void append(Bytes &to, uint32_t value) {
    for (int shift = 24; shift >= 0; shift -= 8)
        to.push_back(static_cast<uint8_t>(value >> shift));
}

// What is left of a file that is cut off counts as the last chunk's data.
std::vector<Chunk> chunks_of(const Bytes &file) {
    std::vector<Chunk> chunks;
    size_t at = sizeof signature;
    while (at + 8 <= file.size()) {
        const size_t left = file.size() - at - 8;
        const size_t length = std::min<size_t>(big_endian(file.data() + at), left);
        const auto type = file.begin() + static_cast<ptrdiff_t>(at + 4);
        chunks.push_back({Bytes(type, type + static_cast<ptrdiff_t>(4 + length))});
        at += length + chunk_frame;
    }
    return chunks;
}

Bytes file_of(const std::vector<Chunk> &chunks) {
    Bytes file(signature, signature + sizeof signature);
    for (const Chunk &chunk : chunks) {
        const Bytes &body = chunk.type_and_data;
        append(file, static_cast<uint32_t>(body.size() - 4));
        file.insert(file.end(), body.begin(), body.end());
        append(file, __PELMI_PngCrc32(body.data(), static_cast<uint32_t>(body.size())));
    }
    return file;
}

Chunk chunk_of(const char *type, const Bytes &data) {
    Chunk chunk{Bytes(type, type + 4)};
    chunk.type_and_data.insert(chunk.type_and_data.end(), data.begin(), data.end());
    return chunk;
}

bool is_of_type(const Chunk &chunk, const char *type) {
    return std::equal(type, type + 4, chunk.type_and_data.begin());
}

// By libFuzzer, with what it has learnt.
void mutate_data(Bytes &body, size_t most_more) {
    const size_t size = body.size() - 4;
    body.resize(4 + size + most_more);
    const size_t mutated = LLVMFuzzerMutate(body.data() + 4, size, size + most_more);
    body.resize(4 + mutated);
}

// A header that is one, with sides that an image of a few bytes can fill.
void give_plausible_header(Chunk &chunk, Random &random) {
    static constexpr uint8_t types[][2] = {{0, 1}, {0, 2}, {0, 4}, {0, 8}, {0, 16}, {2, 8}, {2, 16}, {3, 1},
                                           {3, 2}, {3, 4}, {3, 8}, {4, 8}, {4, 16}, {6, 8}, {6, 16}};
    const auto &type = types[below(random, std::size(types))];
    Bytes data;
    append(data, static_cast<uint32_t>(1 + below(random, 40)));
    append(data, static_cast<uint32_t>(1 + below(random, 40)));
    data.insert(data.end(), {type[1], type[0], 0, 0, static_cast<uint8_t>(below(random, 2))});
    chunk = chunk_of("IHDR", data);
}

// Image data whose bytes arrive as they are: stored blocks.
Chunk stored_image(Random &random) {
    Bytes data = {0x78, 0x01};
    const size_t blocks = 1 + below(random, 4);
    for (size_t block = 1; block <= blocks; ++block) {
        const size_t length = below(random, 300);
        data.push_back(block == blocks ? 1 : 0);
        for (const size_t word : {length, ~length}) {
            data.push_back(static_cast<uint8_t>(word));
            data.push_back(static_cast<uint8_t>(word >> 8));
        }
        for (size_t i = 0; i < length; ++i)
            data.push_back(static_cast<uint8_t>(below(random, 4) == 0 ? random() : below(random, 6)));
    }
    return chunk_of("IDAT", data);
}

void split(std::vector<Chunk> &chunks, size_t which, Random &random) {
    Bytes &body = chunks[which].type_and_data;
    const size_t cut = 4 + below(random, body.size() - 3);
    Chunk second{Bytes(body.begin(), body.begin() + 4)};
    second.type_and_data.insert(second.type_and_data.end(), body.begin() + static_cast<ptrdiff_t>(cut), body.end());
    body.resize(cut);
    chunks.insert(chunks.begin() + static_cast<ptrdiff_t>(which) + 1, std::move(second));
}

void add_transparency_or_palette(std::vector<Chunk> &chunks, size_t before, Random &random) {
    static constexpr size_t sizes[] = {2, 6, 1, 16, 3, 48, 256, 768};
    Bytes data(sizes[below(random, std::size(sizes))]);
    std::generate(data.begin(), data.end(), [&] { return static_cast<uint8_t>(random()); });
    chunks.insert(chunks.begin() + static_cast<ptrdiff_t>(before),
                  chunk_of(below(random, 2) == 0 ? "tRNS" : "PLTE", data));
}

void mutate_chunks(std::vector<Chunk> &chunks, size_t most_more, Random &random) {
    const size_t which = below(random, chunks.size());
    const auto at = chunks.begin() + static_cast<ptrdiff_t>(which);
    switch (below(random, 16)) {
    case 0: std::swap(*at, chunks[below(random, chunks.size())]); return;
    case 1: chunks.erase(at); return;
    case 2: chunks.insert(at, Chunk(chunks[below(random, chunks.size())])); return;
    case 3:
    case 4: split(chunks, which, random); return;
    case 5: add_transparency_or_palette(chunks, which, random); return;
    case 6: give_plausible_header(chunks[0], random); return;
    case 7: *at = is_of_type(*at, "IDAT") ? stored_image(random) : *at; [[fallthrough]];
    default:
        // Mostly the image data: it has the most to say.
        for (Chunk &chunk : chunks) {
            if (!is_of_type(chunk, "IDAT") || below(random, 2) == 0) continue;
            mutate_data(chunk.type_and_data, most_more);
            return;
        }
        mutate_data(at->type_and_data, most_more);
        return;
    }
}

} // namespace

Bytes mutate_png(const Bytes &file, size_t most, uint32_t seed) {
    Random random(seed);
    std::vector<Chunk> chunks = chunks_of(file);
    if (chunks.empty()) {
        chunks.emplace_back();
        give_plausible_header(chunks[0], random);
        chunks.push_back(stored_image(random));
        chunks.push_back(chunk_of("IEND", {}));
    }
    const size_t size = file_of(chunks).size();
    mutate_chunks(chunks, size < most ? std::min<size_t>(most - size, 4096) : 0, random);
    Bytes mutated = file_of(chunks);
    if (mutated.size() > most) mutated.resize(most);
    return mutated;
}

} // namespace pelm::fuzz
