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

// Each case is "statement => token", with a '^' in the statement where the error is reported.
void rejected(const std::string& kind, std::initializer_list<std::string> cases) {
    for (const std::string& c : cases) {
        const auto mark = c.find('^'), arrow = c.find(" => ");
        const std::string statement = c.substr(0, mark) + c.substr(mark + 1, arrow - mark - 1);
        EXPECT_EQ(one(statement),
                  kind + "(1," + str(int(mark + 1)) + "," + c.substr(arrow + 4) + ")")
            << c;
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
         "period(T,g,null,true," + str(1.0e12 / 74250000.0) + ",false" + tail);
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

TEST(ParserQuantities, DutyTemperatureAndVoltage) {
    same("NET c PERIOD = 10 HIGH %;", {"50%", "50 %", "50.000000 %"},
         "net(c;(PERIOD,5,10000,false,0,50,null))");
    check({"NET c PERIOD = 10 LOW 4 ns; => net(c;(PERIOD,5,10000,true,4000,0,null))",
           "NET c PERIOD = 10 LOW 40; => net(c;(PERIOD,5,10000,true,0,40,null))",
           "NET c PERIOD = 10 LOW; => net(c;(PERIOD,5,10000,true,0,50,null))",
           "NET c PERIOD = 8 INPUT_JITTER 50 ps HIGH 30%; => net(c;(PERIOD,5,8000,false,0,30,>50))",
           "NET c PERIOD = : 8 : LOW : 2; => net(c;(PERIOD,5,8000,true,0,2,null))"});
    same("TEMPERATURE = %;", {"185 F", "85C", "85"}, "temperature(85)");
    same("TEMPERATURE = %;", {"-40C"}, "temperature(-40)");
    same("TEMPERATURE = %;", {"358.15 K"}, "temperature(" + str(358.15 - 273.15) + ")");
    same("VOLTAGE = %;", {"1200 mV", "1.2 V", "1.2"}, "voltage(1.2)");
    same("VOLTAGE = %;", {"5mv"}, "voltage(0.005)");
}

TEST(ParserQuantities, UnreadableValuesGoToCbError) {
    rejected("error", {"TIMESPEC T = PERIOD g ^0 MHz; => 0 MHz",
                       "TIMESPEC T = PERIOD g ^10xs; => 10xs",
                       "TIMESPEC T = PERIOD g ^1.2.3; => 1.2.3",
                       "TIMESPEC T = PERIOD g ^10.ns; => 10.ns",
                       "TIMESPEC T = PERIOD g ^-5 ns; => -5 ns",
                       "TIMESPEC T = PERIOD g ^10 %; => 10 %",
                       "OFFSET = IN 2 ns VALID ^-1 ns BEFORE c; => -1 ns",
                       "OFFSET = IN ^2 MHz BEFORE c; => 2 MHz",
                       "OFFSET = IN ^fast BEFORE c; => fast",
                       "NET c PERIOD = 10 INPUT_JITTER ^5%; => 5%",
                       "NET c PERIOD = 10 HIGH ^0%; => 0%",
                       "NET c PERIOD = 10 HIGH ^100%; => 100%",
                       "NET c PERIOD = ^TS_clk; => TS_clk",
                       "NET c MAXDELAY = ^\"1 ns\"; => 1 ns",
                       "TIMESPEC T = FROM a TO b 5 ns PRIORITY ^1.5; => 1.5",
                       "TIMESPEC T = FROM a TO b 5 ns PRIORITY ^9999999999; => 9999999999",
                       "TIMESPEC T = FROM a TO b 5 ns PRIORITY ^-2147483649; => -2147483649",
                       "TIMESPEC T = PERIOD g TS_a * ^2 ns; => 2 ns",
                       "TIMESPEC T = PERIOD g TS_a*^x; => x",
                       "TEMPERATURE = ^85 V; => 85 V",
                       "VOLTAGE = ^-1.2; => -1.2"});
    EXPECT_EQ(one("TIMESPEC T = FROM a TO b 5 ns PRIORITY -2147483648;"),
              "maxdelay(T,true,true,(a,b),null,true,5000,true,-2147483648,false)");
}

TEST(ParserObjects, ConstraintKindsAndValues) {
    check({"NET rst_n tig = TS_a, TS_b; => net(rst_n;(tig,2,(TS_a,TS_b)))",
           "NET rst_n tig = TS_a; => net(rst_n;(tig,1,TS_a))", "NET clk; => net(clk;)",
           "net a loc=a9|pullup; => net(a;(loc,1,a9),(pullup,0))",
           "INST u2 RLOC_RANGE = X0Y0 : X3Y3; => comp(u2;(RLOC_RANGE,2,(X0Y0,X3Y3)))",
           "INST u2 RLOC_RANGE = X0Y0; => comp(u2;(RLOC_RANGE,2,(X0Y0)))",
           "INST u2 RLOC_RANGE = \"X0Y0:X3Y3\"; => comp(u2;(RLOC_RANGE,2,(X0Y0:X3Y3)))",
           "INST u2 RLOC_RANGE = a:b, c:d; => comp(u2;(RLOC_RANGE,2,(a:b,c:d)))",
           "INST mem0 initp_0e..0f = 1; => comp(mem0;(initp_0e..0f,3,(INITP_0E,INITP_0F),1))",
           "INST mem0 INIT_05 = FF; => comp(mem0;(INIT_05,1,FF))",
           "INST mem0 INIT_00..02; => comp(mem0;(INIT_00..02,0))",
           "NET \"\" LOC = \"\"; => net(;(LOC,1,))",
           "NET RAMS(\"u1/d[*]\") X = \"a b\"\"c\"; => net(RAMS(u1/d[*]);(X,1,a bc))",
           "NET n OFFSET = OUT : 3 : ns : AFTER : clk : falling; => "
           "net(n;(OFFSET,4,false,3000,null,false,clk,null,true,FALLING))",
           "NET n OFFSET = IN 1 BEFORE c | LOC = P1; => "
           "net(n;(OFFSET,4,true,1000,null,true,c,null,false,),(LOC,1,P1))"});
}

TEST(ParserObjects, TimingNamesAndMisplacedWords) {
    same("INST u TNM = %;", {"FFS grp", "FFS:grp", "FFS : grp", "FFS \"grp\""},
         "comp(u;(TNM,2,(FFS,grp)))");
    check({"INST u TNM = \"FFS:grp\"; => comp(u;(TNM,2,(FFS:grp)))",
           "INST u TNM = PADS(io_*) io_grp; => comp(u;(TNM,2,(PADS(io_*),io_grp)))",
           "INST u TNM_NET = a:b:c; => comp(u;(TNM_NET,2,(a,b:c)))",
           "INST u TNM = grp; => comp(u;(TNM,2,(grp)))"});
    rejected("syntax", {"INST u TNM = a b ^c; => c", "INST u TNM = ^:grp; => :grp",
                        "INST u TNM = ^grp:; => grp:", "INST u TNM = a :^; => ;",
                        "INST u TNM = a^, b; => ,"});
    rejected("error", {"INST m ^INIT_02..00 = 0F; => INIT_02..00"});
    rejected("syntax",
             {"NET a LOC = ^; => ;", "NET a LOC = ^| PULLUP; => |", "NET a LOC = P1 ^P2; => P2",
              "NET a LOC = P1,^; => ;", "NET a LOC = P1,^,P2; => ,",
              "NET a LOC = P1 |^| PULLUP; => |", "NET a ^| LOC = P1; => |",
              "NET a LOC = P1 |^; => ;", "NET a ^\"LOC\" = P1; => LOC", "NET a LOC ^P1; => P1",
              "NET a LOC = P1 ^= P2; => =", "NET ^; => ;", "INST m FEEDBACK = a^, b; => ,",
              "INST m INIT_00..01 = a ^b; => b", "NET n MAXDELAY = 1 ns ^2; => 2",
              "NET n PERIOD = 10 ^PHASE 1; => PHASE", "NET n PERIOD = 10 HIGH ^LOW; => LOW",
              "NET n OFFSET = IN 1 BEFORE c HIGH ^TIMEGRP g; => TIMEGRP",
              "NET n OFFSET = ^SIDEWAYS 1 BEFORE c; => SIDEWAYS"});
}

TEST(ParserTimespec, FormsReferencesAndWrongWords) {
    check(
        {"TIMESPEC TS_s = PERIOD s_grp 8 ns LOW 4 ns INPUT_JITTER 100 ps; => "
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
         "TIMESPEC TS_i = ignore PRIORITY 4; => tig(TS_i,false,false,(),4)",
         "TIMESPEC TS_t = FROM a TIG; => tig(TS_t,true,false,(a),NONE)",
         "timespec ts = from a to b ts_x priority 7 datapathonly; => "
         "maxdelay(ts,true,true,(a,b),ts_x,true,0,true,7,true)"});
    rejected("syntax", {"timespec ts = from a to b ^priority 7 ts_x datapathonly; => priority"});
    same("TIMESPEC T = PERIOD g %;", {"TS_clk*2", "TS_clk* 2", "TS_clk *2", "TS_clk * 2"},
         "period(T,g,TS_clk,true,2,true,true,0,false,0,50,null,NONE)");
    check(
        {"TIMESPEC T = PERIOD g TS_clk/2.5; => "
         "period(T,g,TS_clk,false,2.5,true,true,0,false,0,50,null,NONE)"});
    rejected("syntax", {"TIMESPEC T = PERIOD g ^*2; => *2", "TIMESPEC T = PERIOD g ^\"\" * 2; => ",
                        "TIMESPEC T = PERIOD g TS_clk *^; => ;"});
    rejected("error", {"TIMESPEC T = PERIOD g TS_a PHASE + ^-1 ns; => -1 ns"});
    rejected("syntax",
             {"TIMESPEC T = PERIOD 10 ^ns; => ns", "TIMESPEC T = PERIOD g ^HIGH; => HIGH",
              "TIMESPEC T = PERIOD g 10 ^PHASE 1; => PHASE",
              "TIMESPEC T = PERIOD g 10 ^DATAPATHONLY; => DATAPATHONLY",
              "TIMESPEC T = PERIOD g 10 HIGH ^LOW; => LOW",
              "TIMESPEC T = PERIOD g 10 PRIORITY 1 ^PRIORITY 2; => PRIORITY",
              "TIMESPEC T = FROM a ^FROM b 1; => FROM", "TIMESPEC T = TO a ^THRU b 1; => THRU",
              "TIMESPEC T = FROM a TO b^; => ;", "TIMESPEC T = FROM a TO b 1 ^HIGH; => HIGH",
              "TIMESPEC T = FROM a TIG ^DATAPATHONLY; => DATAPATHONLY",
              "TIMESPEC T = ^\"PERIOD\" g 1; => PERIOD", "TIMESPEC T ^PERIOD g 1; => PERIOD",
              "TIMESPEC T = DROP_SPEC ^now; => now"});
}

TEST(ParserStatements, EnableOffsetAndGroups) {
    check(
        {"disable = \"TS_old\"; => enable(false,TS_old)",
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
         "TIMEGRP g = ; => timegrp(g,(),())", "TIMEGRP g = EXCEPT x y; => timegrp(g,(),(x,y))",
         "AREA_GROUP \"ag2\" COMPRESSION = 50; => areagroup(ag2;(COMPRESSION,1,50))",
         "SET set1 RLOC_RANGE = X0Y0:X3Y3 | RLOC_ORIGIN = X0Y0; => "
         "set(set1;(RLOC_RANGE,2,(X0Y0,X3Y3)),(RLOC_ORIGIN,1,X0Y0))"});
    rejected("syntax",
             {"TIMEGRP g = RISING^; => ;", "TIMEGRP g = RISING ^EXCEPT x; => EXCEPT",
              "TIMEGRP g = a EXCEPT^; => ;", "TIMEGRP g = a EXCEPT b ^EXCEPT c; => EXCEPT",
              "TIMEGRP g = a EXCEPT ^RISING b; => RISING", "TIMEGRP g = a^, b; => ,",
              "TIMEGRP g ^BOGUS; => BOGUS", "AREA_GROUP ag PLACE = a^, b; => ,",
              "AREA_GROUP ag PLACE^; => ;", "SET s1 A = b ^c; => c"});
}

TEST(ParserStatements, GlobalSettings) {
    check({"config Stepping = ES ; => config(Stepping,ES)",
           "CONFIG RLOC_ORIGIN = set1 = X0Y0; => config(RLOC_ORIGIN,set1 = X0Y0)",
           "CONFIG X = \"a;b\" # c;d\n  | \"#\",e ; => config(X,a;b \n  | #,e)",
           "System_Jitter = 1; => config(System_Jitter,1)",
           "CONFIG PROHIBIT = P1,L3; => prohibit((P1,L3))",
           "CONFIG \"PROHIBIT\" = a; => config(PROHIBIT,a)",
           "PROHIBIT = SITE_C0:SITE_C3, SITE_D0; => prohibit((SITE_C0:SITE_C3,SITE_D0))",
           "VREF = P20, P21; => vref((P20,P21))", "MODEL m1; => model(m1;)",
           "BEGIN MODEL \"m 1\"; => begin_model(m 1)"});
    rejected("syntax", {"CONFIG PART^; => ;", "CONFIG PART = ^; => ;", "CONFIG PART = \"\" ^; => ;",
                        "PROHIBIT = ^; => ;", "PROHIBIT = a,^; => ;", "VREF = a ^b; => b",
                        "TEMPERATURE = 85 C ^hot; => hot", "BEGIN ^m1; => m1", "BEGIN MODEL^; => ;",
                        "END ^x; => x"});
}
