// The codes of fixed blocks (RFC 1951, section 3.2.6). All of them fit the lookup tables, which are therefore complete.
#pragma once

#include "png/inflate/lookup.h"

namespace pelm {

extern const LookupTables fixed_lookup;

} // namespace pelm
