#include "tests/gif/support/gif_check.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <sstream>

namespace pelm::test {

namespace {

constexpr int most_calls = 100000;
constexpr uint8_t behind_output = 0x77;
constexpr size_t raw_table_size = 1024;

uint32_t little(const Bytes &file, size_t at) {
    return at + 1 < file.size() ? static_cast<uint32_t>(file[at] | file[at + 1] << 8) : 0;
}

// Every word that no GIF call writes has a value of its own.
ImageDecodeInfo marked_gif_info(InputSource *source, const GifRequest &request) {
    ImageDecodeInfo info{};
    info.input = source;
    info.outputFormat = request.format;
    info.flags = request.flags();
    info.reserved3 = 0x30303030;
    info.reserved4 = 0x40404040;
    info.imageWidth = 0x50505050;
    info.imageHeight = 0x60606060;
    info.decodeStarted = 0x90909090;
    info.preInitMode = 0xA0A0A0A0;
    info.reserved11 = 0xB0B0B0B0;
    info.reserved12 = 0xC0C0C0C0;
    info.reserved13 = 0xD0D0D0D0;
    info.reserved16 = 0x16161616;
    info.iterative = 0x17171717;
    return info;
}

bool gif_marks_intact(const ImageDecodeInfo &info) {
    return info.reserved3 == 0x30303030 && info.reserved4 == 0x40404040 && info.imageWidth == 0x50505050 &&
           info.imageHeight == 0x60606060 && info.decodeStarted == 0x90909090 && info.preInitMode == 0xA0A0A0A0 &&
           info.reserved11 == 0xB0B0B0B0 && info.reserved12 == 0xC0C0C0C0 && info.reserved13 == 0xD0D0D0D0 &&
           info.reserved16 == 0x16161616 && info.iterative == 0x17171717;
}

} // namespace

std::string name_of(GifCall call) {
    constexpr const char *names[] = {"one-shot", "iterative", "line", "frame", "iterative frame"};
    return names[static_cast<int>(call)];
}

GifRequest own_size(uint16_t width, uint16_t height, uint32_t format) {
    return {.format = format, .box_width = width, .box_height = height};
}

SideBySide::SideBySide(const Bytes &file, const GifRequest &request, const GifSetting &setting)
    : file_(file), request_(request), setting_(setting), source_(setting.kind, file),
      model_(file, request, setting.most_per_read), info_(marked_gif_info(&source_.source, request)) {
    TestHost &host = TestHost::get();
    host.reset();
    if (setting.most_per_read != INT32_MAX) {
        host.faults.short_reads_from = 1;
        host.faults.most_per_read = setting.most_per_read;
    }
    info_.hasTransparency = model_.words.has_transparency = 0xE0E0E0E0;
    info_.frameDelay = model_.words.frame_delay = 0x18181818;
    info_.colorTableState = model_.words.colour_table_state = 0x19191919;
    info_.outputWidth = model_.words.output_width = 0x70707070;
    info_.outputHeight = model_.words.output_height = 0x08080808;
    if (!setting.has_raw_table) return;
    raw_table_.assign(raw_table_size, 0x20);
    model_.words.global_table = raw_table_;
    info_.globalColorTable = raw_table_.data();
}

SideBySide::~SideBySide() {
    TestHost::get().reset();
}

void SideBySide::make_output(size_t size) {
    memory_ = std::make_unique<GuardedBuffer>();
    output_ = memory_->take(size + setting_.bytes_behind, setting_.edge);
    std::fill_n(output_, size, gif_background);
    std::fill_n(output_ + size, setting_.bytes_behind, behind_output);
    expected_.assign(size, gif_background);
}

int32_t SideBySide::real(GifCall which, int32_t rows) {
    void *const output = setting_.no_output ? nullptr : output_;
    const int32_t width = request_.box_width, height = request_.box_height;
    switch (which) {
    case GifCall::one_shot: return ZOTARPELMI_DecodeGIF(&info_, output, width, height);
    case GifCall::iterative: return ZOTARPELMI_DecodeGIFIter(&info_, output, width, height);
    case GifCall::line: return ZOTARPELMI_DecodeGIFLine(&info_, output, width, height, rows);
    case GifCall::frame: return ZOTARPELMI_DecodeAGIF(&info_, output, width, height);
    default: return ZOTARPELMI_DecodeAGIFIter(&info_, output, width, height);
    }
}

int32_t SideBySide::modelled(GifCall which, int32_t rows) {
    switch (which) {
    case GifCall::one_shot: return model_.one_shot(expected_);
    case GifCall::iterative: return model_.iterative(expected_);
    case GifCall::line: return model_.line(expected_, rows);
    case GifCall::frame: return model_.frame(expected_);
    default: return model_.frame_iterative(expected_);
    }
}

std::string SideBySide::call(GifCall which, int32_t rows) {
    const GifBufferShape placed =
        gif_buffer_shape(std::max(1u, little(file_, 6)), std::max(1u, little(file_, 8)), request_);
    const GifBufferShape lines{request_.box_width, rows, placed.pixel_bytes};
    // Lines come anew with every call; everything else is written into one buffer.
    if (setting_.no_output)
        expected_.clear();
    else if (which == GifCall::line || memory_ == nullptr)
        make_output(which == GifCall::line ? lines.bytes() : placed.bytes());
    ++calls_;
    result_ = real(which, rows);
    const std::string what = name_of(which) + (which == GifCall::line ? " of " + std::to_string(rows) + " row(s)" : "");
    return compare(what, result_, modelled(which, rows));
}

std::string SideBySide::abort() {
    return compare("abort", ZOTARPELMI_AbortGIFIter(&info_), model_.abort());
}

std::string SideBySide::all_calls(GifCall which, int32_t rows) {
    const bool in_frames = which == GifCall::frame || which == GifCall::frame_iterative;
    for (int i = 0; i < most_calls; ++i) {
        const std::string difference = call(which, rows);
        if (!difference.empty()) return difference;
        const bool goes_on = result_ == PELM_RESULT_MORE || (in_frames && result_ == PELM_RESULT_DONE) ||
                             (which == GifCall::line && info_.decoderState != nullptr);
        if (!goes_on) return "";
    }
    return "never ends";
}

std::string SideBySide::compare(const std::string &what, int32_t real_result, int32_t model_result) {
    std::string wrong;
    if (real_result != model_result)
        wrong = "result " + std::to_string(real_result) + " instead of " + std::to_string(model_result) + "; ";
    wrong += different_words() + misbehaviour() + different_pixels();
    if (wrong.empty()) return "";
    std::ostringstream text;
    text << "\n  " << what << ", call " << calls_ << " (" << request_.described() << "; source kind " << setting_.kind
         << ", " << setting_.most_per_read << " bytes per read; output "
         << (setting_.no_output ? "NULL" : std::to_string(expected_.size()) + " bytes") << "): " << wrong
         << "\n  input: " << hex_of(file_);
    return text.str();
}

std::string SideBySide::different_words() const {
    std::ostringstream text;
    const GifWords &words = model_.words;
    const auto differs = [&text](const char *name, int64_t got, int64_t wanted) {
        if (got != wanted) text << name << " " << got << " instead of " << wanted << "; ";
    };
    if (words.size_known) {
        differs("outputWidth", info_.outputWidth, words.output_width);
        differs("outputHeight", info_.outputHeight, words.output_height);
    }
    differs("hasTransparency", info_.hasTransparency, words.has_transparency);
    differs("frameDelay", info_.frameDelay, words.frame_delay);
    differs("colorTableState", info_.colorTableState, words.colour_table_state);
    differs("decoderState set:", info_.decoderState != nullptr, words.has_state);
    differs("consumed", source_.source.consumed, words.consumed);
    const size_t own_tables =
        (words.global_table.has_value() && !setting_.has_raw_table) + size_t{words.local_table.has_value()};
    differs("live blocks", static_cast<int64_t>(TestHost::get().live_blocks().size()),
            static_cast<int64_t>(words.live_blocks + own_tables));
    text << different_table("globalColorTable", info_.globalColorTable, words.global_table)
         << different_table("localColorTable", info_.localColorTable, words.local_table);
    return text.str();
}

std::string SideBySide::different_table(const char *name, const void *got, const std::optional<Bytes> &expected) const {
    if ((got != nullptr) != expected.has_value()) return std::string(name) + " is wrongly NULL or set; ";
    if (got == nullptr || memcmp(got, expected->data(), expected->size()) == 0) return "";
    return std::string(name) + " holds other bytes; ";
}

std::string SideBySide::different_pixels() const {
    if (setting_.no_output || output_ == nullptr) return "";
    const Bytes got(output_, output_ + expected_.size());
    const auto [e, g] = std::mismatch(expected_.begin(), expected_.end(), got.begin());
    if (e == expected_.end()) return "";
    size_t differing = 0;
    for (size_t i = 0; i < got.size(); ++i)
        differing += got[i] != expected_[i];
    std::ostringstream text;
    text << "byte " << e - expected_.begin() << " of the output is " << int{*g} << " instead of " << int{*e} << "; "
         << differing << " byte(s) differ";
    return text.str();
}

std::string SideBySide::misbehaviour() const {
    std::string text;
    for (const std::string &violation : TestHost::get().violations)
        text += violation + "; ";
    const uint8_t *const behind = output_ + expected_.size();
    const bool untouched = output_ == nullptr || std::all_of(behind, behind + setting_.bytes_behind,
                                                             [](uint8_t byte) { return byte == behind_output; });
    if (!untouched || (memory_ != nullptr && !memory_->intact())) text += "wrote outside the output buffer; ";
    if (!source_.unchanged()) text += "wrote into the input; ";
    const bool own_words = gif_marks_intact(info_) && info_.input == &source_.source &&
                           info_.outputFormat == request_.format && info_.flags == request_.flags();
    if (!own_words) text += "changed a word of the request that is not its own; ";
    if (source_.source.kind != setting_.kind || source_.source.size != static_cast<int32_t>(file_.size()))
        text += "changed a word of the source that is not its own; ";
    return text;
}

std::string gif_difference(const Bytes &file, const GifRequest &request, GifCall which, const GifSetting &setting,
                           int32_t rows) {
    SideBySide both(file, request, setting);
    return both.all_calls(which, rows);
}

GifOutcome checked_decode(const Bytes &file, const GifRequest &request, GifCall which, const GifSetting &setting) {
    SideBySide both(file, request, setting);
    EXPECT_EQ(both.all_calls(which), "");
    return {both.result(), both.expected(), both.words()};
}

Bytes rgb_of(const Bytes &indices, const ColourTable &table) {
    Bytes rgb;
    for (const uint8_t index : indices)
        rgb.insert(rgb.end(), table.begin() + index * 3, table.begin() + index * 3 + 3);
    return rgb;
}

} // namespace pelm::test
