// Statement forms, value shapes and quantities, one statement per file.
#include <gtest/gtest.h>

#include "recorder.h"

using namespace parser_test;

namespace {

// Each case is "statement => expected callback".
void check(std::initializer_list<std::string> cases) {
    for (const std::string& c : cases) {
        const auto at = c.find(" => ");
        EXPECT_EQ(one(c.substr(0, at)), c.substr(at + 4)) << c;
    }
}

// Spellings of one value: each replaces the '%' in `pattern`; all give `expected`.
void same(const std::string& pattern, std::initializer_list<const char*> spellings,
          const std::string& expected) {
    const auto at = pattern.find('%');
    for (const char* v : spellings)
        EXPECT_EQ(one(pattern.substr(0, at) + v + pattern.substr(at + 1)), expected) << v;
}

}  // namespace

TEST(ParserQuantities, PeriodValuesAsTimeOrFrequency) {
    const std::string tail = ",true,0,false,0,50,null,NONE)";
    same("TIMESPEC T = PERIOD g %;", {"10 ns", "10ns", "10 NS", "10", "10000 ps", "0.01 us"},
         "period(T,g,null,true,10000,true" + tail);
    same("TIMESPEC T = PERIOD g %;", {"100 MHz", "100mhz", "100000 kHz", "0.1 GHz"},
         "period(T,g,null,true,10000,false" + tail);
    same("TIMESPEC T = PERIOD g %;", {"250MHz"}, "period(T,g,null,true,4000,false" + tail);
    same("TIMESPEC T = PERIOD g %;", {"74.25MHz"},
         "period(T,g,null,true," + num(1.0e12 / 74250000.0) + ",false" + tail);
}

TEST(ParserQuantities, DecimalShiftIsExact) {
    // 1.1 * 1000 in doubles is 1100.0000000000002; the digits are shifted instead.
    EXPECT_EQ(one("OFFSET = IN 1.1 ns BEFORE c;"), "offset(true,1100,null,true,c,null)");
    EXPECT_EQ(one("OFFSET = IN -1.5 ns BEFORE c;"), "offset(true,-1500,null,true,c,null)");
    EXPECT_EQ(one("OFFSET = IN 0.000001 ms BEFORE c;"), "offset(true,1000,null,true,c,null)");
    same("NET n MAXDELAY = %;", {"1.5 ns", "1500 ps", "1.50ns"}, "net(n;(MAXDELAY,1,1500))");
    check({"NET n MAXDELAY = 400ps; => net(n;(MAXDELAY,1,400))",
           "NET n MAXDELAY = 0.0005 ns; => net(n;(MAXDELAY,1,0.5))",
           "NET n MAXSKEW = 007.0; => net(n;(MAXSKEW,1,7000))",
           "NET n maxskew = 0 ns; => net(n;(maxskew,1,0))",
           "NET n MAXDELAY = .25 us; => net(n;(MAXDELAY,1,250000))"});
}

TEST(ParserQuantities, DutyFigures) {
    same("NET c PERIOD = 10 HIGH %;", {"50%", "50 %", "50.000000 %"},
         "net(c;(PERIOD,5,10000,false,0,50,null))");
    check({"NET c PERIOD = 10 LOW 4 ns; => net(c;(PERIOD,5,10000,true,4000,0,null))",
           "NET c PERIOD = 10 LOW 40; => net(c;(PERIOD,5,10000,true,0,40,null))",
           "NET c PERIOD = 10 LOW; => net(c;(PERIOD,5,10000,true,0,50,null))",
           "NET clk PERIOD = 20ns; => net(clk;(PERIOD,5,20000,false,0,50,null))",
           "NET c PERIOD = 8 INPUT_JITTER 50 ps HIGH 30%; => net(c;(PERIOD,5,8000,false,0,30,>50))",
           "NET c PERIOD = : 8 : LOW : 2; => net(c;(PERIOD,5,8000,true,0,2,null))"});
}

TEST(ParserQuantities, TemperatureAndVoltage) {
    same("TEMPERATURE = %;", {"185 F", "85C", "85"}, "temperature(85)");
    same("TEMPERATURE = %;", {"-40C"}, "temperature(-40)");
    same("TEMPERATURE = %;", {"358.15 K"}, "temperature(" + num(358.15 - 273.15) + ")");
    same("VOLTAGE = %;", {"1200 mV", "1.2 V", "1.2"}, "voltage(1.2)");
    same("VOLTAGE = %;", {"5mv"}, "voltage(0.005)");
}

TEST(ParserQuantities, UnreadableValuesGoToCbError) {
    check({"TIMESPEC T = PERIOD g 0 MHz; => error(1,23,0 MHz)",
           "TIMESPEC T = PERIOD g 10xs; => error(1,23,10xs)",
           "TIMESPEC T = PERIOD g 1.2.3; => error(1,23,1.2.3)",
           "TIMESPEC T = PERIOD g 10.ns; => error(1,23,10.ns)",
           "TIMESPEC T = PERIOD g -5 ns; => error(1,23,-5 ns)",
           "TIMESPEC T = PERIOD g 10 %; => error(1,23,10 %)",
           "OFFSET = IN 2 ns VALID -1 ns BEFORE c; => error(1,24,-1 ns)",
           "OFFSET = IN 2 MHz BEFORE c; => error(1,13,2 MHz)",
           "OFFSET = IN fast BEFORE c; => error(1,13,fast)",
           "NET c PERIOD = 10 INPUT_JITTER 5%; => error(1,32,5%)",
           "NET c PERIOD = 10 HIGH 0%; => error(1,24,0%)",
           "NET c PERIOD = 10 HIGH 100%; => error(1,24,100%)",
           "NET c PERIOD = TS_clk; => error(1,16,TS_clk)",
           "NET c MAXDELAY = \"1 ns\"; => error(1,18,1 ns)",
           "TIMESPEC T = FROM a TO b 5 ns PRIORITY 1.5; => error(1,40,1.5)",
           "TIMESPEC T = FROM a TO b 5 ns PRIORITY 9999999999; => error(1,40,9999999999)",
           "TIMESPEC T = FROM a TO b 5 ns PRIORITY -2147483649; => error(1,40,-2147483649)",
           "TIMESPEC T = PERIOD g TS_a * 2 ns; => error(1,30,2 ns)",
           "TIMESPEC T = PERIOD g TS_a*x; => error(1,28,x)",
           "TEMPERATURE = 85 V; => error(1,15,85 V)",
           "VOLTAGE = -1.2; => error(1,11,-1.2)"});
    EXPECT_EQ(one("TIMESPEC T = FROM a TO b 5 ns PRIORITY -2147483648;"),
              "maxdelay(T,true,true,(a,b),null,true,5000,true,-2147483648,false)");
}

TEST(ParserObjects, ConstraintKindsAndValues) {
    check(
        {"NET \"clk\" LOC = P10 | IOSTANDARD = std33 | PULLUP; => "
         "net(clk;(LOC,1,P10),(IOSTANDARD,1,std33),(PULLUP,0))",
         "NET bus<*> LOC = P1, P2, P3; => net(bus<*>;(LOC,2,(P1,P2,P3)))",
         "NET rst_n TIG; => net(rst_n;(TIG,2,()))",
         "NET rst_n tig = TS_a, TS_b; => net(rst_n;(tig,2,(TS_a,TS_b)))",
         "NET rst_n tig = TS_a; => net(rst_n;(tig,1,TS_a))",
         "NET \"d[0]\" maxdelay = 1.5 ns; => net(d[0];(maxdelay,1,1500))",
         "NET clk; => net(clk;)",
         "net a loc=a9|pullup; => net(a;(loc,1,a9),(pullup,0))",
         "INST \"u1/reg*\" TNM = FFS:regs; => comp(u1/reg*;(TNM,2,(FFS,regs)))",
         "INST u2 RLOC_RANGE = X0Y0:X3Y3; => comp(u2;(RLOC_RANGE,2,(X0Y0,X3Y3)))",
         "INST u2 RLOC_RANGE = X0Y0 : X3Y3; => comp(u2;(RLOC_RANGE,2,(X0Y0,X3Y3)))",
         "INST u2 RLOC_RANGE = X0Y0; => comp(u2;(RLOC_RANGE,2,(X0Y0)))",
         "INST u2 RLOC_RANGE = \"X0Y0:X3Y3\"; => comp(u2;(RLOC_RANGE,2,(X0Y0:X3Y3)))",
         "INST u2 RLOC_RANGE = a:b, c:d; => comp(u2;(RLOC_RANGE,2,(a:b,c:d)))",
         "INST clkgen FEEDBACK = 1.5 ns clkfb; => comp(clkgen;(FEEDBACK,2,(1.5,ns,clkfb)))",
         "INST mem0 INIT_00..02 = 0F0F; => "
         "comp(mem0;(INIT_00..02,3,(INIT_00,INIT_01,INIT_02),0F0F))",
         "INST mem0 initp_0e..0f = 1; => comp(mem0;(initp_0e..0f,3,(INITP_0E,INITP_0F),1))",
         "INST mem0 INIT_05 = FF; => comp(mem0;(INIT_05,1,FF))",
         "INST mem0 INIT_00..02; => comp(mem0;(INIT_00..02,0))",
         "PIN \"u3.D\" loc = SITE_A0; => pin(u3.D;(loc,1,SITE_A0))",
         "MODEL m1 ATTR = 1; => model(m1;(ATTR,1,1))",
         "NET \"\" LOC = \"\"; => net(;(LOC,1,))",
         "NET RAMS(\"u1/d[*]\") X = \"a b\"\"c\"; => net(RAMS(u1/d[*]);(X,1,a bc))",
         "NET n OFFSET = OUT : 3 : ns : AFTER : clk : falling; => "
         "net(n;(OFFSET,4,false,3000,null,false,clk,null,true,FALLING))",
         "NET n OFFSET = IN 1 BEFORE c | LOC = P1; => "
         "net(n;(OFFSET,4,true,1000,null,true,c,null,false,),(LOC,1,P1))"});
}

TEST(ParserObjects, TimingNameShapes) {
    same("INST u TNM = %;", {"FFS grp", "FFS:grp", "FFS : grp", "FFS \"grp\""},
         "comp(u;(TNM,2,(FFS,grp)))");
    check({"INST u TNM = \"FFS:grp\"; => comp(u;(TNM,2,(FFS:grp)))",
           "INST u TNM = PADS(io_*) io_grp; => comp(u;(TNM,2,(PADS(io_*),io_grp)))",
           "INST u TNM_NET = a:b:c; => comp(u;(TNM_NET,2,(a,b:c)))",
           "INST u TNM = grp; => comp(u;(TNM,2,(grp)))", "INST u TNM = a b c; => syntax(1,18,c)",
           "INST u TNM = :grp; => syntax(1,14,:grp)", "INST u TNM = grp:; => syntax(1,14,grp:)",
           "INST u TNM = a :; => syntax(1,17,;)", "INST u TNM = a, b; => syntax(1,15,,)"});
}

TEST(ParserObjects, MisplacedWordsAndPunctuation) {
    check({"NET a LOC = ; => syntax(1,13,;)",
           "NET a LOC = | PULLUP; => syntax(1,13,|)",
           "NET a LOC = P1 P2; => syntax(1,16,P2)",
           "NET a LOC = P1,; => syntax(1,16,;)",
           "NET a LOC = P1,,P2; => syntax(1,16,,)",
           "NET a LOC = P1 || PULLUP; => syntax(1,17,|)",
           "NET a | LOC = P1; => syntax(1,7,|)",
           "NET a LOC = P1 |; => syntax(1,17,;)",
           "NET a \"LOC\" = P1; => syntax(1,7,LOC)",
           "NET a LOC P1; => syntax(1,11,P1)",
           "NET a LOC = P1 = P2; => syntax(1,16,=)",
           "NET ; => syntax(1,5,;)",
           "INST m FEEDBACK = a, b; => syntax(1,20,,)",
           "INST m INIT_00..01 = a b; => syntax(1,24,b)",
           "INST m INIT_02..00 = 0F; => error(1,8,INIT_02..00)",
           "NET n MAXDELAY = 1 ns 2; => syntax(1,23,2)",
           "NET n PERIOD = 10 PHASE 1; => syntax(1,19,PHASE)",
           "NET n PERIOD = 10 HIGH LOW; => syntax(1,24,LOW)",
           "NET n OFFSET = IN 1 BEFORE c HIGH TIMEGRP g; => syntax(1,35,TIMEGRP)",
           "NET n OFFSET = SIDEWAYS 1 BEFORE c; => syntax(1,16,SIDEWAYS)"});
}

TEST(ParserTimespec, Forms) {
    check(
        {"TIMESPEC TS_clk = PERIOD clk_grp 100 MHz HIGH 50%; => "
         "period(TS_clk,clk_grp,null,true,10000,false,true,0,false,0,50,null,NONE)",
         "TIMESPEC TS_s = PERIOD s_grp 8 ns LOW 4 ns INPUT_JITTER 100 ps; => "
         "period(TS_s,s_grp,null,true,8000,true,true,0,true,4000,0,>100,NONE)",
         "TIMESPEC TS_h = PERIOD h_grp TS_clk / 2 PHASE -1 ns; => "
         "period(TS_h,h_grp,TS_clk,false,2,true,false,1000,false,0,50,null,NONE)",
         "TIMESPEC TS_r = PERIOD r_grp TS_clk; => "
         "period(TS_r,r_grp,TS_clk,true,0,true,true,0,false,0,50,null,NONE)",
         "TIMESPEC TS_r = PERIOD r_grp \"TS_clk\" PHASE - 2.5ns; => "
         "period(TS_r,r_grp,TS_clk,true,0,true,false,2500,false,0,50,null,NONE)",
         "TIMESPEC T = PERIOD : grp : 31.25ns : PRIORITY 1; => "
         "period(T,grp,null,true,31250,true,true,0,false,0,50,null,1)",
         "TIMESPEC TS_o = TO out_grp 7 ns; => "
         "maxdelay(TS_o,false,true,(out_grp),null,true,7000,true,NONE,false)",
         "TIMESPEC T = THRU a THRU b 1; => "
         "maxdelay(T,false,false,(a,b),null,true,1000,true,NONE,false)",
         "TIMESPEC TS_i = TIG; => tig(TS_i,false,false,(),NONE)",
         "TIMESPEC TS_i = ignore PRIORITY 4; => tig(TS_i,false,false,(),4)",
         "TIMESPEC TS_t = FROM a TIG; => tig(TS_t,true,false,(a),NONE)",
         "TIMESPEC TS_d = DROP_SPEC; => drop_spec(TS_d)",
         "timespec ts = from a to b priority 7 ts_x datapathonly; => syntax(1,27,priority)",
         "timespec ts = from a to b ts_x priority 7 datapathonly; => "
         "maxdelay(ts,true,true,(a,b),ts_x,true,0,true,7,true)"});
}

TEST(ParserTimespec, ReferenceOperatorSpellings) {
    same("TIMESPEC T = PERIOD g %;", {"TS_clk*2", "TS_clk* 2", "TS_clk *2", "TS_clk * 2"},
         "period(T,g,TS_clk,true,2,true,true,0,false,0,50,null,NONE)");
    check(
        {"TIMESPEC T = PERIOD g TS_clk/2.5; => "
         "period(T,g,TS_clk,false,2.5,true,true,0,false,0,50,null,NONE)",
         "TIMESPEC T = PERIOD g *2; => syntax(1,23,*2)",
         "TIMESPEC T = PERIOD g \"\" * 2; => syntax(1,23,)",
         "TIMESPEC T = PERIOD g TS_clk *; => syntax(1,31,;)"});
}

TEST(ParserTimespec, WrongWords) {
    check({"TIMESPEC T = PERIOD 10 ns; => syntax(1,24,ns)",
           "TIMESPEC T = PERIOD g HIGH; => syntax(1,23,HIGH)",
           "TIMESPEC T = PERIOD g 10 PHASE 1; => syntax(1,26,PHASE)",
           "TIMESPEC T = PERIOD g 10 DATAPATHONLY; => syntax(1,26,DATAPATHONLY)",
           "TIMESPEC T = PERIOD g 10 HIGH LOW; => syntax(1,31,LOW)",
           "TIMESPEC T = PERIOD g 10 PRIORITY 1 PRIORITY 2; => syntax(1,37,PRIORITY)",
           "TIMESPEC T = PERIOD g TS_a PHASE + -1 ns; => error(1,36,-1 ns)",
           "TIMESPEC T = FROM a FROM b 1; => syntax(1,21,FROM)",
           "TIMESPEC T = TO a THRU b 1; => syntax(1,19,THRU)",
           "TIMESPEC T = FROM a TO b; => syntax(1,25,;)",
           "TIMESPEC T = FROM a TO b 1 HIGH; => syntax(1,28,HIGH)",
           "TIMESPEC T = FROM a TIG DATAPATHONLY; => syntax(1,25,DATAPATHONLY)",
           "TIMESPEC T = \"PERIOD\" g 1; => syntax(1,14,PERIOD)",
           "TIMESPEC T PERIOD g 1; => syntax(1,12,PERIOD)",
           "TIMESPEC T = DROP_SPEC now; => syntax(1,24,now)"});
}

TEST(ParserStatements, EnableOffsetAndGroups) {
    check(
        {"ENABLE = TS_clk; => enable(true,TS_clk)",
         "disable = \"TS_old\"; => enable(false,TS_old)",
         "OFFSET = OUT 3 ns VALID 1 ns AFTER clk HIGH; => offset(false,3000,>1000,false,clk,HIGH)",
         "OFFSET = IN 2 ns BEFORE \"clk\" TIMEGRP \"regs\"; => "
         "roffset(true,2000,null,true,clk,regs,null)",
         "OFFSET = IN : 2 ns : BEFORE : clk; => offset(true,2000,null,true,clk,null)",
         "TIMEGRP data OFFSET = IN 2 ns BEFORE clk TIMEGRP regs; => "
         "troffset(data,true,2000,null,true,clk,regs,null)",
         "TIMEGRP \"sync\" = \"tx_regs\" \"tx_rams\"; => "
         "timegrp(sync,((tx_regs,5),(tx_rams,5)),())",
         "TIMEGRP g = falling a transhi b translo c \"RISING\"; => "
         "timegrp(g,((a,1),(b,2),(c,3),(RISING,5)),())",
         "TIMEGRP g = RAMS(\"u1/d[*]\"); => timegrp(g,((RAMS(u1/d[*]),5)),())",
         "TIMEGRP g = ; => timegrp(g,(),())",
         "TIMEGRP g = EXCEPT x y; => timegrp(g,(),(x,y))",
         "TIMEGRP g = RISING; => syntax(1,19,;)",
         "TIMEGRP g = RISING EXCEPT x; => syntax(1,20,EXCEPT)",
         "TIMEGRP g = a EXCEPT; => syntax(1,21,;)",
         "TIMEGRP g = a EXCEPT b EXCEPT c; => syntax(1,24,EXCEPT)",
         "TIMEGRP g = a EXCEPT RISING b; => syntax(1,22,RISING)",
         "TIMEGRP g = a, b; => syntax(1,14,,)",
         "TIMEGRP g BOGUS; => syntax(1,11,BOGUS)",
         "AREA_GROUP \"ag2\" COMPRESSION = 50; => areagroup(ag2;(COMPRESSION,1,50))",
         "AREA_GROUP ag RANGE = SITE_A0:SITE_A7; => areagroup(ag;(RANGE,2,(SITE_A0:SITE_A7)))",
         "AREA_GROUP ag PLACE = a, b; => syntax(1,24,,)",
         "AREA_GROUP ag PLACE; => syntax(1,20,;)",
         "SET set1 RLOC_RANGE = X0Y0:X3Y3 | RLOC_ORIGIN = X0Y0; => "
         "set(set1;(RLOC_RANGE,2,(X0Y0,X3Y3)),(RLOC_ORIGIN,1,X0Y0))",
         "SET s1 A = b c; => syntax(1,14,c)"});
}

TEST(ParserStatements, GlobalSettings) {
    check({"CONFIG PART = qx100-fg256-2; => config(PART,qx100-fg256-2)",
           "CONFIG DCI_CASCADE = \"1 3 5\"; => config(DCI_CASCADE,1 3 5)",
           "config Stepping = ES ; => config(Stepping,ES)",
           "CONFIG RLOC_ORIGIN = set1 = X0Y0; => config(RLOC_ORIGIN,set1 = X0Y0)",
           "CONFIG X = \"a;b\" # c;d\n  | \"#\",e ; => config(X,a;b \n  | #,e)",
           "SYSTEM_JITTER = 0.2 ns; => config(SYSTEM_JITTER,0.2 ns)",
           "System_Jitter = 1; => config(System_Jitter,1)",
           "CONFIG PROHIBIT = P1,L3; => prohibit((P1,L3))",
           "CONFIG \"PROHIBIT\" = a; => config(PROHIBIT,a)",
           "PROHIBIT = SITE_C0:SITE_C3, SITE_D0; => prohibit((SITE_C0:SITE_C3,SITE_D0))",
           "VREF = P20, P21; => vref((P20,P21))",
           "CONFIG PART; => syntax(1,12,;)",
           "CONFIG PART = ; => syntax(1,15,;)",
           "CONFIG PART = \"\" ; => syntax(1,18,;)",
           "PROHIBIT = ; => syntax(1,12,;)",
           "PROHIBIT = a,; => syntax(1,14,;)",
           "VREF = a b; => syntax(1,10,b)",
           "TEMPERATURE = 85 C hot; => syntax(1,20,hot)",
           "MODEL m1; => model(m1;)",
           "BEGIN MODEL \"m 1\"; => begin_model(m 1)",
           "BEGIN m1; => syntax(1,7,m1)",
           "BEGIN MODEL; => syntax(1,12,;)",
           "END x; => syntax(1,5,x)"});
}
