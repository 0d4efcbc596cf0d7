// Run-length files with the model of what they show.
#pragma once

#include "tests/bmp/expectations.h"
#include "tests/support/run_length_codes.h"
#include "tests/support/two_step.h"

namespace pelm::test {

// A file of codes, cut behind the last one, with the model of the picture that they make.
class Coded {
public:
    Coded(BmpFile file, const Bytes &codes, uint32_t kind, int32_t buffer_size)
        : file_(std::move(file)), twin_(plain_twin(file_, codes)), bytes_(bytes_of(file_, codes.size())),
          model_(twin_.file, twin_bytes(), kind), source_(kind, bytes_, buffer_size) {}

    Coded(int bits, int32_t width, int32_t height, const Bytes &codes, uint32_t kind = PELM_SOURCE_MEMORY,
          int32_t buffer_size = 4096)
        : Coded(run_length_bmp(bits, width, height, codes, noise_palette(1u << bits, 1)), codes, kind, buffer_size) {}

    ::testing::AssertionResult decodes(const BmpRequest &request, Edge edge = Edge::end) {
        TestHost::get().reset();
        source_.source.hostPosition = 0;
        const BmpExpectation expected = model_.expect(request, background);
        const BmpDecode got = decode_by(two_steps(request), source_, request, expected.output.size(), edge);
        if (got.result == 1 && got.misbehaviour.empty() && got.output == expected.output && got.live_blocks.empty() &&
            got.info.decoderState == nullptr)
            return ::testing::AssertionSuccess();
        const auto differing = std::mismatch(expected.output.begin(), expected.output.end(), got.output.begin()).first;
        return ::testing::AssertionFailure()
               << described(file_, bytes_.size()) << "; kind " << source_.source.kind << "; " << described(request)
               << "\n  result " << got.result << ", " << got.live_blocks.size() << " blocks left, " << got.misbehaviour
               << " first differing byte " << differing - expected.output.begin() << " of " << expected.output.size()
               << "\n  codes " << ::testing::PrintToString(Bytes(bytes_.begin() + file_.rows_at(), bytes_.end()));
    }

    const BmpModel &model() const { return model_; }
    TestSource &source() { return source_; }
    const BmpFile &file() const { return file_; }

private:
    static Bytes bytes_of(const BmpFile &file, size_t codes) {
        Bytes bytes = file_bytes(file);
        bytes.resize(file.rows_at() + codes);
        return bytes;
    }
    Bytes twin_bytes() const {
        Bytes bytes = file_bytes(twin_.file);
        bytes.resize(twin_.length);
        return bytes;
    }

    BmpFile file_;
    PlainTwin twin_;
    Bytes bytes_;
    BmpModel model_;
    TestSource source_;
};

} // namespace pelm::test
