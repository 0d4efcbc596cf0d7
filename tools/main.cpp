// pelm-decode: runs the inputs one after the other and turns what happened into messages and an exit status.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <exception>

#include "tools/decode.h"
#include "tools/failure.h"
#include "tools/interrupt.h"
#include "tools/output_names.h"
#include "tools/writers.h"

namespace pelm_tool {
namespace {

enum class Outcome { done, truncated, failed }; // from good to bad

int exit_status(Outcome outcome) {
    switch (outcome) {
    case Outcome::done: return 0;
    case Outcome::truncated: return 2;
    case Outcome::failed: break;
    }
    return 1;
}

class Milliseconds {
public:
    double passed() const {
        return std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - start_).count();
    }

private:
    std::chrono::steady_clock::time_point start_ = std::chrono::steady_clock::now();
};

class Run {
public:
    explicit Run(const Options &options) : options_(options), progress_(!options.quiet, options.inputs.size()) {
        if (!options.info) outputs_ = output_names(options);
    }

    Outcome all();

private:
    Outcome one(size_t index);
    Outcome decode_one(const std::string &name, const OutputName *output); // throws
    Outcome describe_one(const std::string &name, const ImageDescription &image);
    void write(const Picture &picture, const OutputName &to);
    void tell(const std::string &name, const std::string &what);
    void warn(const std::string &name, const std::string &of);
    void tell_stats(const std::string &name, double milliseconds, const PelmHostCounters &counters);

    const Options &options_;
    Progress progress_;
    std::vector<OutputName> outputs_;
};

void Run::tell(const std::string &name, const std::string &what) {
    progress_.clear();
    std::fprintf(stderr, "pelm-decode: %s: %s\n", shown_name(name).c_str(), what.c_str());
}

void Run::warn(const std::string &name, const std::string &of) {
    if (!options_.quiet) tell(name, "warning: " + of);
}

void Run::tell_stats(const std::string &name, double milliseconds, const PelmHostCounters &counters) {
    char words[160];
    std::snprintf(words, sizeof words, "%.2f ms, %llu allocations, %llu bytes of memory at most, %llu reads",
                  milliseconds, static_cast<unsigned long long>(counters.allocations),
                  static_cast<unsigned long long>(counters.peakBytes), static_cast<unsigned long long>(counters.reads));
    tell(name, words);
}

void Run::write(const Picture &picture, const OutputName &to) {
    OutputFile file(to.path);
    switch (to.type) {
    case OutputType::png: write_png(file, picture); break;
    case OutputType::ppm: write_ppm(file, picture); break;
    case OutputType::pam: write_pam(file, picture); break;
    case OutputType::raw: write_raw(file, picture); break;
    }
    throw_if_interrupted();
    file.commit();
}

Outcome Run::describe_one(const std::string &name, const ImageDescription &image) {
    std::string line = shown_name(name) + ": " + image.words;
    line += image.refusal.empty() ? "; decoded" : "; refused: " + image.refusal;
    if (!image.shortage.empty()) line += "; truncated: " + image.shortage;
    for (const std::string &note : image.notes)
        line += "; note: " + note;
    progress_.clear();
    std::puts(line.c_str());
    if (!image.refusal.empty()) return Outcome::failed;
    return image.shortage.empty() ? Outcome::done : Outcome::truncated;
}

Outcome Run::decode_one(const std::string &name, const OutputName *output) {
    Session session(options_, progress_);
    Input input(name, options_.source);
    const ImageFormat &format = recognise(input.head());
    input.settle(format.is_read_from_memory, format.needs_seeks);
    const ImageDescription image = describe(format, input);
    session.throw_if_stopped();
    if (output == nullptr) return describe_one(name, image);

    const uint64_t reads_before = session.counters().reads;
    const Milliseconds clock;
    const Decoded decoded = decode(input, format, image, options_, session);
    const double milliseconds = clock.passed();
    write(decoded.picture, *output);
    PelmHostCounters counters = session.counters();
    counters.reads -= reads_before;
    if (options_.stats) tell_stats(name, milliseconds, counters);
    for (const std::string &note : decoded.notes)
        warn(name, note);
    if (decoded.shortage.empty()) return Outcome::done;
    warn(name, decoded.shortage);
    return Outcome::truncated;
}

Outcome Run::one(size_t index) {
    const std::string &name = options_.inputs[index];
    progress_.start_input(index, name);
    try {
        return decode_one(name, options_.info ? nullptr : &outputs_[index]);
    } catch (const std::bad_alloc &) {
        tell(name, "not enough memory");
    } catch (const std::exception &error) {
        tell(name, interrupted() ? "interrupted" : error.what());
    }
    return Outcome::failed;
}

Outcome Run::all() {
    Outcome worst = Outcome::done;
    for (size_t i = 0; i < options_.inputs.size() && !interrupted(); ++i)
        worst = std::max(worst, one(i));
    return worst;
}

// Standard output is written last when the program ends, where nobody would notice a full disk.
Outcome flush_standard_output() {
    if (std::fflush(stdout) == 0 && std::ferror(stdout) == 0) return Outcome::done;
    std::perror("pelm-decode: cannot write to standard output");
    return Outcome::failed;
}

int run(int argc, char **argv) {
    Options options;
    if (const std::optional<int> status = parse_options(argc, argv, options)) {
        return std::max(*status, exit_status(flush_standard_output()));
    }
    catch_interrupts();
    const Outcome outcome = Run(options).all();
    return exit_status(std::max(outcome, flush_standard_output()));
}

} // namespace
} // namespace pelm_tool

int main(int argc, char **argv) {
    int status = 1;
    try {
        status = pelm_tool::run(argc, argv);
    } catch (const std::exception &error) {
        std::fprintf(stderr, "pelm-decode: %s\n", error.what());
    }
    pelm_tool::end_by_interrupt();
    return status;
}
