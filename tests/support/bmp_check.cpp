#include "tests/support/bmp_check.h"

#include <algorithm>
#include <cstdlib>
#include <sstream>

namespace pelm::test {

namespace {

// Kept between calls: making one is slow.
GuardedBuffer &output_memory() {
    static GuardedBuffer memory;
    return memory;
}

std::string hex(const uint8_t *bytes, int count) {
    std::ostringstream text;
    text << std::hex;
    for (int i = 0; i < count; ++i)
        text << (i > 0 ? " " : "") << (bytes[i] < 16 ? "0" : "") << unsigned{bytes[i]};
    return text.str();
}

std::string listed(const std::vector<uint32_t> &sizes) {
    std::ostringstream text;
    text << sizes.size() << " block(s)";
    for (const uint32_t size : sizes)
        text << " " << size;
    return text.str();
}

std::string first_differing_pixel(const BmpRequest &request, const BmpExpectation &expected, const Bytes &got) {
    const auto [e, g] = std::mismatch(expected.output.begin(), expected.output.end(), got.begin(), got.end());
    if (e == expected.output.end()) return "";
    const int size = buffer_bytes_per_pixel(request.format);
    const int64_t pixel = (e - expected.output.begin()) / size;
    int64_t differing = 0;
    for (size_t i = 0; i < got.size(); i += static_cast<size_t>(size))
        differing +=
            !std::equal(got.begin() + static_cast<ptrdiff_t>(i), got.begin() + static_cast<ptrdiff_t>(i) + size,
                        expected.output.begin() + static_cast<ptrdiff_t>(i));
    std::ostringstream text;
    text << "\n  first differing pixel: x " << pixel % expected.row_pixels << ", y " << pixel / expected.row_pixels
         << " of the buffer (row length " << expected.row_pixels << " pixels): expected "
         << hex(expected.output.data() + pixel * size, size) << ", got " << hex(got.data() + pixel * size, size) << "; "
         << differing << " pixel(s) differ";
    return text.str();
}

std::string words(const BmpDecode &decode) {
    std::ostringstream text;
    text << "result " << decode.result << ", image " << decode.info.outputWidth << " x " << decode.info.outputHeight
         << ", decodeStarted " << decode.info.decodeStarted << ", decoderState "
         << (decode.info.decoderState == nullptr ? "NULL" : "set") << ", left: " << listed(decode.live_blocks);
    return text.str();
}

bool same_words(const BmpExpectation &expected, const BmpDecode &got) {
    if (got.result != (expected.refused ? 0 : 1) || got.info.decoderState != nullptr ||
        got.live_blocks.size() != expected.blocks_left)
        return false;
    return expected.refused || (got.info.outputWidth == expected.size.width &&
                                got.info.outputHeight == expected.size.height && got.info.decodeStarted == 1);
}

} // namespace

std::string described(const BmpFile &file, size_t length) {
    std::ostringstream text;
    text << file.width << " x " << file.height << ", " << file.bits << " bits, compression " << file.compression
         << ", header size " << file.header_size << ", pixel data stated at " << file.stated_offset()
         << " and found at " << file.rows_at() << ", " << file.palette.size() / 4 << " palette entries";
    for (const uint32_t mask : file.masks)
        text << ", mask " << std::hex << mask << std::dec;
    text << ", stride " << file.stride() << ", " << length << " of " << file_bytes(file).size() << " bytes";
    return text.str();
}

std::string described(const BmpRequest &request) {
    std::ostringstream text;
    text << "format " << request.format << ", turned " << 90 * request.quarter_turns << ", placement 0x" << std::hex
         << request.placement << std::dec << ", box " << request.box_width << " x " << request.box_height;
    return text.str();
}

ImageDecodeInfo marked_info(InputSource *source, const BmpRequest &request) {
    ImageDecodeInfo info{};
    info.input = source;
    info.outputFormat = request.format;
    info.flags = request.flags();
    info.reserved3 = 0x30303030;
    info.reserved4 = 0x40404040;
    info.imageWidth = 0x50505050;
    info.imageHeight = 0x60606060;
    info.preInitMode = 0xA0A0A0A0;
    info.reserved11 = 0xB0B0B0B0;
    info.reserved12 = 0xC0C0C0C0;
    info.reserved13 = 0xD0D0D0D0;
    info.hasTransparency = 0xE0E0E0E0;
    info.reserved16 = 0x16161616;
    info.iterative = 0x17171717;
    info.frameDelay = 0x18181818;
    info.colorTableState = 0x19191919;
    info.globalColorTable = &info;
    info.localColorTable = &info.globalColorTable;
    return info;
}

bool marks_intact(const ImageDecodeInfo &info) {
    return info.reserved3 == 0x30303030 && info.reserved4 == 0x40404040 && info.imageWidth == 0x50505050 &&
           info.imageHeight == 0x60606060 && info.preInitMode == 0xA0A0A0A0 && info.reserved11 == 0xB0B0B0B0 &&
           info.reserved12 == 0xC0C0C0C0 && info.reserved13 == 0xD0D0D0D0 && info.hasTransparency == 0xE0E0E0E0 &&
           info.reserved16 == 0x16161616 && info.iterative == 0x17171717 && info.frameDelay == 0x18181818 &&
           info.colorTableState == 0x19191919 && info.globalColorTable != nullptr && info.localColorTable != nullptr;
}

BmpDecode decode_by(const BmpCalls &calls, TestSource &source, const BmpRequest &request, size_t output_size,
                    Edge edge) {
    TestHost &host = TestHost::get();
    uint8_t *const output = output_memory().take(output_size, edge);
    std::fill_n(output, output_size, background);
    const InputSource before = source.source;

    BmpDecode decode{};
    decode.info = marked_info(&source.source, request);
    decode.result = calls(decode.info, output);
    decode.output.assign(output, output + output_size);
    decode.live_blocks = host.live_blocks();

    std::string &misbehaviour = decode.misbehaviour;
    for (const std::string &violation : host.violations)
        misbehaviour += violation + "; ";
    if (!output_memory().intact()) misbehaviour += "wrote outside the output buffer; ";
    if (!source.unchanged()) misbehaviour += "wrote into the input; ";
    if (source.source.data != before.data) misbehaviour += "left a pointer in the source's data word; ";
    if (source.source.kind != before.kind || source.source.size != before.size ||
        source.source.hostContext != before.hostContext)
        misbehaviour += "changed a word of the source that is not its own; ";
    if (!marks_intact(decode.info) || decode.info.input != &source.source ||
        decode.info.outputFormat != request.format || decode.info.flags != request.flags())
        misbehaviour += "changed a word of the request that is not its own; ";
    return decode;
}

namespace {

BmpCalls one_call(const BmpRequest &request) {
    return [&request](ImageDecodeInfo &info, uint8_t *output) {
        return ZOTARPELMI_DecodeBMP(&info, output, request.box_width, request.box_height);
    };
}

} // namespace

BmpDecode decode_bmp(TestSource &source, const BmpRequest &request, size_t output_size, Edge edge) {
    return decode_by(one_call(request), source, request, output_size, edge);
}

BmpSubject::BmpSubject(BmpFile file, uint32_t kind, int32_t buffer_size)
    : file_(std::move(file)), bytes_(file_bytes(file_)), buffer_size_(buffer_size), model_(file_, bytes_, kind),
      source_(kind, bytes_, buffer_size) {}

BmpSubject::BmpSubject(BmpFile file, size_t length, uint32_t kind, int32_t buffer_size)
    : file_(std::move(file)), bytes_(file_bytes(file_)), buffer_size_(buffer_size),
      model_(file_, (bytes_.resize(length), bytes_), kind), source_(kind, bytes_, buffer_size) {}

void BmpSubject::rewind() {
    source_.source.bufferSize = buffer_size_;
    source_.source.hostPosition = 0;
    source_.source.consumed = 0;
}

std::string BmpSubject::report(const BmpRequest &request, const BmpExpectation &expected, const BmpDecode &got) const {
    std::ostringstream text;
    text << "\n  input:    " << described(file_, bytes_.size()) << "; source kind " << source_.source.kind
         << ", bufferSize " << buffer_size_ << "\n  request:  " << described(request) << "\n  expected: result "
         << (expected.refused ? 0 : 1) << ", image " << expected.size.width << " x " << expected.size.height
         << ", left: " << expected.blocks_left << " block(s)\n  got:      " << words(got);
    if (!got.misbehaviour.empty()) text << "\n  misbehaviour: " << got.misbehaviour;
    text << first_differing_pixel(request, expected, got.output);
    return text.str();
}

std::string BmpSubject::difference(const BmpRequest &request, Edge edge) {
    return difference(one_call(request), request, expect(request), edge);
}

std::string BmpSubject::difference(const BmpCalls &calls, const BmpRequest &request, const BmpExpectation &expected,
                                   Edge edge) {
    TestHost::get().reset();
    rewind();
    const BmpDecode got = decode_by(calls, source_, request, expected.output.size(), edge);
    TestHost::get().reset();
    if (same_words(expected, got) && got.misbehaviour.empty() && got.output == expected.output) return "";
    return report(request, expected, got);
}

} // namespace pelm::test
