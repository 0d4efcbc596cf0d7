#include "tests/support/bmp_model.h"

#include <algorithm>

#include "PelmImageDecoder.h"

namespace pelm::test {

namespace {

int64_t truncated(int64_t dividend, int64_t divisor) {
    return dividend / divisor;
}

int64_t halved_down(int64_t value) {
    return value >= 0 ? value / 2 : -((1 - value) / 2);
}

uint32_t rgb565(uint32_t high, uint32_t green, uint32_t low) {
    return (high >> 3) << 11 | (green >> 2) << 5 | (low >> 3);
}

uint32_t little_endian(const Bytes &bytes, int64_t at, int count) {
    uint32_t value = 0;
    for (int i = 0; i < count; ++i)
        value |= uint32_t{bytes[static_cast<size_t>(at + i)]} << 8 * i;
    return value;
}

// 5 bits are widened with zeros, as are 4.
Rgb expanded(uint32_t pixel, const std::vector<uint32_t> &masks) {
    if (masks.empty() || masks[0] == 0x7C00)
        return {static_cast<uint8_t>((pixel >> 10 & 31) * 8), static_cast<uint8_t>((pixel >> 5 & 31) * 8),
                static_cast<uint8_t>((pixel & 31) * 8)};
    if (masks[0] == 0xF800)
        return {static_cast<uint8_t>((pixel >> 11 & 31) * 8), static_cast<uint8_t>((pixel >> 5 & 63) * 4),
                static_cast<uint8_t>((pixel & 31) * 8)};
    return {static_cast<uint8_t>((pixel >> 8 & 15) * 16), static_cast<uint8_t>((pixel >> 4 & 15) * 16),
            static_cast<uint8_t>((pixel & 15) * 16)};
}

} // namespace

ScaledSize scaled_size(int32_t width, int32_t height, int32_t bw, int32_t bh, uint32_t placement) {
    if (placement == 0x700) return {bw, bh, false};
    if (bw >= width && bh >= height) return {width, height, true};
    const int64_t h = truncated(int64_t{height} * bw, width);
    const int64_t w = truncated(int64_t{width} * bh, height);
    if ((h == bh || w == bw) && bw <= width && bh <= height) return {bw, bh, false};
    ScaledSize size{width, height, false};
    if (bw < width) size = {bw, h, false};
    if (bh < size.height) size = {w, bh, false};
    return size;
}

int bytes_per_pixel(uint32_t format) {
    switch (format) {
    case 0: return 2;
    case 1:
    case 6: return 3;
    case 5:
    case 7:
    case 8: return 4;
    default: return 0;
    }
}

int buffer_bytes_per_pixel(uint32_t format) {
    const int written = bytes_per_pixel(format);
    return written > 0 ? written : 4;
}

std::array<uint8_t, 4> packed_pixel(Rgb color, uint32_t format, bool blue_first) {
    const auto [r, g, b] = color;
    const uint32_t value = blue_first && format == 6 ? rgb565(b, g, r) : rgb565(r, g, b);
    const uint8_t low = static_cast<uint8_t>(value);
    const uint8_t high = static_cast<uint8_t>(value >> 8);
    switch (format) {
    case 0: return {low, high};
    case 1: return {r, g, b};
    case 5: return {255, r, g, b};
    case 6: return {low, high, 255};
    case 7: return {r, g, b, 255};
    case 8: return {b, g, r, 255};
    default: return {};
    }
}

std::vector<BmpBand> bands_of(int64_t scaled_height, const std::vector<int32_t> &rows) {
    std::vector<BmpBand> bands;
    int64_t done = 0;
    int64_t at = 0;
    bool begun = false;
    for (const int32_t asked : rows) {
        if (begun && asked > 0) at += asked;
        begun = true;
        const int64_t count = std::min<int64_t>(asked, scaled_height - done);
        if (count <= 0) continue;
        bands.push_back({done, count, at});
        done += count;
    }
    return bands;
}

// The caller's buffer as a line of pixels, and the place of an image pixel on it. Rows above the image have negative
// numbers, and places off the line are dropped.
struct BmpModel::Walk {
    const BmpRequest &request;
    ScaledSize size;
    int64_t row_pixels;
    int64_t rows;
    Bytes output;
    std::vector<char> landed; // 1 where a pixel was put
    bool blue_first;
    bool band_only = false; // the buffer begins with the first row that is put

    Walk(const BmpRequest &wanted, const ScaledSize &scaled, bool reversed, uint8_t background)
        : request(wanted), size(scaled), row_pixels(wanted.is_exact() ? scaled.width : wanted.box_width),
          rows(wanted.is_exact() ? scaled.height : wanted.box_height), blue_first(reversed) {
        const int64_t pixels = row_pixels > 0 && rows > 0 ? row_pixels * rows : 0;
        output.assign(static_cast<size_t>(pixels * buffer_bytes_per_pixel(wanted.format)), background);
        landed.assign(static_cast<size_t>(pixels), 0);
    }

    int64_t place(int64_t x, int64_t y) const {
        const bool turned = request.quarter_turns % 2 == 1;
        const int64_t left = halved_down(row_pixels - (turned ? size.height : size.width));
        const int64_t top = band_only ? 0 : halved_down(rows - (turned ? size.width : size.height));
        switch (request.quarter_turns) {
        case 0: return (top + y) * row_pixels + left + x;
        case 1: return (top + x) * row_pixels + left + size.height - 1 - y;
        case 2: return (top + size.height - 1 - y) * row_pixels + left + size.width - 1 - x;
        default: return (top + size.width - 1 - x) * row_pixels + left + y;
        }
    }

    void put(int64_t x, int64_t y, Rgb color) {
        const int64_t at = place(x, y);
        if (at < 0 || at >= static_cast<int64_t>(landed.size())) return;
        const auto pixel = packed_pixel(color, request.format, blue_first);
        const int size_of_pixel = bytes_per_pixel(request.format);
        std::copy_n(pixel.begin(), size_of_pixel, output.begin() + static_cast<ptrdiff_t>(at * size_of_pixel));
        landed[static_cast<size_t>(at)] = size_of_pixel > 0;
    }
};

BmpModel::BmpModel(const BmpFile &file, const Bytes &bytes, uint32_t kind)
    : kind_(kind), width_(file.width), height_(file.height < 0 ? -file.height : file.height), bits_(file.bits),
      top_down_(file.height < 0), bit_fields_(file.bits == 16 && file.compression == 3),
      size_(static_cast<int64_t>(bytes.size())), stride_(file.stride()), row_bytes_(file.row_bytes()),
      rows_start_(file.stated_offset()) {
    if (bits_ == 1 || bits_ == 4 || bits_ == 8) set_palette(file, bytes);
    if (kind_ == PELM_SOURCE_SEQUENTIAL) // rows start where the header has been read
        rows_start_ = 54 + palette_size_ + (bit_fields_ ? 12 : 0);
    set_refusal(bytes.size());
    if (!refused_) unpack(file, bytes);
}

void BmpModel::set_palette(const BmpFile &file, const Bytes &bytes) {
    const uint32_t offset = file.stated_offset();
    const uint32_t entries = offset <= 54 ? 13 : (offset - 54) / 4 % 0x10000;
    if (entries >= 0x8000) {
        refused_ = true;
        return;
    }
    palette_size_ = int64_t{entries} * 4;
    Bytes loaded(1024, 0);
    for (int64_t i = 0; i < std::min<int64_t>(palette_size_, 1024) && 54 + i < size_; ++i)
        loaded[static_cast<size_t>(i)] = bytes[static_cast<size_t>(54 + i)];
    for (size_t i = 0; i < loaded.size(); i += 4)
        palette_.push_back({loaded[i + 2], loaded[i + 1], loaded[i]});
}

void BmpModel::set_refusal(size_t size) {
    const bool memory = kind_ == PELM_SOURCE_MEMORY;
    const int64_t bytes = static_cast<int64_t>(size);
    if (bytes < 54) {
        refused_ = true;
        blocks_left_ = memory ? 0 : 1;
    } else if (!refused_ && bit_fields_ && bytes < 66) {
        refused_ = true;
        blocks_left_ = memory ? 0 : 1;
    } else if (!refused_ && !memory && bytes < 54 + palette_size_) {
        refused_ = true;
        blocks_left_ = 2;
    }
}

Rgb BmpModel::pixel_at(const BmpFile &file, const Bytes &bytes, int64_t row_start, int32_t x, uint8_t &fourth) const {
    const int64_t bit = int64_t{x} * bits_;
    const int64_t at = row_start + bit / 8;
    switch (bits_) {
    case 1:
    case 4:
    case 8: {
        const int64_t from_the_right = 8 - bits_ - bit % 8;
        const uint32_t index = bytes[static_cast<size_t>(at)] >> from_the_right & ((1u << bits_) - 1);
        return palette_[index];
    }
    case 16: return expanded(little_endian(bytes, at, 2), file.masks);
    default: {
        const uint32_t color = little_endian(bytes, at, bits_ / 8);
        fourth = static_cast<uint8_t>(color >> 24);
        return {static_cast<uint8_t>(color >> 16), static_cast<uint8_t>(color >> 8), static_cast<uint8_t>(color)};
    }
    }
}

void BmpModel::unpack(const BmpFile &file, const Bytes &bytes) {
    if (bits_ != 1 && bits_ != 4 && bits_ != 8 && bits_ != 16 && bits_ != 24 && bits_ != 32) return;
    image_.assign(static_cast<size_t>(height_), {});
    for (int32_t y = 0; y < height_; ++y) {
        const int64_t start = rows_start_ + stride_ * row_in_file(y);
        if (start + row_bytes_ > size_) continue;
        uint8_t fourth = 0;
        for (int32_t x = 0; x < width_; ++x)
            image_[static_cast<size_t>(y)].push_back(pixel_at(file, bytes, start, x, fourth));
    }
}

// How many rows, in file order, are delivered well enough to be used.
size_t BmpModel::rows_reached(bool one_to_one) const {
    if (image_.empty()) return 0;
    size_t rows = 0;
    for (int32_t i = 0; i < height_; ++i, ++rows) {
        const int64_t start = rows_start_ + stride_ * i;
        const bool scans_memory = kind_ == PELM_SOURCE_MEMORY && !one_to_one;
        const bool whole = scans_memory ? start < size_ - 2 && start + row_bytes_ <= size_ : start + stride_ <= size_;
        if (!whole) break;
    }
    return rows;
}

// A row of a band, counted in the order in which rows are finished, and where it goes.
struct BandRow {
    int64_t row, place;
};

BandRow band_row(const BmpBand &band, int64_t i, bool top_down, bool sequential) {
    const int64_t below = top_down ? i : band.count - 1 - i;
    return {band.first + below, band.at + (top_down && sequential ? -below : below)};
}

void BmpModel::paint_one_to_one(Walk &walk, const BmpBand &band) const {
    const int64_t reached = static_cast<int64_t>(rows_reached(true));
    for (int64_t i = 0; i < band.count; ++i) {
        const BandRow at = band_row(band, i, top_down_, kind_ == PELM_SOURCE_SEQUENTIAL);
        if (row_in_file(static_cast<int32_t>(at.row)) >= reached) continue;
        for (int32_t x = 0; x < width_; ++x)
            walk.put(x, at.place, image_[static_cast<size_t>(at.row)][static_cast<size_t>(x)]);
    }
}

Rgb BmpModel::averaged(const int64_t (&columns)[2], const int64_t (&rows)[2]) const {
    uint32_t sum[3] = {};
    // 32-bit samples are divided before they are summed, the others afterwards.
    const uint32_t before = bits_ == 32 ? 4 : 1;
    const uint32_t after = bits_ == 32 ? 1 : 4;
    for (const int64_t y : rows)
        for (const int64_t x : columns) {
            const Rgb sample = image_[static_cast<size_t>(y)][static_cast<size_t>(x)];
            sum[0] += sample.r / before;
            sum[1] += sample.g / before;
            sum[2] += sample.b / before;
        }
    return {static_cast<uint8_t>(sum[0] / after), static_cast<uint8_t>(sum[1] / after),
            static_cast<uint8_t>(sum[2] / after)};
}

void BmpModel::paint_scaled(Walk &walk, const BmpBand &band) const {
    const int64_t reached = static_cast<int64_t>(rows_reached(false));
    const int64_t sw = walk.size.width;
    const int64_t sh = walk.size.height;
    const int64_t w = width_;
    const int64_t h = height_;
    for (int64_t i = 0; i < band.count; ++i) {
        const BandRow at = band_row(band, i, top_down_, kind_ == PELM_SOURCE_SEQUENTIAL);
        const int64_t rows[2] = {(at.row * h + h / 4) / sh, (at.row * h + 3 * h / 4) / sh};
        if (row_in_file(static_cast<int32_t>(rows[0])) >= reached ||
            row_in_file(static_cast<int32_t>(rows[1])) >= reached)
            continue;
        for (int64_t j = 0; j < sw; ++j) {
            const int64_t columns[2] = {(j * w + w / 4) / sw, (j * w + 3 * w / 4) / sw};
            walk.put(j, at.place, averaged(columns, rows));
        }
    }
}

void BmpModel::paint(Walk &walk, const BmpBand &band) const {
    if (refused_ || walk.output.empty()) return;
    if (walk.size.one_to_one)
        paint_one_to_one(walk, band);
    else if (walk.size.width > 0 && walk.size.height > 0 && height_ > 0)
        paint_scaled(walk, band);
}

ScaledSize BmpModel::size_for(const BmpRequest &request) const {
    const bool turned = request.quarter_turns % 2 == 1;
    return scaled_size(width_, height_, turned ? request.box_height : request.box_width,
                       turned ? request.box_width : request.box_height, request.placement);
}

bool BmpModel::reverses(const BmpRequest &request, const ScaledSize &size) const {
    return request.format == 6 && !size.one_to_one && bits_ != 32;
}

BmpExpectation BmpModel::expect(const BmpRequest &request, uint8_t background) const {
    return expect_bands(request, {INT32_MAX}, background);
}

BmpExpectation BmpModel::expect_bands(const BmpRequest &request, const std::vector<int32_t> &rows,
                                      uint8_t background) const {
    const ScaledSize size = size_for(request);
    Walk walk(request, size, reverses(request, size), background);
    for (const BmpBand &band : bands_of(size.height, rows))
        paint(walk, band);
    const size_t landed = static_cast<size_t>(std::count(walk.landed.begin(), walk.landed.end(), 1));
    return {refused_, blocks_left_, size, std::move(walk.output), walk.row_pixels, landed};
}

Bytes BmpModel::expect_line(const BmpRequest &request, int64_t first, int64_t count, uint8_t background) const {
    BmpRequest plain = request;
    plain.quarter_turns = 0;
    plain.placement = request.stretches() ? 0x700 : 0;
    const ScaledSize size = size_for(plain);
    plain.box_height = static_cast<int32_t>(count);
    Walk walk(plain, size, reverses(plain, size), background);
    walk.band_only = true;
    paint(walk, {first, count, 0});
    return std::move(walk.output);
}

} // namespace pelm::test
