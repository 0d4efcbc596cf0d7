// Decodes of all formats by all calls at once on many threads: each must come out as it does alone. Under
// ThreadSanitizer (the `thread` preset) nothing that the library does may race either.
#include <barrier>
#include <thread>

#include <gtest/gtest.h>

#include "tests/sweeps/decodes.h"
#include "tests/sweeps/extent.h"

namespace pelm::sweeps {
namespace {

constexpr size_t thread_count = 8;
constexpr uint8_t background = 0x5C;

struct Job {
    Decode decode;
    Setting setting;
    size_t output_size;
    Outcome alone;

    std::string name() const { return decode.name() + ", " + setting.name(); }
};

Outcome outcome_of(const Job &job) {
    Bytes buffer(job.output_size, background);
    Outcome outcome = run(job.decode, job.setting, buffer);
    const bool has_violation = PelmTest_Violation() != nullptr;
    PelmTest_Reset();
    if (has_violation) outcome.replies.clear(); // no outcome that there is
    return outcome;
}

// Every way of these inputs in every `step`-th format code, the settings one after the other.
void add_jobs(std::vector<Job> &jobs, const std::vector<Input> &inputs, uint32_t step) {
    for (const Decode &decode : decodes_of(inputs)) {
        for (uint32_t format = static_cast<uint32_t>(jobs.size()) % step; format <= 12; format += step) {
            const auto number = static_cast<uint32_t>(jobs.size()) * 7 % setting_count;
            Job job{decode, nth_setting(*decode.input, format, number), 0, {}};
            job.output_size = output_size(decode, job.setting).value_or(0);
            PelmTest_Reset();
            job.alone = outcome_of(job);
            ASSERT_FALSE(job.alone.replies.empty()) << job.name();
            jobs.push_back(std::move(job));
        }
    }
}

// The first job that came out otherwise, or "". All threads begin each job together, even ones the same one and the
// others one each: accesses that race lie close in time then, as ThreadSanitizer forgets what was long ago.
std::string work(const std::vector<Job> &jobs, size_t thread, std::barrier<> &together) {
    const size_t first = thread % 2 == 0 ? 0 : thread * jobs.size() / thread_count;
    std::string finding;
    for (size_t i = 0; i < jobs.size(); ++i) {
        const Job &job = jobs[(first + i) % jobs.size()];
        together.arrive_and_wait();
        if (outcome_of(job) != job.alone && finding.empty()) finding = job.name();
    }
    return finding;
}

TEST(Threads, decodes_on_eight_threads_come_out_as_they_do_alone) {
    const std::vector<Input> small = small_inputs();
    const std::vector<Input> samples = sample_inputs();
    std::vector<Job> jobs;
    ASSERT_NO_FATAL_FAILURE(add_jobs(jobs, small, by_extent(7u, 1u, 1u)));
    ASSERT_NO_FATAL_FAILURE(add_jobs(jobs, samples, by_extent(13u, 2u, 2u)));
    tell_count("threads", jobs.size() * thread_count);
    EXPECT_GE(jobs.size() * thread_count, by_extent(4000u, 20000u, 20000u));

    std::string findings[thread_count];
    std::barrier together(static_cast<std::ptrdiff_t>(thread_count));
    std::vector<std::thread> threads;
    for (size_t i = 0; i < thread_count; ++i) {
        threads.emplace_back([&jobs, &together, &finding = findings[i], i] { finding = work(jobs, i, together); });
    }
    for (std::thread &thread : threads)
        thread.join();
    for (const std::string &finding : findings)
        EXPECT_EQ(finding, "") << "came out otherwise than alone, or broke the host's rules";
}

} // namespace
} // namespace pelm::sweeps
