// The codes of fixed blocks (RFC 1951, section 3.2.6), as constants. All of them fit the lookup tables, which are
// therefore complete.
#pragma once

#include "png/inflate/decoding_table.h"
#include "png/inflate/lookup.h"

namespace pelm {

extern const LookupTables fixed_lookup;
extern const DecodingTable fixed_literals, fixed_distances;

} // namespace pelm
