// The list that the sweeps are made of: whether there is what it promises.
#include <algorithm>
#include <set>

#include <gtest/gtest.h>

#include "tests/sweeps/decodes.h"

namespace pelm::sweeps {
namespace {

class Sweeps : public testing::Test {
protected:
    Sweeps() { PelmTest_Reset(); }
    ~Sweeps() override { PelmTest_Reset(); }
};

constexpr uint8_t background = 0x5C;

bool writes_a_picture(const Decode &decode) {
    const Input &input = *decode.input;
    const Setting setting{.width = input.width, .height = input.height};
    Bytes buffer(output_size(decode, setting).value_or(0), background);
    const Outcome outcome = run(decode, setting, buffer);
    PelmTest_Reset();
    const auto results = outcome.results();
    const auto is_written = [](uint8_t byte) { return byte != background; };
    return results.back() != PELM_RESULT_FAILED && std::any_of(buffer.begin(), buffer.end(), is_written);
}

// What the calls do not take, as the header says. A GIF without an image has no picture.
bool is_refused(const Decode &decode) {
    const std::string &input = decode.input->name;
    const std::string call = decode.call->name;
    const bool is_interlaced = input.find("interlaced") != std::string::npos;
    if (input.starts_with("bmp_run_lengths")) return call != "PreInitBMP";
    if (input.starts_with("bmp_core_header")) return call == "PreInitBMP";
    const bool is_by_lines = call == "DecodePNGLine" || call == "DecodeGIFLine";
    return input.starts_with("gif_empty") || (is_interlaced && is_by_lines);
}

TEST_F(Sweeps, every_sound_input_is_decoded_by_every_call_that_takes_it) {
    for (const std::vector<Input> &inputs : {tiny_inputs(), small_inputs(), sample_inputs()}) {
        for (const Decode &decode : decodes_of(inputs)) {
            if (decode.input->name == "gif_damaged") continue;
            EXPECT_EQ(writes_a_picture(decode), !is_refused(decode)) << decode.name();
        }
    }
}

TEST_F(Sweeps, the_numbers_of_settings_are_all_combinations_once) {
    const Input input{"", fuzz::Format::bmp, 30, 20, {}};
    std::set<std::string> names;
    for (uint32_t n = 0; n < setting_count; ++n)
        names.insert(nth_setting(input, PELM_FORMAT_RGBA8888, n).name());
    EXPECT_EQ(names.size(), setting_count);
}

} // namespace
} // namespace pelm::sweeps
