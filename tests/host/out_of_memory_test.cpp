// What happens when the C library has no memory, and what is given back to it. The linker leads the host's malloc,
// realloc and free here.
#include <cerrno>
#include <cstdlib>

#include "tests/host/scripted_stream.h"
#include "tests/host/support.h"

namespace {
int failing_call = 0; // counted down; 0: none fails
int blocks = 0;       // that were allocated and not freed

bool fails_now() {
    return failing_call > 0 && --failing_call == 0;
}
} // namespace

extern "C" {
void *__real_malloc(size_t size);
void *__real_realloc(void *block, size_t size);
void __real_free(void *block);
void *__wrap_malloc(size_t size) {
    void *const block = fails_now() ? nullptr : __real_malloc(size);
    if (block != nullptr) ++blocks;
    return block;
}
void *__wrap_realloc(void *block, size_t size) {
    return fails_now() ? nullptr : __real_realloc(block, size);
}
void __wrap_free(void *block) {
    if (block != nullptr) --blocks;
    __real_free(block);
}
}

namespace pelm::host_test {
namespace {

// Lets each of the first `allocations` of `open` fail in turn. The one after them may fail without harm.
template <class Open>
void expect_enomem(int allocations, const Open &open) {
    for (int call = 1; call <= allocations; ++call) {
        Source source;
        failing_call = call;
        const int error = open(source);
        failing_call = 0;
        EXPECT_EQ(error, ENOMEM) << "allocation " << call;
        EXPECT_TRUE(is_zeroed(source));
    }
    Source source;
    failing_call = allocations + 1;
    EXPECT_EQ(open(source), 0);
    failing_call = 0;
}

TEST(HostOutOfMemory, there_is_no_control) {
    failing_call = 1;
    PelmHostControl *const control = PelmHost_NewControl();
    failing_call = 0;
    EXPECT_EQ(control, nullptr);
}

TEST(HostOutOfMemory, controls_are_freed_when_nobody_uses_them_any_more) {
    for (const auto use : {PelmHost_UseForThread, PelmHost_UseForProcess}) {
        const int before = blocks;
        PelmHostControl *const first = PelmHost_NewControl(), *const second = PelmHost_NewControl();
        use(first);
        PelmHost_ReleaseControl(first);
        EXPECT_EQ(blocks, before + 2);
        use(second);
        EXPECT_EQ(blocks, before + 1) << "another one took the first one's place";
        PelmHost_ReleaseControl(second);
        EXPECT_EQ(blocks, before + 1);
        use(nullptr);
        EXPECT_EQ(blocks, before);
    }
}

TEST(HostOutOfMemory, an_allocation_without_a_control_fails) {
    failing_call = 1;
    void *const block = ZOTARPELM_OsMalloc(10);
    failing_call = 0;
    EXPECT_EQ(block, nullptr);
}

TEST(HostOutOfMemory, a_failed_allocation_is_counted_and_costs_nothing) {
    const Control control;
    PelmHost_UseForThread(control);
    failing_call = 1;
    void *const block = ZOTARPELM_OsMalloc(10);
    failing_call = 0;
    EXPECT_EQ(block, nullptr);
    EXPECT_EQ(control.counters().failedAllocations, 1u);
    EXPECT_EQ(control.counters().allocations, 0u);
    EXPECT_EQ(control.counters().peakBytes, 0u);
}

TEST(HostOutOfMemory, borrowed_bytes_cannot_be_opened) {
    char byte = 'a';
    expect_enomem(1, [&](InputSource &source) { return PelmHost_OpenMemory(&source, 0, &byte, 1); });
}

TEST(HostOutOfMemory, a_file_is_closed_again) {
    const TemporaryFile file("abc");
    const int next = next_descriptor();
    expect_enomem(1, [&](InputSource &source) { return PelmHost_OpenFile(&source, file.path(), 0); });
    EXPECT_EQ(next_descriptor(), next);
}

TEST(HostOutOfMemory, a_descriptor_cannot_be_opened) {
    const Pipe pipe;
    expect_enomem(1, [&](InputSource &source) { return PelmHost_OpenDescriptor(&source, pipe.reader(), 0); });
}

// The bytes, then the record.
TEST(HostOutOfMemory, a_file_in_memory_is_given_up) {
    const TemporaryFile file("abc");
    const int next = next_descriptor();
    expect_enomem(
        2, [&](InputSource &source) { return PelmHost_OpenFileInMemory(&source, PELM_SOURCE_MEMORY, file.path(), 0); });
    EXPECT_EQ(next_descriptor(), next);
}

int open_two_blocks_of_zeros(InputSource &source) {
    const ScriptedStream stream(std::vector<Answer>(100, {std::string(1000, '\0')}));
    return PelmHost_OpenSpooled(&source, PELM_SOURCE_STREAM, stream.file(), 0);
}

// The first block, then a larger one. That the third call fails, which only trims, is no failure.
TEST(HostOutOfMemory, a_spool_that_cannot_grow_is_given_up) {
    expect_enomem(2, open_two_blocks_of_zeros);
}

} // namespace
} // namespace pelm::host_test
