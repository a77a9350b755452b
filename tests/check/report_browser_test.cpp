// What a person sees of the check page of the example in a browser (headless Chromium): the
// findings count, and the names a statement resolved to once expanded, the page being opened at
// #s-0-19 (the LED bus statement of blinky.ucf), as a click on its row does. A screenshot of
// that view is left in the test's folder of the build (check_report.png).
#include <gtest/gtest.h>

#include "host/port/file.h"
#include "support/test_support.h"

namespace {

using lun_test::RunCommand;

const std::string kExample = std::string(LUN_SOURCE_DIR) + "/examples/blinky/";

// The row of a table whose id is given, as the browser serialised it.
std::string RowById(const std::string& dom, const std::string& id) {
    const size_t at = dom.find("id=\"" + id + "\"");
    if (at == std::string::npos) return "";
    return dom.substr(at, dom.find("</tr>", at) - at);
}

TEST(CheckReportBrowser, ShowsTheCountAndAnExpandedStatement) {
    if (RunCommand("command -v chromium") != 0) GTEST_SKIP() << "chromium is not installed";
    lun_test::ScratchDir dir;
    const std::string page = dir.path() + "/blinky.html";
    std::string out, err;
    ASSERT_EQ(lun_test::Quillmap("check " + kExample + "blinky.json --ucf " + kExample + "blinky.ucf --report " + page,
                                 &out, &err),
              0)
        << err;
    // Chromium is not built with the sanitizers: their settings are not its business.
    const std::string chromium = "env -u ASAN_OPTIONS -u UBSAN_OPTIONS timeout 120 chromium --headless --disable-gpu "
                                 "--no-sandbox --user-data-dir=" + dir.path() + "/profile --virtual-time-budget=5000 ";
    std::string dom, expanded;
    ASSERT_EQ(RunCommand(chromium + "--dump-dom 'file://" + page + "'", &dom), 0);
    ASSERT_EQ(RunCommand(chromium + "--dump-dom 'file://" + page + "#s-0-19'", &expanded), 0);

    EXPECT_NE(dom.find(">3 findings: 0 errors, 1 warning, 2 info<"), std::string::npos) << dom;
    EXPECT_EQ(dom.find("<li>"), std::string::npos);  // nothing is expanded by itself
    const std::string row = RowById(expanded, "r-10");
    EXPECT_NE(row.find("NET \"led&lt;*&gt;\" IOSTANDARD = LVCMOS33"), std::string::npos) << row;
    EXPECT_NE(row.find("4 objects"), std::string::npos) << row;
    const std::string names = RowById(expanded, "d-10");
    EXPECT_NE(names.find("Resolved to 4 objects:"), std::string::npos) << names;
    for (const char* name : {"led[0]", "led[1]", "led[2]", "led[3]"})
        EXPECT_NE(names.find(std::string("<li>") + name + "</li>"), std::string::npos) << names;

    ASSERT_EQ(RunCommand(chromium + "--window-size=1200,1400 --screenshot=check_report.png 'file://" + page + "#s-0-19'"),
              0);
    EXPECT_TRUE(Port::File::exist("check_report.png"));
}

}  // namespace
