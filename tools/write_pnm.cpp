// The header-and-bytes kinds: PPM (P6), PAM (P7), and the bare buffer.
#include "tools/writers.h"

#include <string>

#include "tools/interrupt.h"

namespace pelm_tool {
namespace {

void write_rows(Output &output, const Picture &picture, size_t channels) {
    std::vector<uint8_t> row(picture.width * channels);
    for (size_t y = 0; y < picture.height; ++y) {
        throw_if_interrupted();
        unpack_row(picture, y, channels, row.data());
        output.write(row.data(), row.size());
    }
}

} // namespace

void write_ppm(Output &output, const Picture &picture) {
    const std::string header =
        "P6\n" + std::to_string(picture.width) + " " + std::to_string(picture.height) + "\n255\n";
    output.write(header.data(), header.size());
    write_rows(output, picture, 3);
}

void write_pam(Output &output, const Picture &picture) {
    const size_t channels = channels_of(picture);
    const std::string header = "P7\nWIDTH " + std::to_string(picture.width) + "\nHEIGHT " +
                               std::to_string(picture.height) + "\nDEPTH " + std::to_string(channels) +
                               "\nMAXVAL 255\nTUPLTYPE " + (channels == 4 ? "RGB_ALPHA" : "RGB") + "\nENDHDR\n";
    output.write(header.data(), header.size());
    write_rows(output, picture, channels);
}

void write_raw(Output &output, const Picture &picture) {
    output.write(picture.bytes.data(), picture.bytes.size());
}

} // namespace pelm_tool
