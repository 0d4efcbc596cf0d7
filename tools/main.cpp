// pelm-decode: runs the inputs one after the other and turns what happened into messages and an exit status.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <exception>

#include "tools/animation_page.h"
#include "tools/decode.h"
#include "tools/failure.h"
#include "tools/frame_files.h"
#include "tools/gif_frames.h"
#include "tools/interrupt.h"
#include "tools/output_names.h"

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

class Stopwatch {
public:
    void start() { start_ = Clock::now(); }
    void stop() { passed_ += Clock::now() - start_; }
    double milliseconds() const { return passed_.count(); }

private:
    using Clock = std::chrono::steady_clock;
    Clock::time_point start_;
    std::chrono::duration<double, std::milli> passed_{0};
};

// One input, described.
struct Work {
    Input &input;
    const ImageFormat &format;
    const ImageDescription &image;
    Session &session;
    Stopwatch &stopwatch; // of the decoder, without the writing
};

class Run {
public:
    explicit Run(const Options &options) : options_(options), progress_(!options.quiet, options.inputs.size()) {
        if (options.all_frames) frame_output_name(options, 0); // throws where it will later
        if (!options.info && !options.all_frames && options.page.empty()) outputs_ = output_names(options);
    }

    Outcome all();

private:
    Outcome one(size_t index);
    Outcome decode_one(const std::string &name, const OutputName *output); // throws; nullptr: the options say where
    Outcome describe_one(const std::string &name, const ImageDescription &image);
    void write(const Picture &picture, const OutputName &to);
    Remarks decode_still(const Work &work, const OutputName &output);
    Remarks play_one(const Work &work, const OutputName *output);
    Remarks play_with(const Work &work, const TakeFrame &take);
    Remarks write_frames(const Work &work);
    Remarks write_page(const Work &work);
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
    write_picture(file, picture, to.type);
    throw_if_interrupted();
    file.commit();
}

Outcome Run::describe_one(const std::string &name, const ImageDescription &image) {
    std::string line = shown_name(name) + ": " + image.words;
    line += image.refusal.empty() ? "; decoded" : "; refused: " + image.refusal;
    if (!image.shortage.empty()) line += "; truncated: " + image.shortage;
    for (const std::string &note : image.notes)
        line += "; note: " + note;
    for (const std::string &detail : image.details)
        line += "\n  " + detail;
    progress_.clear();
    std::puts(line.c_str());
    if (!image.refusal.empty()) return Outcome::failed;
    return image.shortage.empty() ? Outcome::done : Outcome::truncated;
}

Remarks Run::decode_still(const Work &work, const OutputName &output) {
    work.stopwatch.start();
    const Decoded decoded = decode(work.input, work.format, work.image, options_, work.session);
    work.stopwatch.stop();
    write(decoded.picture, output);
    return decoded.remarks;
}

Remarks Run::play_with(const Work &work, const TakeFrame &take) {
    work.stopwatch.start();
    const auto take_untimed = [&](const Picture &picture, size_t index, uint32_t delay) {
        work.stopwatch.stop();
        take(picture, index, delay);
        throw_if_interrupted();
        work.stopwatch.start();
    };
    const Remarks remarks = play(work.input, work.format, work.image, options_, work.session, take_untimed);
    work.stopwatch.stop();
    return remarks;
}

Remarks Run::write_frames(const Work &work) {
    FrameFiles files(options_);
    const Remarks remarks =
        play_with(work, [&](const Picture &picture, size_t index, uint32_t) { files.add(picture, index); });
    files.commit();
    return remarks;
}

Remarks Run::write_page(const Work &work) {
    OutputFile file(options_.page);
    AnimationPage page(file, shown_name(options_.inputs[0]));
    const Remarks remarks =
        play_with(work, [&](const Picture &picture, size_t, uint32_t delay) { page.add(picture, delay); });
    page.finish(work.image.animation.plays);
    file.commit();
    return remarks;
}

Remarks Run::play_one(const Work &work, const OutputName *output) {
    if (options_.all_frames) return write_frames(work);
    if (!options_.page.empty()) return write_page(work);
    return play_with(work, [&](const Picture &picture, size_t, uint32_t) { write(picture, *output); });
}

Outcome Run::decode_one(const std::string &name, const OutputName *output) {
    Session session(options_, progress_);
    Input input(name, options_.source);
    const ImageFormat &format = recognise(input.head());
    settle(input, format, options_.mode);
    const ImageDescription image = describe(format, input, options_.mode);
    session.throw_if_stopped();
    if (options_.info) return describe_one(name, image);

    const uint64_t reads_before = session.counters().reads;
    Stopwatch stopwatch;
    const Work work{input, format, image, session, stopwatch};
    const Remarks remarks = options_.wants_frames() ? play_one(work, output) : decode_still(work, *output);
    PelmHostCounters counters = session.counters();
    counters.reads -= reads_before;
    if (options_.stats) tell_stats(name, stopwatch.milliseconds(), counters);
    for (const std::string &note : remarks.notes)
        warn(name, note);
    if (remarks.shortage.empty()) return Outcome::done;
    warn(name, remarks.shortage);
    return Outcome::truncated;
}

Outcome Run::one(size_t index) {
    const std::string &name = options_.inputs[index];
    progress_.start_input(index, name);
    try {
        return decode_one(name, outputs_.empty() ? nullptr : &outputs_[index]);
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
