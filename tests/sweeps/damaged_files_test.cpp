// Every byte of the tiny files set to every value, and every bit of larger ones flipped, decoded in ever other ways
// from memory that ends with the file, into memory that ends with the buffer. Whatever comes of it: no fault, a result
// and a request that the model knows (fuzz/request_model.h), work and blocks by the account (fuzz/account.h).
// A damaged PNG is refused for its checksum; with that written anew the damage is seen.
#include <gtest/gtest.h>

#include "tests/png/support/png_builder.h"
#include "tests/sweeps/at_fault.h"
#include "tests/sweeps/extent.h"
#include "tests/sweeps/plans.h"

namespace pelm::sweeps {
namespace {

using fuzz::Format;

enum class Damage { every_value, every_bit };

struct Part {
    const char *name;
    Format format;
    Damage damage;
    bool repairs;     // the checksum of the chunk that is hit; other bytes are left out
    uint32_t ways;    // in which each damaged file is decoded
    uint64_t decodes; // at least, in the long form
};

// Has no factor in common with the 256 values and the 8 bits, so that each byte meets all of them.
constexpr size_t plan_count = 61;

std::vector<Input> inputs_of(const Part &part) {
    std::vector<Input> inputs;
    for (const Input &input : part.damage == Damage::every_value ? tiny_inputs() : small_inputs())
        if (input.format == part.format) inputs.push_back(input);
    return inputs;
}

uint32_t word_at(const Bytes &file, size_t at) {
    return uint32_t{file[at]} << 24 | uint32_t{file[at + 1]} << 16 | uint32_t{file[at + 2]} << 8 | file[at + 3];
}

// Of a PNG: from a chunk's type to behind its data. Empty outside.
struct Span {
    size_t begin, end;
};

Span checked_span(const Bytes &file, size_t byte) {
    for (size_t at = 8; at + 12 <= file.size();) {
        const Span span{at + 4, at + 8 + word_at(file, at)};
        if (byte < span.end) return byte >= span.begin ? span : Span{0, 0};
        at = span.end + 4;
    }
    return {0, 0};
}

void write_checksum(Bytes &file, Span span) {
    const uint32_t crc = test::crc32_of(
        Bytes(file.begin() + static_cast<ptrdiff_t>(span.begin), file.begin() + static_cast<ptrdiff_t>(span.end)));
    for (size_t i = 0; i < 4; ++i)
        file[span.end + i] = static_cast<uint8_t>(crc >> (24 - 8 * i));
}

class Sweep {
public:
    explicit Sweep(const Part &part) : part_(part), inputs_(inputs_of(part)) {}

    uint64_t files() const { return inputs_.size(); }
    uint64_t decodes() const { return decodes_; }

    // Every `step`-th damage.
    void run(uint64_t step) {
        const AtFault at_fault([this] { return where(); });
        for (const Input &input : inputs_) {
            input_ = &input;
            plans_ = plans_of(input, plan_count);
            for (size_t i = 0; i < plan_count; i += 5)
                plans_[i].other_filling = plans_[i].looks_at_pixels = true;
            for (byte_ = 0; byte_ < input.bytes.size(); ++byte_)
                damage_byte(step);
        }
    }

private:
    void damage_byte(uint64_t step) {
        const Span span = part_.repairs ? checked_span(input_->bytes, byte_) : Span{0, 0};
        if (part_.repairs && span.end == 0) return;
        const uint8_t sound = input_->bytes[byte_];
        for (uint32_t n = 0; n < (part_.damage == Damage::every_value ? 256u : 8u); ++n) {
            value_ = static_cast<uint8_t>(part_.damage == Damage::every_value ? n : sound ^ 1u << n);
            if (++damages_ % step != 0) continue;
            for (uint32_t way = 0; way < part_.ways; ++way)
                decode(span);
        }
    }

    void decode(Span span) {
        fuzz::Plan &plan = plans_[plan_ = static_cast<size_t>(decodes_++ % plan_count)];
        plan.file = input_->bytes;
        plan.file[byte_] = value_;
        if (span.end != 0) write_checksum(plan.file, span);
        fuzz::carry_out(plan);
    }

    std::string where() const {
        return input_->name + ", byte " + std::to_string(byte_) + " set to " + std::to_string(value_) + ", plan " +
               std::to_string(plan_);
    }

    const Part &part_;
    const std::vector<Input> inputs_;
    const Input *input_ = nullptr;
    std::vector<fuzz::Plan> plans_;
    size_t byte_ = 0, plan_ = 0;
    uint8_t value_ = 0;
    uint64_t damages_ = 0, decodes_ = 0;
};

class DamagedFiles : public testing::TestWithParam<Part> {};

TEST_P(DamagedFiles, do_no_harm) {
    const Part &part = GetParam();
    Sweep sweep(part);
    sweep.run(by_extent<uint64_t>(331, 23, 1));
    RecordProperty("decodes", static_cast<int>(sweep.decodes()));
    printf("%s: %llu decodes of %llu files\n", part.name, static_cast<unsigned long long>(sweep.decodes()),
           static_cast<unsigned long long>(sweep.files()));
    EXPECT_GE(sweep.decodes(), by_extent(part.decodes / 500, part.decodes / 24, part.decodes));
}

INSTANTIATE_TEST_SUITE_P(In, DamagedFiles,
                         testing::Values(Part{"bmp", Format::bmp, Damage::every_value, false, 5, 1500000},
                                         Part{"wbmp", Format::wbmp, Damage::every_value, false, plan_count, 800000},
                                         Part{"png", Format::png, Damage::every_value, false, 1, 450000},
                                         Part{"png_repaired", Format::png, Damage::every_value, true, 4, 1200000},
                                         Part{"gif", Format::gif, Damage::every_value, false, 4, 600000},
                                         Part{"bits_of_bmp", Format::bmp, Damage::every_bit, false, 5, 500000},
                                         Part{"bits_of_wbmp", Format::wbmp, Damage::every_bit, false, plan_count,
                                              25000},
                                         Part{"bits_of_png", Format::png, Damage::every_bit, false, 1, 250000},
                                         Part{"bits_of_png_repaired", Format::png, Damage::every_bit, true, 1, 270000},
                                         Part{"bits_of_gif", Format::gif, Damage::every_bit, false, 5, 250000}),
                         [](const auto &part) { return std::string(part.param.name); });

} // namespace
} // namespace pelm::sweeps
