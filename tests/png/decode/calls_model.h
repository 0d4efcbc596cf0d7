// What a sequence of line and iterative calls has to write and to answer: rows are counted, calls stop, and each call
// has a buffer of its own.
#pragma once

#include "tests/png/decode/expected.h"

namespace pelm::test {

class CallsModel {
public:
    CallsModel(const Picture &picture, const Request &request);

    // One line call: what it returns. Writes into the buffer that the call gets.
    int32_t line(int32_t rows, Bytes &bytes);
    // One iterative call whose block ends when `source_rows` rows are complete.
    void iterate(uint32_t source_rows, Bytes &bytes);

    uint32_t rows_done() const { return rows_done_; }
    uint32_t source_rows() const { return source_row_; }

private:
    void write_source_row(uint32_t reduced_base, Bytes &bytes);
    bool stops(uint32_t rows_before) const;
    bool is_scaled_grey() const { return !geometry_.one_to_one && picture_.is_plain_grey(); }

    const Picture &picture_;
    const Request &request_;
    Geometry geometry_;
    std::vector<GreyRow> grey_rows_;
    uint32_t source_row_ = 0;
    uint32_t rows_done_ = 0;
    uint32_t first_row_of_call_ = 0;
    uint32_t stop_row_ = 0;
};

} // namespace pelm::test
