// Records built outside the parser, and read failures.
#include <gtest/gtest.h>

#include "host/port/msgman.h"
#include "recorder.h"

using namespace parser_test;

TEST(ParserRecords, InitRangeExpandsItsOwnKey) {
    Pr_Logical_InitRangeConstraint full(Pr_Logical_Constraint::INIT_, "init_00..3f", "AB");
    EXPECT_EQ(full.get_type(), Pr_Logical_Constraint::INIT_);
    EXPECT_STREQ(full.get_constraint_value(), "AB");
    ASSERT_EQ(full.end_name() - full.begin_name(), 64);
    EXPECT_STREQ(full.begin_name()[0], "INIT_00");
    EXPECT_STREQ(full.begin_name()[10], "INIT_0A");
    EXPECT_STREQ(full.begin_name()[63], "INIT_3F");

    Pr_Logical_InitRangeConstraint parity(Pr_Logical_ConstraintType::INIT_, "INITP_07..07", "1");
    EXPECT_EQ(list(parity.begin_name(), parity.end_name()), "(INITP_07)");

    for (const char* key : {"INIT_02..01", "INIT_00", "INIT_00..0G", "INIT_00..001", "LOC"}) {
        Pr_Logical_InitRangeConstraint none(Pr_Logical_ConstraintType::INIT_, key, "0");
        EXPECT_EQ(none.begin_name(), none.end_name()) << key;
    }
}

TEST(ParserRecords, ListsSurviveCopiesAndGrowth) {
    auto* original = new Pr_Logical_StringListConstraint("LOC", {"P1", "P2"});
    for (int i = 0; i < 100; ++i) original->add_value(std::string(i, 'x'));  // reallocates
    Pr_Logical_StringListConstraint copy = *original;
    delete original;
    ASSERT_EQ(copy.num_values(), 102);
    EXPECT_STREQ(copy.begin_value()[1], "P2");
    EXPECT_EQ(std::string(copy.begin_value()[101]), std::string(99, 'x'));

    Pr_Logical_StringListConstraint moved = std::move(copy);
    EXPECT_STREQ(moved.begin_value()[0], "P1");
    EXPECT_EQ(copy.num_values(), 0);
}

TEST(ParserRecords, DefinitionOwnsAddedConstraints) {
    Pr_Logical_ConstraintDefn defn("u1");
    const double valid = 4000;
    defn.add_constraint(std::make_unique<Pr_Logical_OffsetConstraint>(
        "OFFSET", true, 2000, &valid, true, "clk", nullptr, nullptr));
    defn.add_constraint(
        std::make_unique<Pr_Logical_PeriodConstraint>("PERIOD", 10000, false, 0, 50, nullptr));
    defn.add_constraint(std::make_unique<Pr_Logical_StringConstraint>("LOC", "P1"));
    EXPECT_EQ(Recorder::defn(defn),
              "u1;(OFFSET,4,true,2000,>4000,true,clk,null,false,),"
              "(PERIOD,5,10000,false,0,50,null),(LOC,1,P1)");
}

TEST(ParserRecords, ReadFailureIsReported) {
    // Opening succeeds, reading from offset 0 of the process's memory does not.
    Port_MsgCapture capture;
    Recorder r("/proc/self/mem");
    EXPECT_FALSE(r.parse());
    EXPECT_TRUE(r.calls.empty());
    EXPECT_EQ(capture.Texts(Port_Severity::Error),
              std::vector<std::string>{"Could not read constraint file '/proc/self/mem'.\n"});
}
