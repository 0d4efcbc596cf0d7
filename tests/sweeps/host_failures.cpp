#include "tests/sweeps/host_failures.h"

#include <algorithm>
#include <iterator>
#include <limits>
#include <string_view>

namespace pelm::sweeps {
namespace {

using fuzz::Format;
using fuzz::Progress;
using fuzz::Report;
using fuzz::Service;

// A decode, a fault, and the service that it strikes first, as that was served without it.
struct Case {
    const Decode &decode;
    const Setting &setting;
    const Report &sound;
    const HostFault &fault;
    Service struck;

    Format format() const { return decode.input->format; }
    const Bytes &file() const { return decode.input->bytes; }
    bool is_two_steps() const { return decode.call->progress == Progress::parks; }
    bool is_by_own_rows() const { return decode.call->output == fuzz::Output::own_rows; }
    bool is_animation() const {
        return decode.call->state == fuzz::State::frames || decode.call->state == fuzz::State::frame_slices;
    }
    bool is_stream() const { return setting.kind != PELM_SOURCE_MEMORY; }
    bool is_reduced() const {
        return sound.outcome.scaled.back() != fuzz::Sides{decode.input->width, decode.input->height} ||
               setting.placement == PELM_PLACE_STRETCH;
    }
};

// ---- BMP --------------------------------------------------------------------------------------------------------

constexpr int32_t bmp_width_at = 18;

bool has_core_header(const Case &c) {
    return c.file()[14] == 12 && !c.is_two_steps();
}

int bmp_depth(const Case &c) {
    return c.file()[has_core_header(c) ? 24 : 28];
}

bool has_masks(const Case &c) {
    return bmp_depth(c) == 16 && c.file()[30] == 3;
}

// Record, palette, staging buffer, sums. What comes then is for rows.
uint32_t bmp_set_up_blocks(const Case &c) {
    const bool is_staged = c.setting.kind == PELM_SOURCE_STREAM || c.setting.kind == PELM_SOURCE_STREAM_ALT;
    return 2u + (bmp_depth(c) <= 8 ? 1u : 0u) + (is_staged ? 1u : 0u);
}

// Header, palette or masks.
uint32_t bmp_set_up_reads(const Case &c) {
    if (!c.is_stream()) return c.is_two_steps() ? 1 : 0;
    return 1u + (bmp_depth(c) <= 8 ? 1u : 0u) + (has_masks(c) ? 3u : 0u);
}

bool takes_memory_for_rows(const Case &c) {
    return c.format() == Format::bmp && c.fault.fault == Fault::allocation && c.fault.number > bmp_set_up_blocks(c) &&
           !c.is_by_own_rows();
}

bool takes_memory_for_rows_at_once(const Case &c) {
    return takes_memory_for_rows(c) && c.decode.call->progress != Progress::steps;
}

bool reads_rows(const Case &c) {
    return c.format() == Format::bmp && c.fault.number > bmp_set_up_reads(c);
}

bool reads_palette_in_two_steps(const Case &c) {
    return c.format() == Format::bmp && c.is_two_steps() && c.struck.is_read && c.fault.number > 1 && bmp_depth(c) <= 8;
}

bool misses_mask_bytes_in_two_steps(const Case &c) {
    return c.format() == Format::bmp && c.is_two_steps() && c.fault.fault == Fault::short_read && c.fault.number > 1 &&
           has_masks(c);
}

bool misses_header_bytes_in_two_steps(const Case &c) {
    return c.format() == Format::bmp && c.is_two_steps() && c.fault.fault == Fault::short_read && c.fault.number == 1;
}

// ---- PNG --------------------------------------------------------------------------------------------------------

// Record, reader and its buffer, palette and its alphas, index of the image data.
uint32_t png_blocks_before_scaling(const Case &c) {
    return 3u + (c.is_stream() ? 1u : 0u) + (c.file()[25] == 3 ? 2u : 0u);
}

bool takes_memory_for_scaling(const Case &c) {
    if (c.format() != Format::png || c.fault.fault != Fault::allocation || c.fault.from_then_on) return false;
    const bool is_interlaced = c.file()[28] == 1;
    const uint32_t blocks = !is_interlaced ? 2 : c.decode.flags == PELM_INTERLACE_FRAME ? 1 : 0;
    const uint32_t before = png_blocks_before_scaling(c);
    return c.fault.number > before && c.fault.number <= before + blocks;
}

bool is_plain_grey(const Case &c) {
    return c.file()[24] == 8 && c.file()[25] == 0 && c.file()[28] == 0;
}

bool takes_memory_to_reduce(const Case &c) {
    return takes_memory_for_scaling(c) && c.is_reduced() && !is_plain_grey(c);
}

bool has_several_pieces(const Case &c) {
    return std::any_of(c.sound.services.begin(), c.sound.services.end(),
                       [](const Service &service) { return service.is_read && service.amount == 12; });
}

bool reads_between_pieces(const Case &c) {
    return c.format() == Format::png && !c.fault.from_then_on && c.struck.amount == 12;
}

bool reads_pieces(const Case &c) {
    return c.format() == Format::png && c.fault.fault == Fault::short_read && has_several_pieces(c);
}

// ---- all --------------------------------------------------------------------------------------------------------

bool is_failing_read(const Case &c) {
    return c.fault.fault == Fault::read;
}

bool is_overclaiming_read(const Case &c) {
    return c.fault.fault == Fault::overclaiming_read;
}

bool is_whole(const Case &c) {
    const std::string &name = c.decode.input->name;
    return !name.ends_with("cut_short") && name != "gif_damaged" && !name.starts_with("gif_empty");
}

bool is_short_read(const Case &c) {
    return c.fault.fault == Fault::short_read;
}

// Nor is there in all reads that fail with it.
bool has_nothing_to_read(const Case &c) {
    uint32_t number = 0;
    for (const Service &service : c.sound.services) {
        if (!service.is_read || ++number < c.fault.number) continue;
        if (!service.at_end) return false;
        if (!c.fault.from_then_on) break;
    }
    return true;
}

bool reads_ahead(const Case &c) {
    return c.format() == Format::gif && c.fault.number > 1;
}

struct Exception {
    bool (*applies)(const Case &c);
    Expectation expectation;
};

// The first one that applies counts.
constexpr Exception exceptions[] = {
    {[](const Case &c) { return is_overclaiming_read(c) && c.struck.result == c.struck.amount; },
     {Ends::as_ever, "a read cannot have delivered more than it was asked for"}},
    {[](const Case &c) { return is_overclaiming_read(c) && is_whole(c); },
     {Ends::as_ever, "what is read of a whole file is there, and more is not needed"}},
    {is_overclaiming_read, {Ends::somehow, "nobody can tell what such a read delivered"}},
    {takes_memory_for_rows_at_once, {Ends::unwritten, "without a buffer for rows a BMP is done and not written"}},
    {takes_memory_for_rows, {Ends::results_as_ever, "without a buffer for its rows a band of a BMP is not written"}},
    {takes_memory_to_reduce, {Ends::unwritten, "memory for scaling is not checked; nothing reduced is written"}},
    {takes_memory_for_scaling, {Ends::as_ever, "memory for scaling is not checked, and not needed here"}},
    {[](const Case &c) { return is_failing_read(c) && has_nothing_to_read(c); },
     {Ends::as_ever, "a read at the end of the data has nothing to give"}},
    {[](const Case &c) { return is_failing_read(c) && reads_rows(c); },
     {Ends::short_of_rows, "a BMP has the rows that arrived"}},
    {reads_palette_in_two_steps, {Ends::results_as_ever, "a short palette is not looked at in two steps"}},
    {[](const Case &c) { return is_short_read(c) && reads_rows(c); },
     {Ends::as_ever, "rows of a BMP are read on until they are there"}},
    {misses_mask_bytes_in_two_steps,
     {Ends::failed_or_results_as_ever, "bytes of masks that do not arrive count as zeros in two steps"}},
    {[](const Case &c) { return misses_header_bytes_in_two_steps(c) && c.fault.value <= bmp_width_at; },
     {Ends::failed, "a width of which nothing arrives is 0, and refused"}},
    {misses_header_bytes_in_two_steps,
     {Ends::failed_or_results_as_ever, "header bytes that do not arrive count as zeros in two steps"}},
    {reads_between_pieces, {Ends::somehow, "the 12 bytes between two chunks of image data are not looked at"}},
    {reads_pieces, {Ends::somehow, "a chunk of image data counts as read after one read"}},
    {[](const Case &c) { return c.is_animation() && is_failing_read(c) && c.fault.from_then_on && c.fault.number > 1; },
     {Ends::as_cut, "frames are followed as far as the data goes, whyever it ends"}},
    {[](const Case &c) { return c.is_animation() && c.struck.is_read && c.fault.number > 1 && !c.fault.from_then_on; },
     {Ends::frame_as_ever_or_cut, "of a frame that breaks off the walk to the next one tells, which may find one"}},
    {[](const Case &c) { return c.is_animation() && c.struck.is_read && c.fault.number > 1; },
     {Ends::somehow, "of a frame that breaks off the walk to the next one tells, which may find one"}},
    {[](const Case &c) { return is_failing_read(c) && reads_ahead(c) && c.fault.from_then_on; },
     {Ends::failed_where_needed, "what is read ahead may never be needed"}},
    {[](const Case &c) { return is_failing_read(c) && reads_ahead(c); },
     {Ends::failed_or_as_ever, "what is read ahead may be read later"}},
    {is_short_read, {Ends::failed_or_as_ever, "what is missing is read later, or is missing"}},
};

bool is_short_of_rows(const fuzz::Outcome &got, const fuzz::Outcome &sound) {
    return std::equal(got.results.begin(), got.results.end(), sound.results.begin(), sound.results.end(),
                      [](int32_t now, int32_t ever) { return now == ever || now == PELM_RESULT_DATA_ENDED; });
}

// The first `calls` of them.
bool begin_alike(const fuzz::Outcome &one, const fuzz::Outcome &other, size_t calls) {
    const auto begins_so = [calls](const auto &list, const auto &other_list) {
        return list.size() >= calls && other_list.size() >= calls &&
               std::equal(list.begin(), list.begin() + static_cast<ptrdiff_t>(calls), other_list.begin());
    };
    return begins_so(one.results, other.results) && begins_so(one.scaled, other.scaled) &&
           begins_so(one.pixels, other.pixels);
}

bool leaves_the_same(const fuzz::Outcome &one, const fuzz::Outcome &other, size_t call) {
    return one.pixels.size() > call && other.pixels.size() > call && one.pixels[call] == other.pixels[call];
}

bool holds(const Expectation &expectation, const fuzz::Outcome &got, const fuzz::Outcome &sound,
           const fuzz::Outcome &cut) {
    const bool failed = got.results.back() == PELM_RESULT_FAILED;
    switch (expectation.ends) {
    case Ends::failed: return failed;
    case Ends::as_ever: return got == sound;
    case Ends::failed_or_as_ever: return failed || got == sound;
    case Ends::unwritten: return got.results == sound.results && !got.wrote_anything;
    case Ends::results_as_ever: return got.results == sound.results;
    case Ends::failed_or_results_as_ever: return failed || got.results == sound.results;
    case Ends::short_of_rows: return is_short_of_rows(got, sound);
    case Ends::as_cut: return got == cut;
    case Ends::failed_where_needed: return cut == sound ? got == sound : failed;
    case Ends::frame_as_ever_or_cut:
        return leaves_the_same(got, sound, expectation.call) || leaves_the_same(got, cut, expectation.call);
    case Ends::somehow: return true;
    }
    return false;
}

std::string text_of(const std::vector<int32_t> &results) {
    std::string text;
    for (const int32_t result : results)
        text += std::to_string(result) + " ";
    return text;
}

} // namespace

std::string HostFault::name() const {
    static constexpr const char *names[] = {"allocation fails", "read fails", "read comes short", "read overclaims"};
    return names[static_cast<int>(fault)] + std::string(": number ") + std::to_string(number) +
           (from_then_on ? " and all that follow" : "") + ", " + std::to_string(value);
}

void HostFault::set(PelmTestFaults &faults) const {
    switch (fault) {
    case Fault::allocation: (from_then_on ? faults.failingAllocationsFrom : faults.failingAllocation) = number; break;
    case Fault::read:
        (from_then_on ? faults.failingReadsFrom : faults.failingRead) = number;
        faults.failingReadResult = value;
        break;
    case Fault::short_read:
        (from_then_on ? faults.shortReadsFrom : faults.shortRead) = number;
        faults.mostPerRead = value;
        break;
    case Fault::overclaiming_read: faults.overclaimingReadsFrom = number; break;
    }
}

std::vector<HostFault> faults_of(const std::vector<Service> &services) {
    std::vector<HostFault> faults;
    uint32_t reads = 0, allocations = 0;
    for (const Service &service : services) {
        const uint32_t number = service.is_read ? ++reads : ++allocations;
        for (const bool from_then_on : {false, true}) {
            if (!service.is_read) {
                faults.push_back({Fault::allocation, number, from_then_on, 0});
                continue;
            }
            for (const int32_t result : {-1, 0, std::numeric_limits<int32_t>::min()})
                faults.push_back({Fault::read, number, from_then_on, result});
            for (const int32_t most : {1, 7, service.amount - 1})
                if (most > 0 && most < service.result)
                    faults.push_back({Fault::short_read, number, from_then_on, most});
        }
        if (service.is_read) faults.push_back({Fault::overclaiming_read, number, false, 1000});
    }
    return faults;
}

Expectation expectation_of(const Decode &decode, const Setting &setting, const Report &sound, const HostFault &fault) {
    uint32_t number = 0;
    size_t delivered = 0;
    const auto is_struck = [&](const Service &service) {
        if (service.is_read == (fault.fault != Fault::allocation) && ++number == fault.number) return true;
        delivered += service.is_read ? static_cast<size_t>(service.result) : 0;
        return false;
    };
    const auto struck = std::find_if(sound.services.begin(), sound.services.end(), is_struck);
    const Case c{decode, setting, sound, fault, *struck};
    const auto found = std::find_if(std::begin(exceptions), std::end(exceptions),
                                    [&c](const Exception &exception) { return exception.applies(c); });
    Expectation expectation{Ends::failed, "what the host cannot do fails the decode"};
    if (found != std::end(exceptions)) expectation = found->expectation;
    expectation.call = struck->call;
    expectation.cut = delivered + (fault.fault == Fault::short_read ? static_cast<size_t>(fault.value) : 0);
    return expectation;
}

std::string flaw(const Expectation &expectation, const Report &sound, const fuzz::Outcome &cut, const Report &faulty) {
    if (!begin_alike(faulty.outcome, sound.outcome, expectation.call))
        return "other than ever before the fault, in the first " + std::to_string(expectation.call) + " calls";
    if (!holds(expectation, faulty.outcome, sound.outcome, cut))
        return std::string("not so: ") + expectation.reason + "; results " + text_of(faulty.outcome.results) +
               "instead of " + text_of(expectation.needs_cut() ? cut.results : sound.outcome.results);
    if (faulty.again != sound.outcome)
        return "the next decode of the same request gives " + text_of(faulty.again.results) + "instead of " +
               text_of(sound.outcome.results);
    return "";
}

} // namespace pelm::sweeps
