// What happens when the system's calls fail, are interrupted, or find another file than the one before them. The linker
// leads the host's calls here.
#include <cerrno>
#include <functional>

#include <sys/stat.h>

#include "tests/host/support.h"

namespace {

// Asked before each call: 0, or the errno value that it fails with.
using Answer = std::function<int()>;
Answer on_open, on_pread, on_fstat, on_lseek;
bool finds_a_pipe = false;

bool fails(const Answer &answer) {
    errno = answer ? answer() : 0;
    return errno != 0;
}

} // namespace

// By the names that the C library gives them where files may be larger than addresses (_FILE_OFFSET_BITS).
extern "C" {
int __real_open64(const char *path, int flags, mode_t mode);
ssize_t __real_pread64(int descriptor, void *to, size_t count, off_t offset);
int __real_fstat64(int descriptor, struct stat *about);
off_t __real_lseek64(int descriptor, off_t offset, int origin);
int __wrap_open64(const char *path, int flags, mode_t mode) {
    return fails(on_open) ? -1 : __real_open64(path, flags, mode);
}
ssize_t __wrap_pread64(int descriptor, void *to, size_t count, off_t offset) {
    return fails(on_pread) ? -1 : __real_pread64(descriptor, to, count, offset);
}
int __wrap_fstat64(int descriptor, struct stat *about) {
    if (fails(on_fstat)) return -1;
    const int result = __real_fstat64(descriptor, about);
    if (finds_a_pipe) about->st_mode = (about->st_mode & ~mode_t{S_IFMT}) | S_IFIFO;
    return result;
}
off_t __wrap_lseek64(int descriptor, off_t offset, int origin) {
    return fails(on_lseek) ? -1 : __real_lseek64(descriptor, offset, origin);
}
}

namespace pelm::host_test {
namespace {

class HostCalls : public testing::Test {
protected:
    HostCalls() { PelmHost_UseForThread(control); }
    ~HostCalls() override {
        on_open = on_pread = on_fstat = on_lseek = nullptr;
        finds_a_pipe = false;
    }
    // Interrupted, and a stop asked for meanwhile.
    Answer stopped() {
        return [this] {
            PelmHost_Cancel(control);
            return EINTR;
        };
    }
    static Answer interrupted(int times) {
        return [times]() mutable { return times-- > 0 ? EINTR : 0; };
    }
    static Answer failing() {
        return [] { return EIO; };
    }
    int open_in_memory(InputSource &source) const {
        return PelmHost_OpenFileInMemory(&source, PELM_SOURCE_STREAM, file.path(), 0);
    }

    Control control;
    const TemporaryFile file{"0123456789"};
    const int next = next_descriptor();
};

TEST_F(HostCalls, an_interrupted_open_goes_on) {
    on_open = interrupted(3);
    Source source;
    ASSERT_EQ(open_in_memory(source), 0);
    EXPECT_EQ(read_all(source, 4), "0123456789");
}

TEST_F(HostCalls, a_stop_ends_an_open_that_waits) {
    on_open = stopped();
    Source source;
    EXPECT_EQ(open_in_memory(source), ECANCELED);
    EXPECT_TRUE(is_zeroed(source));
}

TEST_F(HostCalls, a_file_whose_size_cannot_be_told_is_read_to_its_end) {
    for (Answer *const call : {&on_fstat, &on_lseek}) {
        *call = failing();
        Source source;
        ASSERT_EQ(open_in_memory(source), 0);
        EXPECT_EQ(read_all(source, 4), "0123456789");
        *call = nullptr;
    }
}

TEST_F(HostCalls, a_file_that_cannot_be_looked_at_once_it_is_open_is_refused) {
    on_fstat = failing();
    Source source;
    EXPECT_EQ(PelmHost_OpenFile(&source, file.path(), 0), EIO);
    EXPECT_TRUE(is_zeroed(source));
    EXPECT_EQ(next_descriptor(), next);
}

TEST_F(HostCalls, a_pipe_that_took_the_files_place_is_refused) {
    finds_a_pipe = true;
    Source source;
    EXPECT_EQ(PelmHost_OpenFile(&source, file.path(), 0), ESPIPE);
    EXPECT_TRUE(is_zeroed(source));
    EXPECT_EQ(next_descriptor(), next);
}

TEST_F(HostCalls, an_interrupted_read_of_a_file_goes_on) {
    Source source;
    ASSERT_EQ(PelmHost_OpenFile(&source, file.path(), 0), 0);
    on_pread = interrupted(3);
    EXPECT_EQ(read_some(source, 4), "0123");
}

TEST_F(HostCalls, a_failed_read_of_a_file_is_told_and_may_be_tried_again) {
    Source source;
    ASSERT_EQ(PelmHost_OpenFile(&source, file.path(), 0), 0);
    EXPECT_EQ(read_some(source, 2), "01");
    on_pread = failing();
    EXPECT_EQ(read_result(source), -1);
    EXPECT_EQ(PelmHost_ReadError(&source), EIO);
    EXPECT_EQ(source.consumed, 2);
    on_pread = nullptr;
    EXPECT_EQ(read_some(source, 4), "2345");
    EXPECT_EQ(PelmHost_ReadError(&source), 0);
}

TEST_F(HostCalls, a_stop_ends_a_read_of_a_file_that_waits) {
    Source source;
    ASSERT_EQ(PelmHost_OpenFile(&source, file.path(), 0), 0);
    on_pread = stopped();
    EXPECT_EQ(read_result(source), -1);
    EXPECT_EQ(PelmHost_ReadError(&source), ECANCELED);
    on_pread = nullptr;
    PelmHost_Resume(control);
    EXPECT_EQ(read_some(source, 4), "0123");
}

} // namespace
} // namespace pelm::host_test
