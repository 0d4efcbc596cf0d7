// What a benchmark decodes: files that are made when they are wanted first.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <utility>
#include <vector>

namespace bench {

using Bytes = std::vector<uint8_t>;

// Files that one iteration decodes, kept for all who decode them.
class Work {
public:
    explicit Work(std::function<std::vector<Bytes>()> make) : make_(std::move(make)) {}
    const std::vector<Bytes> &files() {
        if (files_.empty()) files_ = make_();
        return files_;
    }

private:
    std::function<std::vector<Bytes>()> make_;
    std::vector<Bytes> files_;
};

using SharedWork = std::shared_ptr<Work>;

// One file; none when `make` returns an empty one.
template <class Make>
SharedWork file_made_by(Make make) {
    return std::make_shared<Work>([make]() -> std::vector<Bytes> {
        Bytes file = make();
        if (file.empty()) return {};
        return {std::move(file)};
    });
}

} // namespace bench
