// Runs BMP decodes against guard pages and compares everything they leave behind with the model. A difference
// is told as a bug report: the input, what was expected, what came instead, and the first differing pixel.
#pragma once

#include <functional>
#include <memory>

#include "tests/support/bmp_model.h"
#include "tests/support/test_host.h"

namespace pelm::test {

inline constexpr uint8_t background = 0x5A;

std::string described(const BmpFile &file, size_t length);
std::string described(const BmpRequest &request);

// A request with every word that the library must leave alone set to a value of its own.
ImageDecodeInfo marked_info(InputSource *source, const BmpRequest &request);
bool marks_intact(const ImageDecodeInfo &info);

// What one call left behind.
struct BmpDecode {
    int32_t result;
    ImageDecodeInfo info;
    Bytes output;
    std::vector<uint32_t> live_blocks;
    std::string misbehaviour; // empty: none
};

// Calls into the library with a request and an output, and gives a result: that of one call, or of the last of several.
using BmpCalls = std::function<int32_t(ImageDecodeInfo &info, uint8_t *output)>;

// Makes the calls with a buffer of `output_size` bytes of background at the given edge. The host is not reset.
BmpDecode decode_by(const BmpCalls &calls, TestSource &source, const BmpRequest &request, size_t output_size,
                    Edge edge = Edge::end);

// In one call, into a buffer of `output_size` bytes of background at the given edge. The host is not reset.
BmpDecode decode_bmp(TestSource &source, const BmpRequest &request, size_t output_size, Edge edge = Edge::end);

// A file as a source of one kind, with its model.
class BmpSubject {
public:
    explicit BmpSubject(BmpFile file, uint32_t kind = PELM_SOURCE_MEMORY, int32_t buffer_size = 4096);
    // Only the first `length` bytes are there.
    BmpSubject(BmpFile file, size_t length, uint32_t kind, int32_t buffer_size);

    // Decodes with a well-behaved host and compares. Empty: as computed.
    std::string difference(const BmpRequest &request, Edge edge = Edge::end);

    // The same for other calls than the one that decodes at once, and for what they are expected to leave.
    std::string difference(const BmpCalls &calls, const BmpRequest &request, const BmpExpectation &expected,
                           Edge edge = Edge::end);

    BmpExpectation expect(const BmpRequest &request) const { return model_.expect(request, background); }
    const BmpModel &model() const { return model_; }
    const BmpFile &file() const { return file_; }
    InputSource &source() { return source_.source; } // as the last decode left it
    void rewind();

private:
    std::string report(const BmpRequest &request, const BmpExpectation &expected, const BmpDecode &got) const;

    BmpFile file_;
    Bytes bytes_;
    int32_t buffer_size_;
    BmpModel model_;
    TestSource source_;
};

} // namespace pelm::test
