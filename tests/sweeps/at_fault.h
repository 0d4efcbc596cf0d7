// Says where a sweep is when a fault or a broken promise ends the program: no case of millions is named before it runs.
#pragma once

#include <functional>
#include <string>

namespace pelm::sweeps {

// While it lives. One at a time.
class AtFault {
public:
    explicit AtFault(std::function<std::string()> describe);
    AtFault(const AtFault &) = delete;
    AtFault &operator=(const AtFault &) = delete;
    ~AtFault();
};

} // namespace pelm::sweeps
