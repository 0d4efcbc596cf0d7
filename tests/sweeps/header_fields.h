// The fields of a file's headers: where they are, and the values at which sizes, signs and products turn.
#pragma once

#include <span>

#include "tests/sweeps/inputs.h"

namespace pelm::sweeps {

enum class Encoding : uint8_t { little_endian, big_endian, groups_of_7_bits };

struct Field {
    std::string name;
    size_t at;
    size_t size; // in bytes
    Encoding encoding;
    size_t chunk = 0, chunk_length = 0; // PNG: the chunk whose checksum covers it; 0: none does
};

struct Subject {
    Input input;
    std::vector<Field> fields;
};

// Small files of all formats, with all fields that a decoder might look at.
std::vector<Subject> subjects();

// 0, 1, -1 and what lies round 2^15, 2^16 and 2^31, as far as it fits; and factors of products beyond 2^32.
std::span<const uint32_t> values_for(const Field &field);

// Writes the value, and PNG's checksum anew.
void set_field(Bytes &file, const Field &field, uint32_t value);

} // namespace pelm::sweeps
