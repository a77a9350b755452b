// Constraint files whose cost must stay linear in their size (a very long name, a statement of
// many constraints, many-star patterns, deeply nested subscripts, many unmatched statements, a
// large file): the time at 4n must stay well under the 16 times a quadratic cost would take.
// n grows until one run is long enough to time (sanitized builds get there sooner); times are
// processor times, the better of two runs, so that other jobs on the machine matter less.
#include <gtest/gtest.h>

#include <algorithm>
#include <ctime>

#include "host/port/msgman.h"
#include "manager/lunmgr.h"
#include "support/pathological.h"
#include "support/test_support.h"

namespace {

using lun_test::PathologicalInput;

double CpuSeconds() {
    timespec now{};
    ::clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) * 1e-9;
}

// Processor seconds to annotate the input of size n over its design, read from a file.
double Seconds(const PathologicalInput& input, size_t n) {
    lun_test::ScratchDir dir;
    const std::string file = dir.Write("p.ucf", input.text(n));
    auto design = input.design(n);
    Port_MsgCapture quiet;
    const double start = CpuSeconds();
    Ta_LunMgr mgr(file.c_str(), CP_UCF, nullptr);
    mgr.annotate(design->GetWorkView());
    return CpuSeconds() - start;
}

TEST(Pathological, CostGrowsLinearly) {
    for (const PathologicalInput& input : lun_test::PathologicalInputs()) {
        SCOPED_TRACE(input.name);
        // n stops at the full size, or at 8 MB of text.
        const size_t most = std::min<size_t>(input.full, 8000000);
        size_t n = most / 64;
        double once = Seconds(input, n);
        while (once < 0.05 && n * 2 <= most) once = Seconds(input, n *= 2);
        once = std::min(once, Seconds(input, n));
        const double four = std::min(Seconds(input, 4 * n), Seconds(input, 4 * n));
        EXPECT_LT(four, 8 * once + 0.01) << "n = " << n << ": " << once << " s, 4n: " << four << " s";
    }
}

}  // namespace
