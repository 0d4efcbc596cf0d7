#include "tests/png/decode/decoding.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>

namespace pelm::test {

std::string name_of(Blocks blocks) {
    constexpr const char *names[] = {"stored", "fixed", "dynamic", "mixed"};
    return names[static_cast<int>(blocks)];
}

std::string name_of(Call call) {
    constexpr const char *names[] = {"one-shot", "iterative", "line"};
    return names[static_cast<int>(call)];
}

Png png_of(const Picture &picture) {
    Png png{
        .width = picture.width, .height = picture.height, .colour_type = picture.colour_type, .depth = picture.depth};
    const size_t size = picture.row_bytes();
    for (size_t y = 0; y < picture.height; ++y)
        png.rows.emplace_back(picture.rows.begin() + static_cast<ptrdiff_t>(y * size),
                              picture.rows.begin() + static_cast<ptrdiff_t>((y + 1) * size));
    png.filters = {0, 1, 2, 3, 4};
    if (picture.colour_type == indexed) png.plte = picture.palette;
    png.trns = picture.transparency;
    return png;
}

Bytes file_of(const Picture &picture) {
    return build(png_of(picture));
}

namespace {

size_t match_length(const Bytes &data, size_t at, size_t distance) {
    if (distance > at) return 0;
    size_t length = 0;
    while (length < 258 && at + length < data.size() && data[at + length] == data[at + length - distance])
        ++length;
    return length;
}

// The bytes that a token stands for.
size_t length_of(const Token &token) {
    if (!token.has_distance) return 1;
    return expand({literal(0), token}).size() - 1;
}

// Cuts the tokens into runs that stand for at least `block_size` bytes each.
std::vector<Tokens> in_blocks(const Tokens &tokens, size_t block_size) {
    std::vector<Tokens> blocks(1);
    size_t filled = 0;
    for (const Token &token : tokens) {
        if (filled >= block_size) {
            blocks.emplace_back();
            filled = 0;
        }
        blocks.back().push_back(token);
        filled += length_of(token);
    }
    return blocks;
}

} // namespace

Tokens tokens_of(const Bytes &data, const std::vector<uint32_t> &distances) {
    Tokens tokens;
    for (size_t at = 0; at < data.size();) {
        size_t best = 2;
        uint32_t from = 0;
        for (const uint32_t distance : distances) {
            const size_t length = match_length(data, at, distance);
            if (length > best) {
                best = length;
                from = distance;
            }
        }
        if (from == 0) {
            tokens.push_back(literal(data[at++]));
        } else {
            tokens.push_back(match(static_cast<uint32_t>(best), from));
            at += best;
        }
    }
    return tokens;
}

Bytes stream_of_blocks(const Bytes &data, Blocks blocks, size_t block_size, uint32_t row_length) {
    Deflate deflate;
    if (blocks == Blocks::stored) {
        deflate.stored_blocks(data, block_size, Last::yes);
        return zlib_stream(deflate.bytes(), data);
    }
    std::vector<uint32_t> distances = {1, 2, 3, 4};
    if (row_length <= 32768) distances.push_back(row_length);
    const std::vector<Tokens> runs = in_blocks(tokens_of(data, distances), block_size);
    Bytes written;
    for (size_t i = 0; i < runs.size(); ++i) {
        const Last last = i + 1 == runs.size() ? Last::yes : Last::no;
        const Bytes part = expand(runs[i], written);
        written.insert(written.end(), part.begin(), part.end());
        if (blocks == Blocks::mixed && i % 3 == 2)
            deflate.stored(part, last);
        else if (blocks == Blocks::fixed || (blocks == Blocks::mixed && i % 3 == 0))
            deflate.fixed(runs[i], last);
        else
            deflate.dynamic(runs[i], last);
    }
    return zlib_stream(deflate.bytes(), data);
}

Bytes file_of_blocks(const Picture &picture, Blocks blocks, size_t block_size) {
    Png png = png_of(picture);
    png.stream =
        stream_of_blocks(scanlines_of(png), blocks, block_size, static_cast<uint32_t>(picture.row_bytes() + 1));
    return build(png);
}

Output::Output(size_t size, size_t bytes_behind)
    : size_(size), behind_(bytes_behind), area_(memory_.take(size + bytes_behind, Edge::end)) {
    fill(background(size));
    std::fill_n(area_ + size_, behind_, uint8_t{0x77});
}

void Output::fill(const Bytes &bytes) {
    std::copy_n(bytes.begin(), std::min(bytes.size(), size_), area_);
}

bool Output::intact() const {
    return memory_.intact() &&
           std::all_of(area_ + size_, area_ + size_ + behind_, [](uint8_t byte) { return byte == 0x77; });
}

Decode::Decode(const Bytes &file, uint32_t kind, const Request &wanted) : source(kind, file), request(wanted) {
    info.input = &source.source;
    info.outputFormat = request.format;
    info.flags = request.flags;
}

Decode::~Decode() {
    ZOTARPELMI_DestroyPNGInfo(&info);
}

int32_t Decode::one_shot(void *output) {
    return ZOTARPELMI_DecodePNG(&info, output, request.box_width, request.box_height);
}

int32_t Decode::iterative(void *output) {
    return ZOTARPELMI_DecodePNGIter(&info, output, request.box_width, request.box_height);
}

int32_t Decode::line(void *output, int32_t rows) {
    return ZOTARPELMI_DecodePNGLine(&info, output, request.box_width, request.box_height, rows);
}

int32_t Decode::call(Call which, void *output, int32_t rows) {
    switch (which) {
    case Call::one_shot: return one_shot(output);
    case Call::iterative: return iterative(output);
    default: return line(output, rows);
    }
}

Outcome run(const Bytes &file, uint32_t kind, const Request &request, size_t output_size, Call call, int32_t rows,
            int most_calls, size_t bytes_behind) {
    TestHost &host = TestHost::get();
    Outcome outcome;
    Output output(output_size, bytes_behind);
    {
        Decode decode(file, kind, request);
        do
            outcome.results.push_back(outcome.result = decode.call(call, output.data(), rows));
        while (outcome.result == PELM_RESULT_MORE && static_cast<int>(outcome.results.size()) < most_calls);
        outcome.info = decode.info;
        outcome.live_blocks = host.live_blocks().size();
    }
    outcome.output = output.bytes();
    for (const std::string &violation : host.violations)
        outcome.trouble += violation + "; ";
    if (!output.intact()) outcome.trouble += "wrote round the output; ";
    return outcome;
}

std::string flaws(const Outcome &outcome, int32_t expected_result) {
    std::string text = outcome.trouble;
    if (outcome.result != expected_result)
        text += "result " + std::to_string(outcome.result) + " instead of " + std::to_string(expected_result) + "; ";
    if (outcome.live_blocks != 0) text += std::to_string(outcome.live_blocks) + " blocks still allocated; ";
    if (outcome.info.decoderState != nullptr) text += "decoderState not NULL; ";
    return text;
}

std::string one_shot_difference(const Picture &picture, const Bytes &file, uint32_t kind, const Request &request,
                                size_t bytes_behind) {
    const size_t size = buffer_size(picture, request);
    Bytes expected = background(size);
    draw(picture, request, expected);
    const Outcome outcome = run(file, kind, request, size, Call::one_shot, 0, 1, bytes_behind);
    const std::string wrong = flaws(outcome);
    if (!wrong.empty()) return picture.described() + ", " + request.described() + ": " + wrong;
    return difference(expected, outcome.output, picture, request);
}

} // namespace pelm::test
