// PNG files of any kind, most of them sound.
#pragma once

#include "tests/support/bmp_builder.h"
#include "tests/sweeps/random.h"

namespace pelm::sweeps {

// Any rows, filters, colours and alphas, and a few chunks changed: left out, doubled, exchanged, other data.
test::Bytes any_png_file(Random &random);

} // namespace pelm::sweeps
