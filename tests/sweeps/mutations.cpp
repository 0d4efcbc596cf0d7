#include "tests/sweeps/mutations.h"

#include <algorithm>

namespace pelm::sweeps {
namespace {

uint8_t tempting(Random &random) {
    static constexpr uint8_t values[] = {0, 1, 2, 3, 4, 8, 12, 16, 24, 32, 40, 54, 0x2C, 0x21, 0x3B, 0x7F, 0x80, 0xFF};
    return random.one_in(2) ? values[random.below(sizeof values)] : random.byte();
}

void change(Random &random, Bytes &file, size_t from) {
    if (file.size() <= from + 1) return;
    const size_t at = from + random.below(static_cast<uint32_t>(file.size() - from));
    const auto place = file.begin() + static_cast<ptrdiff_t>(at);
    const size_t count = std::min<size_t>(random.between(1, 9), file.size() - at);
    const Bytes some(place, place + static_cast<ptrdiff_t>(count));
    switch (random.below(12)) {
    case 0: file.erase(place, place + static_cast<ptrdiff_t>(count)); return;
    case 1: file.insert(place, some.begin(), some.end()); return;
    case 2: file.insert(place, count, tempting(random)); return;
    case 3: file.resize(at); return;
    case 4:
    case 5:
    case 6: *place = static_cast<uint8_t>(*place ^ 1u << random.below(8)); return;
    default: *place = tempting(random);
    }
}

} // namespace

Bytes mutated(Random &random, Bytes file, size_t kept) {
    const size_t from = random.one_in(5) ? 0 : kept;
    for (uint32_t changes = random.between(1, 4); changes > 0; --changes)
        change(random, file, from);
    return file;
}

std::vector<Input> inputs_of(const std::vector<Input> &inputs, fuzz::Format format) {
    std::vector<Input> some;
    std::copy_if(inputs.begin(), inputs.end(), std::back_inserter(some),
                 [format](const Input &input) { return input.format == format; });
    return some;
}

} // namespace pelm::sweeps
