#include "tests/png/inner/huffman_model.h"

namespace pelm::test {

namespace {

// Symbols 257 to 287 and distance symbols 0 to 31: base, and extra bits + 16.
constexpr std::array<std::array<uint32_t, 2>, 31> lengths_by_symbol = {
    {{3, 16},  {4, 16},   {5, 16},   {6, 16},   {7, 16},   {8, 16},   {9, 16},   {10, 16}, {11, 17}, {13, 17}, {15, 17},
     {17, 17}, {19, 18},  {23, 18},  {27, 18},  {31, 18},  {35, 19},  {43, 19},  {51, 19}, {59, 19}, {67, 20}, {83, 20},
     {99, 20}, {115, 20}, {131, 21}, {163, 21}, {195, 21}, {227, 21}, {258, 16}, {0, 112}, {0, 112}}};

std::array<uint32_t, 2> distance_by_symbol(uint32_t symbol) {
    if (symbol == 30) return {0, 16};
    if (symbol == 31) return {0, 0};
    if (symbol < 4) return {symbol + 1, 16};
    const uint32_t extra = symbol / 2 - 1;
    return {(2 + symbol % 2) * (1u << extra) + 1, 16 + extra};
}

std::array<uint32_t, 2> payload(HuffmanAlphabetKind kind, uint32_t symbol) {
    if (kind == HUFFMAN_DISTANCE) return distance_by_symbol(symbol);
    if (kind == HUFFMAN_CODE_LENGTH || symbol < 256) return {symbol, 0};
    if (symbol == 256) return {256, 10};
    return lengths_by_symbol[symbol - 257];
}

std::optional<std::string> difference_below(const ModelNode &wanted, const HuffmanNodePool &pool, uint32_t node,
                                            const std::string &path) {
    const HuffmanNode &got = pool.nodes[node];
    const bool leaf = wanted.child[0] == nullptr;
    if (leaf && wanted.child[1] != nullptr) return path + ": a node with a one branch only";
    if (leaf && !path.empty() &&
        (got.value != wanted.value || got.op != wanted.op || got.codeLength != wanted.code_length))
        return path + ": leaf " + std::to_string(got.value) + "/" + std::to_string(got.op) + "/" +
               std::to_string(got.codeLength) + ", expected " + std::to_string(wanted.value) + "/" +
               std::to_string(wanted.op) + "/" + std::to_string(wanted.code_length);
    for (size_t branch = 0; branch < 2; ++branch) {
        const std::string below = path + (branch == 0 ? '0' : '1');
        const uint32_t child = got.child[branch];
        if ((child != 0) != (wanted.child[branch] != nullptr)) return below + (child != 0 ? ": surplus" : ": missing");
        if (child >= pool.nodeCount) return below + ": outside the nodes used";
        if (child == 0) continue;
        const auto found = difference_below(*wanted.child[branch], pool, child, below);
        if (found) return found;
    }
    return {};
}

} // namespace

ModelTree::ModelTree(const Bytes &lengths, HuffmanAlphabetKind kind) {
    nodes_.emplace_back();
    const std::vector<Code> codes = canonical_codes(lengths);
    for (uint32_t length = 15; length >= 1; --length)
        for (uint32_t symbol = 0; symbol < lengths.size(); ++symbol) {
            if (lengths[symbol] != length) continue;
            ModelNode *node = &nodes_.front();
            for (uint32_t bit = length; bit-- > 0;) {
                ModelNode *&child = node->child[codes[symbol].bits >> bit & 1];
                if (child == nullptr) child = &nodes_.emplace_back();
                node = child;
            }
            const auto [value, op] = payload(kind, symbol);
            node->value = value;
            node->op = op;
            node->code_length = length;
        }
}

const ModelNode *ModelTree::walk(uint32_t bits) const {
    const ModelNode *node = &nodes_.front();
    for (;; bits >>= 1) {
        node = node->child[bits & 1];
        if (node == nullptr || node->child[0] == nullptr) return node;
    }
}

std::optional<std::string> difference(const ModelTree &wanted, const HuffmanNodePool &pool, const HuffmanNode *root) {
    return difference_below(wanted.root(), pool, static_cast<uint32_t>(root - pool.nodes), "");
}

std::optional<uint32_t> wrong_pattern(const ModelTree &wanted, const Symbol (&table)[lookup_entries],
                                      const HuffmanNode *nodes) {
    for (uint32_t bits = 0; bits < 1u << 15; ++bits) {
        const ModelNode *const leaf = wanted.walk(bits);
        const Symbol got = find_symbol(table, nodes, bits);
        const bool right = leaf == nullptr
                               ? got.op == code_is_missing
                               : got.value == leaf->value && got.op == leaf->op && got.bits == leaf->code_length;
        if (!right) return bits;
    }
    return {};
}

} // namespace pelm::test
