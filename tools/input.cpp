#include "tools/input.h"

#include <cerrno>

#include "tools/failure.h"
#include "tools/image_description.h"
#include "tools/interrupt.h"

namespace pelm_tool {
namespace {

// A pipe cannot be read twice, and its first bytes tell its size: it is spooled, and then read by the library as a
// sequential source.
constexpr uint32_t pipe_kind = PELM_SOURCE_SEQUENTIAL;

uint32_t kind_of_spooled(SourceChoice choice) {
    // What is chosen automatically is known only once the first bytes are.
    return choice == SourceChoice::pipe ? pipe_kind : uint32_t{PELM_SOURCE_MEMORY};
}

int open_standard_input(InputSource *source, SourceChoice choice) {
    if (choice == SourceChoice::file) throw Failure("--source file needs a named file; use memory or pipe");
    return PelmHost_OpenSpooled(source, kind_of_spooled(choice), stdin, 0);
}

int open_named(InputSource *source, const char *path, SourceChoice choice) {
    if (choice == SourceChoice::memory || choice == SourceChoice::pipe)
        return PelmHost_OpenFileInMemory(source, kind_of_spooled(choice), path, 0);
    const int error = PelmHost_OpenFile(source, path, 0);
    const bool is_pipe = error == ESPIPE && choice == SourceChoice::automatic;
    return is_pipe ? PelmHost_OpenFileInMemory(source, kind_of_spooled(choice), path, 0) : error;
}

Failure cannot_read(int error) {
    if (error == ETIMEDOUT) return Failure("not done before the deadline");
    if (error == EFBIG) return Failure("cannot read: larger than 2147483647 bytes");
    return system_failure("cannot read", error);
}

} // namespace

Input::Input(const std::string &name, SourceChoice choice) : name_(name), choice_(choice) {
    open();
    try {
        read_head();
    } catch (...) {
        PelmHost_Close(&source_); // no destructor runs after a constructor that threw
        throw;
    }
}

Input::~Input() {
    PelmHost_Close(&view_);
    PelmHost_Close(&source_);
}

void Input::open() {
    const WakeUps wake_ups;
    const int error =
        name_ == "-" ? open_standard_input(&source_, choice_) : open_named(&source_, name_.c_str(), choice_);
    throw_if_interrupted();
    if (error != 0) throw cannot_read(error);
}

// The decoders begin by seeking to the first byte, so this look takes nothing from them.
void Input::read_head() {
    head_.resize(described_bytes);
    ZOTARPELM_Seek_IO(&source_, 0, 0);
    const int32_t delivered = ZOTARPELM_Read_IO(&source_, head_.data(), static_cast<int32_t>(head_.size()));
    head_.resize(delivered < 1 ? 0 : static_cast<size_t>(delivered));
    if (delivered < 1) throw_if_unreadable();
}

void Input::settle(bool in_memory, PipeUse use) {
    if (use == PipeUse::with_seeks && source_.kind == pipe_kind) source_.kind = PELM_SOURCE_STREAM; // it is spooled
    if (choice_ != SourceChoice::automatic) return;
    const bool is_in_memory = source_.kind == PELM_SOURCE_MEMORY;
    if (in_memory && !is_in_memory) {
        PelmHost_Close(&source_);
        choice_ = SourceChoice::memory;
        open();
        read_head();
    } else if (!in_memory && use == PipeUse::front_to_back && is_in_memory) {
        const int error = PelmHost_OpenMemory(&view_, pipe_kind, source_.data, source_.size);
        if (error != 0) throw cannot_read(error);
        is_viewed_ = true;
    }
}

std::vector<uint8_t> Input::all_bytes() {
    std::vector<uint8_t> bytes(static_cast<size_t>(source_.size));
    ZOTARPELM_Seek_IO(source(), 0, 0);
    const int32_t delivered = ZOTARPELM_Read_IO(source(), bytes.data(), source_.size);
    bytes.resize(delivered < 1 ? 0 : static_cast<size_t>(delivered));
    return bytes;
}

void Input::throw_if_unreadable() {
    const int error = PelmHost_ReadError(source());
    if (error != 0) throw cannot_read(error);
}

std::string shown_name(const std::string &name) {
    return name == "-" ? "standard input" : name;
}

} // namespace pelm_tool
