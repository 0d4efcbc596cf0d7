// What a decode makes of one thing that its host does wrong: it fails, save for a short list of exceptions. Whatever
// comes of it, the calls before the one that it strikes are as ever.
#pragma once

#include "tests/sweeps/plans.h"

namespace pelm::sweeps {

enum class Fault { allocation, read, short_read, overclaiming_read };

// Strikes at one call of the service, or at all from there on.
struct HostFault {
    Fault fault;
    uint32_t number; // from 1
    bool from_then_on;
    int32_t value; // what a failing read gives, or how much a short one delivers

    std::string name() const;
    void set(PelmTestFaults &faults) const;
};

// All that can strike a decode that takes these services.
std::vector<HostFault> faults_of(const std::vector<fuzz::Service> &services);

enum class Ends {
    failed,  // the last result is 0
    as_ever, // everything is as without the fault
    failed_or_as_ever,
    unwritten,       // the results are as without the fault, and nothing is written
    results_as_ever, // the results are
    failed_or_results_as_ever,
    short_of_rows,        // the results are, but a line call may say that the data ended
    as_cut,               // everything is as of a file that ends where the fault strikes
    frame_as_ever_or_cut, // what the call that is struck leaves in the buffer is
    failed_where_needed,  // failed, unless that file gives everything as ever
    somehow               // any result that the call has
};

struct Expectation {
    Ends ends;
    const char *reason;
    uint32_t call = 0; // that the fault strikes, from 0
    size_t cut = 0;    // bytes that the source delivered by then, and in that read

    bool needs_cut() const {
        return ends == Ends::as_cut || ends == Ends::frame_as_ever_or_cut || ends == Ends::failed_where_needed;
    }
};

// `sound`: of the same decode without the fault.
Expectation expectation_of(const Decode &decode, const Setting &setting, const fuzz::Report &sound,
                           const HostFault &fault);

// What is wrong with it, or "". `cut`: what comes of the cut file, where the expectation needs it.
std::string flaw(const Expectation &expectation, const fuzz::Report &sound, const fuzz::Outcome &cut,
                 const fuzz::Report &faulty);

} // namespace pelm::sweeps
