#include "tests/png/decode/oracle.h"

#include <algorithm>

#include "tests/png/support/libpng_reader.h"

namespace pelm::test {

std::string disagreement_with_libpng(const Bytes &file, std::span<const uint32_t> kinds, int32_t rows) {
    std::optional<LibpngPicture> picture = read_with_libpng(file);
    if (!picture) return "libpng refuses it";
    as_this_library_widens(*picture);
    const Bytes &wanted = picture->rgba;
    const Request request{7, 0, static_cast<int32_t>(picture->width), static_cast<int32_t>(picture->height)};
    for (const uint32_t kind : kinds)
        for (const Call call : {Call::one_shot, Call::iterative, Call::line}) {
            const Outcome outcome = run(file, kind, request, wanted.size(), call, rows, 1 << 20);
            const std::string way = name_of(call) + ", kind " + std::to_string(kind) + ": ";
            if (const std::string wrong = flaws(outcome); !wrong.empty()) return way + wrong;
            const auto [a, b] = std::mismatch(wanted.begin(), wanted.end(), outcome.output.begin());
            if (a != wanted.end())
                return way + "byte " + std::to_string(a - wanted.begin()) + " should be " + std::to_string(*a) +
                       " and is " + std::to_string(*b);
        }
    return {};
}

} // namespace pelm::test
