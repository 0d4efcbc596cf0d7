#include "tests/wbmp/decoding.h"

#include <algorithm>

namespace pelm::test {

namespace {

// Kept between calls: making one is slow.
GuardedBuffer &output_memory() {
    static GuardedBuffer memory;
    return memory;
}

ImageDecodeInfo marked(TestSource &source, const WbmpRequest &request) {
    ImageDecodeInfo info = marked_info(&source.source, {request.format, 0, request.flags, 0, 0});
    info.outputWidth = info.outputHeight = untouched;
    info.decodeStarted = 0x90909090;
    info.decoderState = &output_memory();
    return info;
}

std::string misbehaviour_of(const WbmpDecode &decode, const WbmpRequest &request, TestSource &source,
                            const InputSource &before) {
    const ImageDecodeInfo &info = decode.info;
    std::string words;
    for (const std::string &violation : TestHost::get().violations)
        words += violation + "; ";
    if (!output_memory().intact()) words += "wrote outside the output buffer; ";
    if (!source.unchanged()) words += "wrote into the input; ";
    if (!TestHost::get().live_blocks().empty()) words += "left blocks; ";
    if (source.source.data != (before.kind == PELM_SOURCE_STREAM ? nullptr : before.data))
        words += "left something else in the source's data word; ";
    if (source.source.kind != before.kind || source.source.size != before.size ||
        source.source.hostContext != before.hostContext || source.source.bufferSize != before.bufferSize)
        words += "changed a word of the source that is not its own; ";
    if (!marks_intact(info) || info.input != &source.source || info.outputFormat != request.format ||
        info.flags != request.flags || info.decodeStarted != 0x90909090 || info.decoderState != &output_memory())
        words += "changed a word of the request that is not its own; ";
    return words;
}

} // namespace

bool WbmpDecode::is_untouched() const {
    return info.outputWidth == untouched && info.outputHeight == untouched &&
           std::all_of(output.begin(), output.end(), [](uint8_t byte) { return byte == background; });
}

WbmpDecode decode_wbmp(TestSource &source, const WbmpRequest &request, Edge edge) {
    const size_t size = output_size(request);
    uint8_t *const output = output_memory().take(size, edge);
    std::fill_n(output, size, background);
    const InputSource before = source.source;
    WbmpDecode decode{};
    decode.info = marked(source, request);
    decode.result = ZOTARPELMI_DecodeWBMP(&decode.info, output, request.box_width, request.box_height);
    decode.output.assign(output, output + size);
    decode.misbehaviour = misbehaviour_of(decode, request, source, before);
    return decode;
}

WbmpDecode decode_wbmp_to_null(TestSource &source, const WbmpRequest &request) {
    output_memory().take(0, Edge::end);
    const InputSource before = source.source;
    WbmpDecode decode{};
    decode.info = marked(source, request);
    decode.result = ZOTARPELMI_DecodeWBMP(&decode.info, nullptr, request.box_width, request.box_height);
    decode.misbehaviour = misbehaviour_of(decode, request, source, before);
    return decode;
}

::testing::AssertionResult decodes_as_modelled(const Picture &picture, uint32_t kind, const WbmpRequest &request,
                                               Edge edge) {
    TestHost::get().reset();
    TestSource source(kind, file_bytes(wbmp_of(picture)));
    const WbmpExpectation expected = expect_wbmp(picture, request, background);
    const WbmpDecode got = decode_wbmp(source, request, edge);
    const int64_t width = expected.is_drawn ? expected.width : untouched;
    const int64_t height = expected.is_drawn ? expected.height : untouched;
    if (got.result == expected.result && got.info.outputWidth == width && got.info.outputHeight == height &&
        got.output == expected.output && got.misbehaviour.empty())
        return ::testing::AssertionSuccess();
    const auto differing = std::mismatch(expected.output.begin(), expected.output.end(), got.output.begin()).first;
    const auto pixel = (differing - expected.output.begin()) / wbmp_pixel_bytes(request.format);
    return ::testing::AssertionFailure() << picture[0].size() << " x " << picture.size() << " pixels, kind " << kind
                                         << ", " << described(request) << "\n  expected: result " << expected.result
                                         << ", words " << width << " x " << height << "\n  got:      result "
                                         << got.result << ", words " << got.info.outputWidth << " x "
                                         << got.info.outputHeight << "; " << got.misbehaviour
                                         << "\n  first differing pixel: "
                                         << (got.output == expected.output ? -1 : pixel)
                                         << ", counted through the buffer";
}

::testing::AssertionResult is_refused(const Bytes &bytes, uint32_t kind, const WbmpRequest &request) {
    TestHost::get().reset();
    TestSource source(kind, bytes);
    const WbmpDecode got = decode_wbmp(source, request);
    if (got.result == 0 && got.is_untouched() && got.misbehaviour.empty()) return ::testing::AssertionSuccess();
    return ::testing::AssertionFailure() << "result " << got.result << ", words " << got.info.outputWidth << " x "
                                         << got.info.outputHeight << "; " << got.misbehaviour << "; kind " << kind
                                         << ", " << described(request);
}

} // namespace pelm::test
