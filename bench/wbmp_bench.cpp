#include "bench/wbmp_bench.h"

#include "bench/contest.h"
#include "bench/copy_peer.h"
#include "bench/own_decoder.h"
#include "bench/wbmp_pictures.h"

namespace bench {
namespace {

void add(const std::string &name, const SharedWork &work, Format format, Box box) {
    const Request request = {ZOTARPELMI_DecodeWBMP, format, box};
    const size_t size = bytes_of(format, box);
    add_contest("wbmp/" + name + "/" + format.name, work,
                {{"pelm", [=](const Bytes &wbmp) { return decode_memory(request, wbmp, output_of(size)); }},
                 copy_of_output(format, box)});
}

} // namespace

void add_wbmp_benchmarks() {
    const SharedWork work = file_made_by([] { return wbmp_page(4000, 3000); });
    for (const Format &format : {rgba, rgb565})
        add("page", work, format, {4000, 3000});
    add("page to 320x240", work, rgb565, {320, 240});
    add("page to 3200x2400", work, rgba, {3200, 2400});
}

} // namespace bench
