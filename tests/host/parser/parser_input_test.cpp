// File-level behaviour: comments, line ends, source texts, bad input and recovery.
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>

#include "host/port/msgman.h"
#include "recorder.h"

using namespace parser_test;

// Each file gives exactly `calls`; the parse fails exactly when a syntax error was reported.
TEST(ParserInput, FilesGiveTheseCallsLinesAndSourceTexts) {
    const std::string name(100000, 'n');
    const std::string binary = "\x80\xff\x01\x02\xfe;";
    const struct {
        std::string input;
        std::vector<Call> calls;  // a line of 0 or an empty text is not checked
    } cases[] = {
        {"", {}},
        {" \t\r\n\n;;  ;\n", {}},
        {"# a\n  // b\n", {{"comment( a)", 1, "# a"}, {"comment( b)", 2, "  // b"}}},
        // Comments inside a statement are dropped; "//" after a statement starts a statement.
        {"NET a # trailing\n# inside, dropped\n// also dropped\n  LOC = P1; # after the end\n"
         "NET b; // c;\n",
         {{"net(a;(LOC,1,P1))", 1,
           "NET a # trailing\n# inside, dropped\n// also dropped\n  LOC = P1;"},
          {"net(b;)", 5, "NET b;"},
          {"syntax(5,8,//)", 5, "// c;"}}},
        {std::string("\t#\tx\0y\r\n", 8), {{"comment(\txy)", 1, "\t#\txy"}}},
        // CRLF, a byte-order mark, a lone CR as a blank, and no final newline.
        {"\xEF\xBB\xBF# head\r\nNET a\r\n  LOC = P1;\r\nNET\rb\rLOC=\"x\ry\";\r\nNET c LOC = P2;",
         {{"comment( head)", 1, "# head"},
          {"net(a;(LOC,1,P1))", 2, "NET a\r\n  LOC = P1;"},
          {"net(b;(LOC,1,x\ry))", 4, ""},
          {"net(c;(LOC,1,P2))", 5, "NET c LOC = P2;"}}},
        {"\xEF\xBB\xBFNET a LOC = ;", {{"syntax(1,13,;)"}}},  // columns start after the mark
        {"NET a; NET b\n\nLOC\n=\nP1 ;;; END;",
         {{"net(a;)", 1, "NET a;"},
          {"net(b;(LOC,1,P1))", 1, "NET b\n\nLOC\n=\nP1 ;"},
          {"end_model()", 5, "END;"}}},
        {"FOO bar;\n\"NET\" a;\n= x;\n, ;\nNETWORK a;\n",
         {{"syntax(1,1,FOO)"},
          {"syntax(2,1,NET)", 2, "\"NET\" a;"},
          {"syntax(3,1,=)"},
          {"syntax(4,1,,)"},
          {"syntax(5,1,NETWORK)"}}},
        // Resynchronising skips quoted sections and comments.
        {"NET a LOC = P1 P2 \"x;y\" # z;\n# not delivered;\n  w;\nNET b;\n",
         {{"syntax(1,16,P2)", 1, "NET a LOC = P1 P2 \"x;y\" # z;\n# not delivered;\n  w;"},
          {"net(b;)", 4}}},
        {"NET a MAXDELAY = fast\nLOC=1;NET b;", {{"error(1,18,fast)", 1}, {"net(b;)", 2}}},
        // Missing ';' at the end of the file; the first problem wins.
        {"NET a;\nnet last LOC = P9 # note\r\n",
         {{"net(a;)"}, {"syntax(2,1,net)", 2, "net last LOC = P9 # note"}}},
        {"NET a LOC = \n# comment\n", {{"syntax(1,1,NET)"}}},
        {"NET a LOC = P1 P2", {{"syntax(1,16,P2)", 1, "NET a LOC = P1 P2"}}},
        // An unbalanced quote ends the statement with its line.
        {"NET a\n  LOC = \"P1 ; PULLUP\r\nNET b;\nNET \"c;",
         {{"syntax(2,9,\"P1 ; PULLUP)", 1, "NET a\n  LOC = \"P1 ; PULLUP"},
          {"net(b;)", 3},
          {"syntax(4,5,\"c;)", 4, "NET \"c;"}}},
        // Control bytes: inside a statement, between statements, inside quotes.
        {"NET a LOC = P\x01;\nNET b;\n\x7f x; NET c \"\x02;\";\n\x1b",
         {{"syntax(1,14,\\x01)", 1, "NET a LOC = P\x01;"},
          {"net(b;)"},
          {"syntax(3,1,\\x7F)", 3, "\x7f x;"},
          {"syntax(3,13,\\x02)", 3, "NET c \"\x02;\";"},
          {"syntax(4,1,\\x1B)", 4, "\x1b"}}},
        {"NET a;\n" + binary + "\nNET b;\n",
         {{"net(a;)"}, {"syntax(2,1,\x80\xff)", 2, binary}, {"net(b;)", 3}}},
        {"NET " + name + " LOC = \"" + name + "\";\n",
         {{"net(" + name + ";(LOC,1," + name + "))"}}},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.input.substr(0, 80));
        bool ok = false;
        const auto got = parse_text(c.input, &ok);
        ASSERT_EQ(got.size(), c.calls.size());
        bool syntax = false;
        for (std::size_t i = 0; i < got.size(); ++i) {
            EXPECT_EQ(got[i].what, c.calls[i].what);
            const Call& w = c.calls[i];
            EXPECT_EQ(w.line ? got[i].line : 0, w.line) << w.what;
            EXPECT_EQ(w.ascii.empty() ? "" : got[i].ascii, w.ascii) << w.what;
            syntax = syntax || got[i].what.rfind("syntax(", 0) == 0;
        }
        EXPECT_EQ(ok, !syntax);
    }
}

TEST(ParserInput, EveryByteValueOnOneLineDisturbsOnlyThatLine) {
    std::string all = "NET a;\n";
    for (int i = 0; i < 256; ++i)
        if (i != '\n') all.push_back(static_cast<char>(255 - i));
    bool ok = true;
    const auto calls = parse_text(all + "\nNET b;\nNET c;\n", &ok);
    EXPECT_FALSE(ok);
    ASSERT_GE(calls.size(), 3u);
    EXPECT_EQ(calls.front().what, "net(a;)");
    EXPECT_EQ(calls.back().what, "net(c;)");
    for (std::size_t i = 1; i + 1 < calls.size(); ++i)
        EXPECT_EQ(calls[i].what.rfind("syntax(2,", 0), 0u) << calls[i].what;
}

TEST(ParserInput, MissingNullAndDirectoryNamesCannotBeOpened) {
    Port_MsgCapture capture;
    const std::string dir = std::filesystem::temp_directory_path().string();
    for (const char* name :
         {"/nonexistent/dir/board.ucf", static_cast<const char*>(nullptr), dir.c_str()}) {
        Recorder r(name);
        EXPECT_FALSE(r.parse());
        EXPECT_TRUE(r.calls.empty());
        EXPECT_STREQ(r.get_filename(), name ? name : "");
    }
    const std::vector<std::string> expected = {
        "Could not open constraint file '/nonexistent/dir/board.ucf'.\n",
        "Could not open constraint file ''.\n",
        "Could not open constraint file '" + dir + "'.\n",
    };
    EXPECT_EQ(capture.Texts(Port_Severity::Error), expected);
}

TEST(ParserInput, CopyAndLoadRebindTheFileAndAnswersDecide) {
    TempFile a("NET a;\nNET a2;\n"), b("NET b;\nNET c;\nNET d;\n");
    Recorder r(a.path());
    Pr_Logical_Parser copy(r);
    EXPECT_STREQ(copy.get_filename(), a.path());
    Recorder other(b.path());
    EXPECT_TRUE(r.load(other));
    EXPECT_TRUE(r.parse());
    EXPECT_EQ(r.calls.size(), 3u);
    EXPECT_TRUE(r.load(a.path()));
    copy = other;
    EXPECT_STREQ(copy.get_filename(), b.path());
    EXPECT_FALSE(r.write("x"));
    EXPECT_TRUE(r.dump());
    r.answer = false;  // callbacks' answers decide the result
    r.calls.clear();
    EXPECT_FALSE(r.parse());
    EXPECT_EQ(r.calls.size(), 2u);
}

TEST(ParserInput, LargeFileWithoutFinalNewline) {
    // Large enough to be mapped rather than read; the last byte ends a statement.
    std::string text;
    for (int i = 0; i < 60000; ++i) text += "NET n" + std::to_string(i) + " LOC = P1;\n";
    text += "NET last LOC = \"" + std::string(300000, 'q') + "\";";
    bool ok = false;
    const auto calls = parse_text(text, &ok);
    EXPECT_TRUE(ok);
    ASSERT_EQ(calls.size(), 60001u);
    EXPECT_EQ(calls[59999].what, "net(n59999;(LOC,1,P1))");
    EXPECT_EQ(calls.back().line, 60001);
    EXPECT_EQ(calls.back().ascii.size(), text.size() - text.rfind("NET last"));

    // Cut off inside a quoted section at the very end of a large file.
    text.resize(text.size() - 2);
    const auto cut = parse_text(text, &ok);
    EXPECT_FALSE(ok);
    EXPECT_EQ(cut.back().what.substr(0, 21), "syntax(60001,16,\"qqqq");
}

TEST(ParserInput, TokenSoupNeverBreaksTheParser) {
    // Random mixtures of the language's pieces: the parser must stay within the file, give
    // callbacks with sane positions, and come back to a clean statement at the end.
    static const char* const pieces[] = {
        "NET",        "INST",     "TIMESPEC", "TIMEGRP",  "OFFSET", "CONFIG", "PERIOD",
        "FROM",       "TO",       "TIG",      "HIGH",     "LOW",    "IN",     "BEFORE",
        "EXCEPT",     "RISING",   "PHASE",    "PRIORITY", "TNM",    "LOC",    "INIT_00..01",
        "RLOC_RANGE", "MAXDELAY", "=",        ";",        "|",      ",",      ":",
        "*",          "/",        "\"",       "\"a b\"",  "#",      "//",     "\n",
        "\r\n",       " ",        "\t",       "10",       "-1.5",   "ns",     "MHz",
        "%",          "50%",      "2.5ns",    "x",        "a:b",    "\x01",   "\x7f",
        "\xff",       "+",        "TS_a*2",   "C",        "mV"};
    unsigned seed = 12345;
    auto rnd = [&seed](unsigned n) {
        seed = seed * 1103515245u + 12345u;
        return (seed >> 16) % n;
    };
    for (int file = 0; file < 300; ++file) {
        std::string text;
        const unsigned count = 1 + rnd(60);
        for (unsigned i = 0; i < count; ++i) {
            text += pieces[rnd(std::size(pieces))];
            if (rnd(3) == 0) text += ' ';
        }
        const int lines = 1 + static_cast<int>(std::count(text.begin(), text.end(), '\n'));
        text += "\nNET sentinel;\n";
        const auto calls = parse_text(text);
        ASSERT_FALSE(calls.empty()) << text;
        for (const Call& c : calls) {
            EXPECT_GE(c.line, 1) << text;
            EXPECT_LE(c.line, lines + 1) << text;
            EXPECT_LE(c.ascii.size(), text.size()) << text;
        }
        // The sentinel is read unless an open statement or quote swallowed it.
        const Call& last = calls.back();
        EXPECT_TRUE(last.what == "net(sentinel;)" || last.line <= lines) << text;
    }
}
