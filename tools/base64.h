// Bytes as text, for pictures that lie inside of other files.
#pragma once

#include "tools/output.h"

namespace pelm_tool {

class Base64 final : public Output {
public:
    explicit Base64(Output &to) : to_(to) {}

    void write(const void *bytes, size_t size) override;
    void finish();

private:
    Output &to_;
    unsigned char group_[3] = {};
    size_t held_ = 0; // bytes of the group
};

} // namespace pelm_tool
