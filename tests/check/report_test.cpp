// The HTML page of quillmap check: its data survives any byte of a constraint file and cannot
// end its script early; findings point at their statements' rows; pages that cannot be written
// are refused with a message.
#include <gtest/gtest.h>

#include <simdjson.h>

#include "host/port/json_text.h"
#include "support/test_support.h"

namespace {

using lun_test::Quillmap;
using lun_test::CountOf;
using lun_test::ReadFile;

const std::string kDesign = std::string(LUN_SOURCE_DIR) + "/examples/blinky/blinky.json";

TEST(CheckReport, DataKeepsEveryByteAndPointsAtRows) {
    lun_test::ScratchDir dir;
    const std::string ucf = dir.Write("odd.ucf",
                                      "NET \"clk\" LOC = P10;\n"
                                      "NET \"a&b</script><!--x\" LOC = P1;\n"
                                      "NET \"caf\xe9\" LOC = P2;\n"
                                      "NET \"q\\\"t\" LOC = P3;\n");
    const std::string page = dir.path() + "/r.html";
    std::string out, err;
    ASSERT_EQ(Quillmap("check " + kDesign + " --ucf " + ucf + " --disable unplaced-port --disable clock-without-period "
                       "--report " + page,
                       &out, &err),
              1)
        << err;
    const std::string html = ReadFile(page);
    EXPECT_EQ(CountOf(html, "</script"), 2u);  // the data's and the code's own ends
    EXPECT_EQ(CountOf(html, "<!--"), 0u);
    const std::string open = "<script type=\"application/json\" id=\"check-data\">";
    const size_t from = html.find(open) + open.size();
    simdjson::dom::parser parser;
    simdjson::dom::element data;
    ASSERT_EQ(parser.parse(html.substr(from, html.find("</script>", from) - from)).get(data), simdjson::SUCCESS);

    simdjson::dom::array rows = data["rows"];
    auto text = [&](size_t row) {
        return Port_DecodeByteEscapes(std::string(std::string_view(rows.at(row).at(2))));
    };
    EXPECT_EQ(text(1), "NET \"a&b</script><!--x\" LOC = P1");
    EXPECT_EQ(text(2), "NET \"caf\xe9\" LOC = P2");
    EXPECT_EQ(int64_t(rows.at(1).at(3)), 0);           // resolved to nothing
    EXPECT_EQ(int64_t(rows.at(1).at(6)) & 1, 1);       // marked unmatched
    EXPECT_EQ(int64_t(rows.at(3).at(3)), -1);          // the unreadable statement names nothing
    // Each finding's first reference is the row of its statement: the syntax error (found by
    // file and line), the two unmatched names, the placed clock without a standard.
    std::vector<int64_t> first_rows;
    for (simdjson::dom::element f : simdjson::dom::array(data["findings"]))
        first_rows.push_back(int64_t(f["refs"].at(0).at(0)));
    EXPECT_EQ(first_rows, (std::vector<int64_t>{3, 1, 2, 0}));
}

TEST(CheckReport, PagesThatCannotBeWrittenAreRefused) {
    lun_test::ScratchDir dir;
    const std::string ucf = dir.Write("b.ucf", "NET clk LOC = P10;\n");
    struct Case {
        std::string report;
        int status;
        std::string message;
    } cases[] = {
        {dir.path(), 1, "Could not write '" + dir.path() + "': "},
        {ucf, 2, "The output file '" + ucf + "' is the input file '" + ucf + "': give another output file."},
    };
    for (const Case& c : cases) {
        std::string out, err;
        EXPECT_EQ(Quillmap("check " + kDesign + " --ucf " + ucf + " --report " + c.report, &out, &err), c.status);
        EXPECT_NE(err.find(c.message), std::string::npos) << err;
    }
    EXPECT_EQ(ReadFile(ucf), "NET clk LOC = P10;\n");
}

}  // namespace
