// A complete board file through the parser: every callback, its arguments, line and text.
#include <gtest/gtest.h>

#include <sstream>

#include "host/port/msgman.h"
#include "recorder.h"

using namespace parser_test;

namespace {

const char* const kBoardFile =
    "# Board constraints, revision B\n"
    "// Global settings\n"
    "CONFIG PART = qx100-fg256-2;\n"
    "CONFIG STEPPING = \"ES\";\n"
    "CONFIG DCI_CASCADE = \"1 3 5\";\n"
    "SYSTEM_JITTER = 0.2 ns;\n"
    "NET \"clk\" TNM_NET = clk_grp | LOC = P10;   # board clock\n"
    "NET data<*> LOC = P1, P2, P3 | IOSTANDARD = std33 | PULLUP;\n"
    "NET rst_n TIG;\n"
    "NET \"bus/d[0]\" MAXDELAY = 1.5 ns;\n"
    "NET din OFFSET = IN 2 ns VALID 4 ns BEFORE clk TIMEGRP regs HIGH;\n"
    "NET clk2 period = 100 MHz LOW 40%;\n"
    "INST \"u1/reg*\" TNM = FFS:regs;\n"
    "INST u2 TNM = RAMS mem_grp | RLOC_RANGE = X0Y0:X3Y3;\n"
    "INST mem0 INIT_00..02 = 0F0F;\n"
    "INST clkgen FEEDBACK = 1.5 ns clkfb;\n"
    "PIN u3.D loc = SITE_A0;\n"
    "TIMESPEC TS_clk = PERIOD clk_grp 10 ns HIGH 50%;\n"
    "TIMESPEC TS_clk2 = PERIOD clk2_grp TS_clk * 2 PHASE + 2.5 ns\n"
    "    HIGH 50% PRIORITY 1;\n"
    "TIMESPEC \"TS_fast\" = PERIOD \"fast_grp\" 250MHz LOW 2 ns INPUT_JITTER 100 ps;\n"
    "TIMESPEC TS_ab = FROM grpA TO grpB 5 ns DATAPATHONLY PRIORITY 2;\n"
    "TIMESPEC TS_abc = FROM grpA THRU grpB TO grpC TS_1 / 2;\n"
    "TIMESPEC TS_f = FROM grpA TO grpB 200 MHz;\n"
    "TIMESPEC TS_tig = FROM grpA TO grpB TIG PRIORITY 3;\n"
    "TIMESPEC TS_ign = TIG;\n"
    "TIMESPEC TS_old = DROP_SPEC;\n"
    "ENABLE = TS_clk;\n"
    "DISABLE = TS_old;\n"
    "OFFSET = IN 2 ns BEFORE clk;\n"
    "OFFSET = OUT 3 ns VALID 1 ns AFTER clk TIMEGRP regs HIGH;\n"
    "TIMEGRP data OFFSET = IN 2 ns BEFORE clk;\n"
    "timegrp data offset = out 2.5 ns after clk timegrp regs;\n"
    "TIMEGRP fast = RISING ffs FFS(u1/*) EXCEPT slow;\n"
    "TIMEGRP tg1 AREA_GROUP = ag1;\n"
    "AREA_GROUP ag1 RANGE = SITE_A0:SITE_A7, SITE_B0:SITE_B3 | PLACE = closed;\n"
    "SET set1 RLOC_RANGE = X0Y0:X3Y3;\n"
    "PROHIBIT = SITE_C0, SITE_C1;\n"
    "CONFIG VREF = P20, P21;\n"
    "TEMPERATURE = 85 C;\n"
    "VOLTAGE = 1200 mV;\n"
    "MODEL m1 ATTR = 1;\n"
    "BEGIN MODEL m1;\n"
    "END;\n"
    "TIMESPEC TS_bad = PERIOD clk_grp 10xs;\n"
    "FOO bar;\n"
    "NET last LOC = P9\n";

struct Expected {
    int line;
    const char* what;
};

const Expected kExpected[] = {
    {1, "comment( Board constraints, revision B)"},
    {2, "comment( Global settings)"},
    {3, "config(PART,qx100-fg256-2)"},
    {4, "config(STEPPING,ES)"},
    {5, "config(DCI_CASCADE,1 3 5)"},
    {6, "config(SYSTEM_JITTER,0.2 ns)"},
    {7, "net(clk;(TNM_NET,2,(clk_grp)),(LOC,1,P10))"},
    {8, "net(data<*>;(LOC,2,(P1,P2,P3)),(IOSTANDARD,1,std33),(PULLUP,0))"},
    {9, "net(rst_n;(TIG,2,()))"},
    {10, "net(bus/d[0];(MAXDELAY,1,1500))"},
    {11, "net(din;(OFFSET,4,true,2000,>4000,true,clk,regs,true,HIGH))"},
    {12, "net(clk2;(period,5,10000,true,0,40,null))"},
    {13, "comp(u1/reg*;(TNM,2,(FFS,regs)))"},
    {14, "comp(u2;(TNM,2,(RAMS,mem_grp)),(RLOC_RANGE,2,(X0Y0,X3Y3)))"},
    {15, "comp(mem0;(INIT_00..02,3,(INIT_00,INIT_01,INIT_02),0F0F))"},
    {16, "comp(clkgen;(FEEDBACK,2,(1.5,ns,clkfb)))"},
    {17, "pin(u3.D;(loc,1,SITE_A0))"},
    {18, "period(TS_clk,clk_grp,null,true,10000,true,true,0,false,0,50,null,NONE)"},
    {19, "period(TS_clk2,clk2_grp,TS_clk,true,2,true,true,2500,false,0,50,null,1)"},
    {21, "period(TS_fast,fast_grp,null,true,4000,false,true,0,true,2000,0,>100,NONE)"},
    {22, "maxdelay(TS_ab,true,true,(grpA,grpB),null,true,5000,true,2,true)"},
    {23, "maxdelay(TS_abc,true,true,(grpA,grpB,grpC),TS_1,false,2,true,NONE,false)"},
    {24, "maxdelay(TS_f,true,true,(grpA,grpB),null,true,5000,false,NONE,false)"},
    {25, "tig(TS_tig,true,true,(grpA,grpB),3)"},
    {26, "tig(TS_ign,false,false,(),NONE)"},
    {27, "drop_spec(TS_old)"},
    {28, "enable(true,TS_clk)"},
    {29, "enable(false,TS_old)"},
    {30, "offset(true,2000,null,true,clk,null)"},
    {31, "roffset(false,3000,>1000,false,clk,regs,HIGH)"},
    {32, "toffset(data,true,2000,null,true,clk,null)"},
    {33, "troffset(data,false,2500,null,false,clk,regs,null)"},
    {34, "timegrp(fast,((ffs,0),(FFS(u1/*),5)),(slow))"},
    {35, "timegrp_areagroup(tg1,ag1)"},
    {36, "areagroup(ag1;(RANGE,2,(SITE_A0:SITE_A7,SITE_B0:SITE_B3)),(PLACE,1,closed))"},
    {37, "set(set1;(RLOC_RANGE,2,(X0Y0,X3Y3)))"},
    {38, "prohibit((SITE_C0,SITE_C1))"},
    {39, "vref((P20,P21))"},
    {40, "temperature(85)"},
    {41, "voltage(1.2)"},
    {42, "model(m1;(ATTR,1,1))"},
    {43, "begin_model(m1)"},
    {44, "end_model()"},
    {45, "error(45,34,10xs)"},
    {46, "syntax(46,1,FOO)"},
    {47, "syntax(47,1,NET)"},
};

}  // namespace

TEST(ParserExample, BoardFileGivesEveryCallbackInOrderOnEachParse) {
    TempFile file(kBoardFile);
    Recorder r(file.path());
    std::vector<std::string> lines;  // to check each statement's source text
    std::istringstream in(kBoardFile);
    for (std::string l; std::getline(in, l);) lines.push_back(l);
    for (int pass = 1; pass <= 2; ++pass) {  // a second parse reads the file anew
        r.calls.clear();
        EXPECT_FALSE(r.parse());  // two syntax errors
        ASSERT_EQ(r.calls.size(), std::size(kExpected));
        for (std::size_t i = 0; i < r.calls.size(); ++i) {
            const Call& c = r.calls[i];
            SCOPED_TRACE("pass " + str(pass) + ", callback " + str(int(i + 1)));
            EXPECT_EQ(c.what, kExpected[i].what);
            EXPECT_EQ(c.line, kExpected[i].line);
            if (c.what.rfind("error(", 0) == 0) continue;  // no handle
            std::string text = lines[c.line - 1];
            if (c.line == 7) text = "NET \"clk\" TNM_NET = clk_grp | LOC = P10;";
            if (c.line == 19) text += "\n" + lines[19];
            EXPECT_EQ(c.ascii, text);
        }
    }
}

TEST(ParserExample, BaseClassReportsErrorsThroughTheMessageManager) {
    TempFile file(kBoardFile);
    Port_MsgCapture capture;
    Pr_Logical_Parser parser(file.path());
    EXPECT_FALSE(parser.parse());
    const std::string name = file.path();
    const std::vector<std::string> expected = {
        "Line 45 in '" + name + "': The value '10xs' at column 34 cannot be read.\n",
        "Line 46 in '" + name + "': Syntax error at column 1 near 'FOO'.\n",
        "Line 47 in '" + name + "': Syntax error at column 1 near 'NET'.\n",
    };
    EXPECT_EQ(capture.Texts(Port_Severity::Error), expected);
    for (const Port_Message& m : capture.messages()) {
        EXPECT_EQ(m.program, "Quillmap");
        EXPECT_EQ(m.module, "parser");
    }
}
