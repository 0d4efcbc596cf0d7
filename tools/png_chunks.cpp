#include "tools/png_chunks.h"

#include <algorithm>

#include <zlib.h>

namespace pelm_tool {
namespace {

constexpr uint8_t signature[png_signature_size] = {0x89, 'P', 'N', 'G', 0x0D, 0x0A, 0x1A, 0x0A};
constexpr size_t kept_data = 769; // one more than the longest palette has
constexpr size_t piece_size = 65536;
constexpr const char *no_end_chunk = "the file ends before its end chunk";

bool is_printable(uint8_t byte) {
    return byte > ' ' && byte <= '~';
}

std::string type_words(const uint8_t *type) {
    std::string words;
    for (int i = 0; i < 4; ++i)
        words += is_printable(type[i]) ? static_cast<char>(type[i]) : '?';
    return words;
}

} // namespace

size_t matching_signature_bytes(Bytes head) {
    size_t matching = 0;
    for (size_t i = 0; i < std::min(head.size(), png_signature_size); ++i)
        matching += head[i] == signature[i] ? 1 : 0;
    return matching;
}

std::string shown_chunk(const PngChunk &chunk) {
    return "the " + chunk.type + " chunk at byte " + std::to_string(chunk.position);
}

PngChunks::PngChunks(InputSource &source) : source_(source) {
    ZOTARPELM_Seek_IO(&source_, 0, 0);
}

size_t PngChunks::read(uint8_t *to, size_t count) {
    const int32_t got = ZOTARPELM_Read_IO(&source_, to, static_cast<int32_t>(count));
    const size_t delivered = got < 1 ? 0 : static_cast<size_t>(got);
    position_ += static_cast<int64_t>(delivered);
    return delivered;
}

std::string PngChunks::read_signature() {
    uint8_t bytes[png_signature_size];
    const size_t got = read(bytes, sizeof bytes);
    if (matching_signature_bytes({bytes, got}) != got) return "the PNG signature is damaged";
    return got < sizeof bytes ? "the file ends inside the PNG signature" : "";
}

// Runs over data and checksum.
std::string PngChunks::verify(PngChunk &chunk, const uint8_t *type) {
    std::vector<uint8_t> piece(std::min<size_t>(piece_size, chunk.length));
    uLong crc = crc32(0, type, 4);
    for (uint32_t left = chunk.length; left > 0;) {
        const size_t wanted = std::min<size_t>(left, piece.size());
        if (read(piece.data(), wanted) < wanted) return "the file ends inside " + shown_chunk(chunk);
        crc = crc32(crc, piece.data(), static_cast<uInt>(wanted));
        const size_t kept = std::min(wanted, kept_data - chunk.data.size());
        chunk.data.insert(chunk.data.end(), piece.begin(), piece.begin() + static_cast<ptrdiff_t>(kept));
        left -= static_cast<uint32_t>(wanted);
    }
    uint8_t stored[4];
    if (read(stored, sizeof stored) < sizeof stored) return "the file ends inside " + shown_chunk(chunk);
    return read_be32(stored, 0) == crc ? "" : "wrong checksum of " + shown_chunk(chunk);
}

std::string PngChunks::read_next(PngChunk &to) {
    uint8_t frame[8];
    to = {position_, 0, {}, {}};
    const size_t got = read(frame, sizeof frame);
    if (got < 4) return no_end_chunk;
    to.length = read_be32(frame, 0);
    if (to.length > static_cast<uint32_t>(source_.size)) {
        return "the chunk at byte " + std::to_string(to.position) + " claims " + std::to_string(to.length) +
               " bytes, more than the file has";
    }
    if (got < sizeof frame) return no_end_chunk;
    to.type = type_words(frame + 4);
    return verify(to, frame + 4);
}

} // namespace pelm_tool
