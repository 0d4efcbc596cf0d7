#include "fuzz/session.h"
#include "fuzz/target.h"

int LLVMFuzzerTestOneInput(const uint8_t *input, size_t size) {
    pelm::fuzz::carry_out(pelm::fuzz::plan_for(pelm::fuzz::Format::wbmp, input, size));
    return 0;
}
