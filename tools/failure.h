// Why something could not be done, in words for the user, without the name of the file that it was about.
#pragma once

#include <cstring>
#include <stdexcept>
#include <string>

namespace pelm_tool {

struct Failure : std::runtime_error {
    using std::runtime_error::runtime_error;
};

// "cannot write: No space left on device"
inline Failure system_failure(const std::string &what, int error) {
    return Failure(what + ": " + std::strerror(error));
}

} // namespace pelm_tool
