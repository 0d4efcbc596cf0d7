#include "tools/input.h"

#include <cerrno>

#include "tools/failure.h"
#include "tools/image_description.h"
#include "tools/interrupt.h"

namespace pelm_tool {
namespace {

// A pipe cannot be read twice, and its first bytes tell its size: it is spooled, and then read front to back by the
// library as a sequential source.
constexpr uint32_t pipe_kind = PELM_SOURCE_SEQUENTIAL;

int open_standard_input(InputSource *source, SourceChoice choice) {
    if (choice == SourceChoice::file) throw Failure("--source file needs a named file; use memory or pipe");
    const uint32_t kind = choice == SourceChoice::memory ? uint32_t{PELM_SOURCE_MEMORY} : pipe_kind;
    return PelmHost_OpenSpooled(source, kind, stdin, 0);
}

int open_named(InputSource *source, const char *path, SourceChoice choice) {
    switch (choice) {
    case SourceChoice::memory: return PelmHost_OpenFileInMemory(source, PELM_SOURCE_MEMORY, path, 0);
    case SourceChoice::pipe: return PelmHost_OpenFileInMemory(source, pipe_kind, path, 0);
    case SourceChoice::file: return PelmHost_OpenFile(source, path, 0);
    case SourceChoice::automatic: break;
    }
    const int error = PelmHost_OpenFile(source, path, 0);
    return error == ESPIPE ? PelmHost_OpenFileInMemory(source, pipe_kind, path, 0) : error;
}

Failure cannot_read(int error) {
    if (error == ETIMEDOUT) return Failure("not done before the deadline");
    if (error == EFBIG) return Failure("cannot read: larger than 2147483647 bytes");
    return system_failure("cannot read", error);
}

} // namespace

Input::Input(const std::string &name, SourceChoice choice) {
    const WakeUps wake_ups;
    const int error = name == "-" ? open_standard_input(&source_, choice) : open_named(&source_, name.c_str(), choice);
    throw_if_interrupted();
    if (error != 0) throw cannot_read(error);
    try {
        read_head();
    } catch (...) {
        PelmHost_Close(&source_); // no destructor runs after a constructor that threw
        throw;
    }
}

Input::~Input() {
    PelmHost_Close(&source_);
}

// The decoders begin by seeking to the first byte, so this look takes nothing from them.
void Input::read_head() {
    head_.resize(described_bytes);
    ZOTARPELM_Seek_IO(&source_, 0, 0);
    const int32_t delivered = ZOTARPELM_Read_IO(&source_, head_.data(), static_cast<int32_t>(head_.size()));
    if (delivered < 1 && PelmHost_ReadError(&source_) != 0) throw cannot_read(PelmHost_ReadError(&source_));
    head_.resize(delivered < 1 ? 0 : static_cast<size_t>(delivered));
}

std::string shown_name(const std::string &name) {
    return name == "-" ? "standard input" : name;
}

} // namespace pelm_tool
