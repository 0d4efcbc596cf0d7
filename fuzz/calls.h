// The public calls: what each takes, what it may answer, and what the caller has to provide.
#pragma once

#include <cstdint>
#include <span>

#include "fuzz/plan.h"

namespace pelm::fuzz {

// The buffer behind a call's output argument.
enum class Output : uint8_t {
    none,
    box,     // of this call
    kept,    // the box of the decode's first call, until the decode ends; later arguments are not looked at
    rows,    // of this call, as wide as the box of the decode's first call, in every placement
    own_rows // the same, as wide as the box of this call
};

// What a call does with the decode that is in progress.
enum class Progress : uint8_t {
    apart,       // decodes nothing
    whole,       // neither continues nor leaves one
    needs_idle,  // the same, but one in progress would be lost
    steps,       // begins one or goes on with it
    parks,       // begins one that only calls that `resume` may go on with
    resumes,     // ends one that was parked
    gives_up,    // ends one
    gives_up_any // ends one, also when it was parked
};

// What hangs from `decoderState`. Calls of the same state go on with each other's decodes; others refuse them.
enum class State : uint8_t { none, bmp_bands, bmp_parked, png, gif_slices, gif_lines, frames, frame_slices };

enum class Leaks : uint8_t {
    nothing,
    broken_gif,     // all of the decode, when the file breaks off before its first image
    read_buffer,    // of 16384 bytes, except for kind 0
    refused_bmp,    // record and palette, for the refusals that leak
    unsigned_bmp,   // the record, when there is no BM
    all,            // of the decode that is given up
    all_but_palette // the same, but its record and palette
};

struct Call {
    const char *name;
    int32_t (*make)(ImageDecodeInfo *info, void *output, const Step &step);
    Output output;
    Progress progress;
    State state; // that it leaves or goes on with
    Leaks leaks;
    uint32_t keeps;   // bit n: after the answer n the decode may be in progress
    uint32_t ends;    // bit n: after the answer n it may be over, or none has begun
    int32_t rows = 0; // per call; 0: the step's

    bool may_answer(int32_t result) const { return has(keeps | ends, result); }
    bool may_keep(int32_t result) const { return has(keeps, result); }
    bool may_end(int32_t result) const { return has(ends, result); }

    static bool has(uint32_t results, int32_t result) {
        return result >= 0 && result < 32 && (results >> result & 1) != 0;
    }
};

// All calls that a request of the format may be handed to: stills and animations of GIF share theirs.
std::span<const Call> calls_of(Format format);

// Those of them that decode, for the format alone.
std::span<const Call> decoding_calls(Format format);

// The one that goes on with what was parked.
const Call &resuming_call();

// Gives up and frees what is in progress, as far as the format's calls can.
void give_up(Format format, ImageDecodeInfo &info);

// Of the format's decoders; 0 for formats that they do not write.
size_t bytes_per_output_pixel(Format format, uint32_t output_format);

// Whether PELM_PLACE_EXACT means anything to its decoders.
bool knows_exact_buffers(Format format);

} // namespace pelm::fuzz
