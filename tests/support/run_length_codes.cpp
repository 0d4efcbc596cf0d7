#include "tests/support/run_length_codes.h"

#include <algorithm>
#include <cstdlib>

namespace pelm::test {

namespace {

void append(Bytes &codes, std::initializer_list<uint32_t> more) {
    for (const uint32_t byte : more)
        codes.push_back(static_cast<uint8_t>(byte));
}

class Encoder {
public:
    Encoder(int bits, Noise &noise, const CodeHabits &habits) : bits_(bits), noise_(noise), habits_(habits) {}

    void add_row(const std::vector<uint32_t> &row) {
        size_t end = row.size();
        while (habits_.leaves_out && end > 0 && row[end - 1] == 0)
            --end;
        for (size_t x = 0; x < end;) {
            if (habits_.deltas && noise_.below(5) == 0) append(codes, {0, 2, noise_.next(), noise_.next()});
            x += noise_.below(2) == 0 ? add_run(row, x, end) : add_literals(row, x, end);
        }
        if (habits_.overshoots && end == row.size() && noise_.below(2) == 0) append(codes, {200, noise_.next()});
        append(codes, {0, habits_.ends_often && noise_.below(2) == 0 ? 1u : 0u});
    }

    Bytes codes;

private:
    // A run of one index, or of two that alternate. The number of indices that it stands for.
    size_t add_run(const std::vector<uint32_t> &row, size_t x, size_t end) {
        const size_t distance = bits_ == 4 ? 2 : 1;
        size_t length = 1;
        while (x + length < end && length < 255 && (length < distance || row[x + length] == row[x + length - distance]))
            ++length;
        length = 1 + noise_.below(static_cast<uint32_t>(length));
        const uint32_t second = length > 1 && bits_ == 4 ? row[x + 1] : noise_.below(16);
        const bool overshoots = habits_.overshoots && x + length == row.size() && noise_.below(2) == 0;
        const uint32_t written = static_cast<uint32_t>(length) + (overshoots ? noise_.below(5) : 0);
        append(codes, {std::min(written, 255u), bits_ == 4 ? row[x] << 4 | second : row[x]});
        return length;
    }

    // Literal indices, at least three; at the row's end any further ones are noise.
    size_t add_literals(const std::vector<uint32_t> &row, size_t x, size_t end) {
        const size_t longest = std::min<size_t>(255, end - x);
        const size_t length = 1 + noise_.below(static_cast<uint32_t>(longest));
        if (length < 3 && !(habits_.overshoots && x + length == row.size())) return add_run(row, x, end);
        const size_t written = std::max<size_t>(length, 3);
        append(codes, {0, static_cast<uint32_t>(written)});
        std::vector<uint32_t> indices(row.begin() + static_cast<ptrdiff_t>(x),
                                      row.begin() + static_cast<ptrdiff_t>(x + length));
        while (indices.size() < written)
            indices.push_back(noise_.below(1u << bits_));
        Bytes bytes = pack_row(indices, static_cast<uint16_t>(bits_));
        bytes.resize((bytes.size() + 1) / 2 * 2, static_cast<uint8_t>(noise_.next()));
        codes.insert(codes.end(), bytes.begin(), bytes.end());
        return length;
    }

    const int bits_;
    Noise &noise_;
    const CodeHabits habits_;
};

} // namespace

Bytes run_length_codes(const Picture &rows, int bits, Noise &noise, const CodeHabits &habits) {
    Encoder encoder(bits, noise, habits);
    for (const auto &row : rows)
        encoder.add_row(row);
    if (habits.ends_bitmap) append(encoder.codes, {0, 1});
    return encoder.codes;
}

Picture expanded_rows(const Bytes &codes, int bits, int32_t width, int32_t most) {
    Picture rows;
    std::vector<uint32_t> row;
    const auto put = [&](uint32_t index) {
        if (row.size() < static_cast<size_t>(width)) row.push_back(index);
    };
    const auto index_in = [&](uint32_t byte, size_t i) {
        return bits == 8 ? byte : i % 2 == 0 ? byte / 16 : byte % 16;
    };
    size_t at = 0;
    while (at + 2 <= codes.size() && rows.size() < static_cast<size_t>(most)) {
        const uint32_t first = codes[at];
        const uint32_t second = codes[at + 1];
        at += 2;
        if (first > 0) {
            for (uint32_t i = 0; i < first; ++i)
                put(index_in(second, i));
        } else if (second < 2) {
            row.resize(static_cast<size_t>(width), 0);
            rows.push_back(row);
            row.clear();
        } else if (second == 2) {
            at += 2;
        } else {
            for (uint32_t i = 0; i < second; ++i) {
                const size_t byte = at + (bits == 8 ? i : i / 2);
                put(byte < codes.size() ? index_in(codes[byte], i) : 0); // cut off: the row will not be ended
            }
            at += bits == 8 ? second : (second + 1) / 2;
            at += at % 2;
        }
    }
    return rows;
}

BmpFile run_length_bmp(int bits, int32_t width, int32_t height, Bytes codes, Bytes palette) {
    BmpFile file;
    file.width = width;
    file.height = height;
    file.bits = static_cast<uint16_t>(bits);
    file.compression = bits == 8 ? 1 : 2;
    file.palette = std::move(palette);
    file.rows = {std::move(codes)};
    return file;
}

PlainTwin plain_twin(const BmpFile &file, const Bytes &codes) {
    PlainTwin twin{file, 0};
    const int32_t height = std::abs(file.height);
    const Picture rows = expanded_rows(codes, file.bits, file.width, height);
    twin.file.bits = 8;
    twin.file.compression = 0;
    twin.file.rows.clear();
    for (int32_t i = 0; i < height; ++i) {
        const size_t row = static_cast<size_t>(i);
        twin.file.rows.push_back(row < rows.size() ? pack_row(rows[row], 8)
                                                   : Bytes(static_cast<size_t>(file.width), 0));
    }
    twin.length = twin.file.rows_at() + rows.size() * static_cast<size_t>(twin.file.stride());
    return twin;
}

} // namespace pelm::test
