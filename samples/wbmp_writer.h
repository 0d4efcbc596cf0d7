// Writes WBMP files.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace pelm_samples {

// 1 is white; from the top left. Sides below 16384. False: failed.
bool write_wbmp(const std::string &path, int width, int height, const std::vector<uint32_t> &values);

} // namespace pelm_samples
