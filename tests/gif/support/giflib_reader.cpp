#include "tests/gif/support/giflib_reader.h"

#include <gif_lib.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iostream>
#include <iterator>

namespace pelm::test {

namespace {

namespace fs = std::filesystem;

struct Reading {
    const Bytes &file;
    size_t at;
};

int read_bytes(GifFileType *gif, GifByteType *to, int count) {
    Reading &reading = *static_cast<Reading *>(gif->UserData);
    const size_t size = std::min(static_cast<size_t>(count), reading.file.size() - reading.at);
    memcpy(to, reading.file.data() + reading.at, size);
    reading.at += size;
    return static_cast<int>(size);
}

ColourTable table_of(const ColorMapObject *map) {
    ColourTable table;
    for (int i = 0; map != nullptr && i < map->ColorCount; ++i)
        for (const GifByteType channel : {map->Colors[i].Red, map->Colors[i].Green, map->Colors[i].Blue})
            table.push_back(channel);
    return table;
}

GiflibImage image_of(GifFileType *gif, int index, const GraphicControl &before) {
    const SavedImage &saved = gif->SavedImages[index];
    const GifImageDesc &desc = saved.ImageDesc;
    GiflibImage image;
    image.place = {static_cast<uint16_t>(desc.Left), static_cast<uint16_t>(desc.Top), static_cast<uint16_t>(desc.Width),
                   static_cast<uint16_t>(desc.Height), desc.Interlace};
    image.local = table_of(desc.ColorMap);
    image.indices.assign(saved.RasterBits, saved.RasterBits + ptrdiff_t{desc.Width} * desc.Height);
    image.control = before; // of the image before, where this one has none
    GraphicsControlBlock block;
    if (DGifSavedExtensionToGCB(gif, index, &block) == GIF_OK)
        image.control = {static_cast<uint8_t>(block.DisposalMode), block.TransparentColor,
                         static_cast<uint16_t>(block.DelayTime), 0};
    return image;
}

} // namespace

std::optional<GiflibFile> read_with_giflib(const Bytes &file) {
    Reading reading{file, 0};
    int error = 0;
    GifFileType *const gif = DGifOpen(&reading, read_bytes, &error);
    if (gif == nullptr) return std::nullopt;
    std::optional<GiflibFile> read;
    if (DGifSlurp(gif) == GIF_OK) {
        read = GiflibFile{static_cast<uint16_t>(gif->SWidth),
                          static_cast<uint16_t>(gif->SHeight),
                          static_cast<uint8_t>(gif->SBackGroundColor),
                          table_of(gif->SColorMap),
                          {}};
        GraphicControl control;
        for (int i = 0; i < gif->ImageCount; ++i) {
            read->images.push_back(image_of(gif, i, control));
            control = read->images.back().control;
        }
    }
    DGifCloseFile(gif, &error);
    return read;
}

namespace {

bool skip_extension(GifFileType *gif) {
    int label = 0;
    GifByteType *block = nullptr;
    if (DGifGetExtension(gif, &label, &block) != GIF_OK) return false;
    while (block != nullptr)
        if (DGifGetExtensionNext(gif, &block) != GIF_OK) return false;
    return true;
}

bool goes_on_to_an_image(GifFileType *gif) {
    GifRecordType record = UNDEFINED_RECORD_TYPE;
    while (DGifGetRecordType(gif, &record) == GIF_OK) {
        if (record == IMAGE_DESC_RECORD_TYPE) return DGifGetImageDesc(gif) == GIF_OK;
        if (record != EXTENSION_RECORD_TYPE || !skip_extension(gif)) return false;
    }
    return false;
}

// Rows as they are stored go to the screen rows that the interlacing says.
bool take_rows(GifFileType *gif, GiflibImage &image) {
    const size_t width = image.place.width;
    image.indices.resize(width * image.place.height);
    std::vector<uint32_t> order = interlaced_order(image.place.height);
    for (uint32_t row = 0; row < image.place.height; ++row) {
        const uint32_t to = image.place.interlaced ? order[row] : row;
        if (DGifGetLine(gif, image.indices.data() + to * width, static_cast<int>(width)) != GIF_OK) return false;
    }
    return true;
}

} // namespace

std::optional<GiflibFile> first_image_with_giflib(const Bytes &file) {
    Reading reading{file, 0};
    int error = 0;
    GifFileType *const gif = DGifOpen(&reading, read_bytes, &error);
    if (gif == nullptr) return std::nullopt;
    std::optional<GiflibFile> read;
    if (goes_on_to_an_image(gif)) {
        const GifImageDesc &desc = gif->Image;
        GiflibImage image;
        image.place = {static_cast<uint16_t>(desc.Left), static_cast<uint16_t>(desc.Top),
                       static_cast<uint16_t>(desc.Width), static_cast<uint16_t>(desc.Height), desc.Interlace};
        image.local = table_of(desc.ColorMap);
        if (image.place.width != 0 && image.place.height != 0 && take_rows(gif, image))
            read = GiflibFile{static_cast<uint16_t>(gif->SWidth),
                              static_cast<uint16_t>(gif->SHeight),
                              static_cast<uint8_t>(gif->SBackGroundColor),
                              table_of(gif->SColorMap),
                              {image}};
    }
    DGifCloseFile(gif, &error);
    return read;
}

std::array<uint8_t, 3> table_colour(const ColourTable &table, size_t index) {
    if (index * 3 + 2 >= table.size()) return {};
    return {table[index * 3], table[index * 3 + 1], table[index * 3 + 2]};
}

std::vector<fs::path> shared_gifs() {
    const char *const elsewhere = getenv("PELM_TEST_IMAGES");
    const fs::path folder = elsewhere != nullptr ? elsewhere : PELM_SHARED_IMAGES;
    std::vector<fs::path> found;
    std::error_code absent;
    for (const auto &entry : fs::directory_iterator(folder, absent))
        if (entry.path().extension() == ".gif") found.push_back(entry.path());
    std::sort(found.begin(), found.end());
    if (found.empty()) std::cout << "not tested: there are no GIF files in " << folder << "; set PELM_TEST_IMAGES\n";
    return found;
}

Bytes contents_of(const fs::path &path) {
    std::ifstream stream(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(stream), {}};
}

} // namespace pelm::test
