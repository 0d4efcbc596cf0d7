// Huffman trees as they are defined: by pointers, one node after the other, without bounds. What the library builds and
// looks up is compared with it.
#pragma once

#include <array>
#include <deque>
#include <optional>
#include <string>

#include "png/inflate/lookup.h"
#include "tests/png/support/deflate_builder.h"

namespace pelm::test {

struct ModelNode {
    uint32_t value = 0, op = 0, code_length = 0;
    std::array<ModelNode *, 2> child{};
};

class ModelTree {
public:
    ModelTree(const Bytes &lengths, HuffmanAlphabetKind kind);
    ModelTree(const ModelTree &) = delete;
    ModelTree &operator=(const ModelTree &) = delete;

    const ModelNode &root() const { return nodes_.front(); }
    size_t node_count() const { return nodes_.size(); }
    // The leaf that the bits lead to, lowest first; NULL where a branch is missing.
    const ModelNode *walk(uint32_t bits) const;

private:
    std::deque<ModelNode> nodes_;
};

// What is different between the two trees, or nothing.
std::optional<std::string> difference(const ModelTree &wanted, const HuffmanNodePool &pool, const HuffmanNode *root);

// Some 15-bit pattern that the table (and the walk behind it) resolves otherwise than the model, or nothing.
std::optional<uint32_t> wrong_pattern(const ModelTree &wanted, const Symbol (&table)[lookup_entries],
                                      const HuffmanNode *nodes);

} // namespace pelm::test
