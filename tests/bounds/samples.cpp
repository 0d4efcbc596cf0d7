#include "tests/bounds/samples.h"

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>

#include "frame/bytes.h"
#include "tests/png/support/png_builder.h"

namespace pelm::test {

std::vector<Sample> samples() {
    std::vector<Sample> all;
    for (const auto &entry : std::filesystem::directory_iterator(PELM_SAMPLES)) {
        const std::string name = entry.path().filename().string();
        if (!name.ends_with("bmp") && !name.ends_with(".png") && !name.ends_with(".gif")) continue;
        std::ifstream file(entry.path(), std::ios::binary);
        all.push_back({name, {std::istreambuf_iterator<char>(file), {}}});
    }
    return all;
}

SampleSize size_of(const Sample &sample) {
    const Bytes &file = sample.bytes;
    if (sample.ends_with(".png")) return {read_u32be(&file[16]), read_u32be(&file[20])};
    if (sample.ends_with(".gif")) return {read_u16le(&file[6]), read_u16le(&file[8])};
    if (sample.ends_with(".bmp")) {
        const auto height = static_cast<int32_t>(read_u32le(&file[22]));
        return {read_u32le(&file[18]), static_cast<uint32_t>(std::abs(height))};
    }
    uint32_t sides[2] = {};
    size_t at = 2;
    for (uint32_t &side : sides)
        do
            side = side << 7 | (file[at] & 127);
        while ((file[at++] & 128) != 0);
    return {sides[0], sides[1]};
}

} // namespace pelm::test
