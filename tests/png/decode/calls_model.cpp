#include "tests/png/decode/calls_model.h"

namespace pelm::test {

CallsModel::CallsModel(const Picture &picture, const Request &request)
    : picture_(picture), request_(request), geometry_(geometry_of(picture, request)) {
    if (is_scaled_grey()) grey_rows_ = used_grey_rows(picture, geometry_);
}

void CallsModel::write_source_row(uint32_t reduced_base, Bytes &bytes) {
    const uint32_t row = source_row_++;
    if (geometry_.one_to_one) {
        draw_one_to_one(picture_, geometry_, request_, row, row + 1, bytes);
        ++rows_done_;
    } else if (is_scaled_grey()) {
        if (rows_done_ >= grey_rows_.size() || grey_rows_[rows_done_].source_row != row) return;
        draw_scaled_grey(picture_, geometry_, request_, rows_done_, rows_done_ + 1, first_row_of_call_, bytes);
        ++rows_done_;
    } else {
        const uint32_t complete = reduced_rows_after(picture_, geometry_, source_row_);
        draw_reduced(picture_, geometry_, request_, rows_done_, complete, reduced_base, bytes);
        rows_done_ = complete;
    }
}

bool CallsModel::stops(uint32_t rows_before) const {
    if (stop_row_ == 0 || stop_row_ == picture_.height) return false;
    if (geometry_.one_to_one || is_scaled_grey()) return rows_done_ == stop_row_;
    return rows_before < stop_row_ && rows_done_ >= stop_row_;
}

int32_t CallsModel::line(int32_t rows, Bytes &bytes) {
    if (rows != 0) stop_row_ = rows_done_ + static_cast<uint32_t>(rows);
    first_row_of_call_ = rows_done_;
    while (source_row_ < picture_.height) {
        const uint32_t before = rows_done_;
        write_source_row(first_row_of_call_, bytes);
        if (stops(before)) return 4;
    }
    return 1;
}

void CallsModel::iterate(uint32_t source_rows, Bytes &bytes) {
    first_row_of_call_ = rows_done_;
    while (source_row_ < source_rows && source_row_ < picture_.height)
        write_source_row(0, bytes);
}

} // namespace pelm::test
