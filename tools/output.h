// Where the writers put their bytes.
#pragma once

#include <cstddef>

namespace pelm_tool {

class Output {
public:
    virtual void write(const void *bytes, size_t size) = 0; // throws Failure

protected:
    ~Output() = default;
};

} // namespace pelm_tool
