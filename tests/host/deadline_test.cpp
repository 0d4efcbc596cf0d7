// Deadlines and the reason for a stop.
#include <cerrno>

#include "tests/host/support.h"

namespace pelm::host_test {
namespace {

TEST(HostDeadline, has_not_passed_while_it_lies_ahead) {
    const Control control;
    PelmHost_SetDeadline(control, UINT32_MAX);
    EXPECT_EQ(PelmHost_StopReason(control), 0);
}

TEST(HostDeadline, is_the_reason_once_it_has_passed) {
    const Control control;
    let_deadline_pass(control);
    EXPECT_EQ(PelmHost_StopReason(control), ETIMEDOUT);
}

TEST(HostDeadline, counts_from_when_it_is_set) {
    const Control control;
    let_deadline_pass(control);
    PelmHost_SetDeadline(control, UINT32_MAX);
    EXPECT_EQ(PelmHost_StopReason(control), 0);
}

TEST(HostDeadline, stays_when_a_cancelled_control_resumes) {
    const Control control;
    let_deadline_pass(control);
    PelmHost_Cancel(control);
    EXPECT_EQ(PelmHost_StopReason(control), ECANCELED);
    PelmHost_Resume(control);
    EXPECT_EQ(PelmHost_StopReason(control), ETIMEDOUT);
    PelmHost_SetDeadline(control, 0);
    EXPECT_EQ(PelmHost_StopReason(control), 0);
}

} // namespace
} // namespace pelm::host_test
