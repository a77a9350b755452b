// File-level behaviour: comments, line ends, source texts, bad input and recovery.
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>

#include "host/port/msgman.h"
#include "recorder.h"

using namespace parser_test;

TEST(ParserFile, EmptyBlankAndCommentOnlyFilesSucceed) {
    bool ok = false;
    EXPECT_TRUE(parse_text("", &ok).empty());
    EXPECT_TRUE(ok);
    EXPECT_TRUE(parse_text(" \t\r\n\n;;  ;\n", &ok).empty());
    EXPECT_TRUE(ok);
    const auto calls = parse_text("# a\n  // b\n", &ok);
    EXPECT_TRUE(ok);
    ASSERT_EQ(calls.size(), 2u);
    EXPECT_EQ(calls[1].what, "comment( b)");
    EXPECT_EQ(calls[1].ascii, "  // b");
    EXPECT_EQ(calls[1].line, 2);
}

TEST(ParserFile, MissingNullAndDirectoryNamesCannotBeOpened) {
    Port_MsgCapture capture;
    Recorder missing("/nonexistent/dir/board.ucf");
    EXPECT_FALSE(missing.parse());
    Recorder none(nullptr);
    EXPECT_FALSE(none.parse());
    EXPECT_STREQ(none.get_filename(), "");
    const std::string dir = std::filesystem::temp_directory_path().string();
    Recorder directory(dir.c_str());
    EXPECT_FALSE(directory.parse());
    EXPECT_TRUE(missing.calls.empty() && none.calls.empty() && directory.calls.empty());
    const std::vector<std::string> expected = {
        "Could not open constraint file '/nonexistent/dir/board.ucf'.\n",
        "Could not open constraint file ''.\n",
        "Could not open constraint file '" + dir + "'.\n",
    };
    EXPECT_EQ(capture.Texts(Port_Severity::Error), expected);
}

TEST(ParserFile, CopyAndLoadRebindTheFile) {
    TempFile a("NET a;\n"), b("NET b;\nNET c;\n");
    Recorder r(a.path());
    Pr_Logical_Parser copy(r);
    EXPECT_STREQ(copy.get_filename(), a.path());
    Recorder other(b.path());
    EXPECT_TRUE(r.load(other));
    EXPECT_TRUE(r.parse());
    EXPECT_EQ(r.calls.size(), 2u);
    EXPECT_TRUE(r.load(a.path()));
    copy = other;
    EXPECT_STREQ(copy.get_filename(), b.path());
    EXPECT_FALSE(r.write("x"));
    EXPECT_TRUE(r.dump());
}

TEST(ParserFile, ResultComesFromCallbacksAndSyntaxErrors) {
    TempFile file("NET a;\nNET b;\n");
    Recorder r(file.path());
    r.answer = false;
    EXPECT_FALSE(r.parse());
    EXPECT_EQ(r.calls.size(), 2u);

    // An unreadable value fails the parse only through cb_error's answer; a syntax error
    // always does.
    bool ok = false;
    EXPECT_EQ(parse_text("NET a MAXDELAY = fast;\n", &ok).size(), 1u);
    EXPECT_TRUE(ok);
    parse_text("NET a LOC = ;\n", &ok);
    EXPECT_FALSE(ok);
}

TEST(ParserLexical, CommentsBetweenAndInsideStatements) {
    const auto calls = parse_text(
        "NET a # trailing\n"
        "# inside, dropped\n"
        "// also dropped\n"
        "  LOC = P1; # after the end\n"
        "NET b; // c;\n");
    // The "//" after a statement on its line is a word that starts a statement.
    ASSERT_EQ(calls.size(), 3u);
    EXPECT_EQ(calls[0].what, "net(a;(LOC,1,P1))");
    EXPECT_EQ(calls[0].ascii, "NET a # trailing\n# inside, dropped\n// also dropped\n  LOC = P1;");
    EXPECT_EQ(calls[1].what, "net(b;)");
    EXPECT_EQ(calls[2].what, "syntax(5,8,//)");
    EXPECT_EQ(calls[2].ascii, "// c;");

    const std::string with_nul("\t#\tx\0y\r\n", 8);
    const auto c = parse_text(with_nul);
    ASSERT_EQ(c.size(), 1u);
    EXPECT_EQ(c[0].what, "comment(\txy)");
    EXPECT_EQ(c[0].ascii, "\t#\txy");
}

TEST(ParserLexical, CrlfByteOrderMarkAndNoFinalNewline) {
    const auto calls = parse_text(
        "\xEF\xBB\xBF# head\r\n"
        "NET a\r\n  LOC = P1;\r\n"
        "NET\rb\rLOC=\"x\ry\";\r\n"
        "NET c LOC = P2;");
    ASSERT_EQ(calls.size(), 4u);
    EXPECT_EQ(calls[0].what, "comment( head)");
    EXPECT_EQ(calls[0].ascii, "# head");
    EXPECT_EQ(calls[1].ascii, "NET a\r\n  LOC = P1;");
    EXPECT_EQ(calls[1].line, 2);
    EXPECT_EQ(calls[2].what, "net(b;(LOC,1,x\ry))");  // a lone CR is a blank
    EXPECT_EQ(calls[3].what, "net(c;(LOC,1,P2))");
    EXPECT_EQ(calls[3].line, 5);

    // Columns start after the byte-order mark.
    EXPECT_EQ(parse_text("\xEF\xBB\xBFNET a LOC = ;")[0].what, "syntax(1,13,;)");
}

TEST(ParserLexical, StatementsShareLinesAndSpanLines) {
    const auto calls = parse_text("NET a; NET b\n\nLOC\n=\nP1 ;;; END;");
    ASSERT_EQ(calls.size(), 3u);
    EXPECT_EQ(calls[1].what, "net(b;(LOC,1,P1))");
    EXPECT_EQ(calls[1].line, 1);
    EXPECT_EQ(calls[1].ascii, "NET b\n\nLOC\n=\nP1 ;");
    EXPECT_EQ(calls[2].line, 5);
}

TEST(ParserErrors, UnknownStatements) {
    bool ok = true;
    const auto calls = parse_text("FOO bar;\n\"NET\" a;\n= x;\n, ;\nNETWORK a;\n", &ok);
    EXPECT_FALSE(ok);
    std::vector<std::string> expected = {"syntax(1,1,FOO)", "syntax(2,1,NET)", "syntax(3,1,=)",
                                         "syntax(4,1,,)", "syntax(5,1,NETWORK)"};
    std::vector<std::string> got;
    for (const Call& c : calls) got.push_back(c.what);
    EXPECT_EQ(got, expected);
    EXPECT_EQ(calls[1].ascii, "\"NET\" a;");
}

TEST(ParserErrors, ResynchronisationSkipsQuotesAndComments) {
    const auto calls = parse_text(
        "NET a LOC = P1 P2 \"x;y\" # z;\n"
        "# not delivered;\n"
        "  w;\n"
        "NET b;\n");
    ASSERT_EQ(calls.size(), 2u);
    EXPECT_EQ(calls[0].what, "syntax(1,16,P2)");
    EXPECT_EQ(calls[0].ascii, "NET a LOC = P1 P2 \"x;y\" # z;\n# not delivered;\n  w;");
    EXPECT_EQ(calls[1].what, "net(b;)");

    // An unreadable value resumes after the statement's ';' as well.
    const auto values = parse_text("NET a MAXDELAY = fast\nLOC=1;NET b;");
    ASSERT_EQ(values.size(), 2u);
    EXPECT_EQ(values[0].what, "error(1,18,fast)");
    EXPECT_EQ(values[1].what, "net(b;)");
}

TEST(ParserErrors, MissingSemicolonAtEndOfFile) {
    bool ok = true;
    auto calls = parse_text("NET a;\nnet last LOC = P9 # note\r\n", &ok);
    EXPECT_FALSE(ok);
    ASSERT_EQ(calls.size(), 2u);
    EXPECT_EQ(calls[1].what, "syntax(2,1,net)");
    EXPECT_EQ(calls[1].ascii, "net last LOC = P9 # note");

    calls = parse_text("NET a LOC = \n# comment\n");
    ASSERT_EQ(calls.size(), 1u);
    EXPECT_EQ(calls[0].what, "syntax(1,1,NET)");

    // The first problem wins: here the word, not the missing ';'.
    calls = parse_text("NET a LOC = P1 P2");
    ASSERT_EQ(calls.size(), 1u);
    EXPECT_EQ(calls[0].what, "syntax(1,16,P2)");
    EXPECT_EQ(calls[0].ascii, "NET a LOC = P1 P2");
}

TEST(ParserErrors, UnbalancedQuoteEndsTheStatementWithItsLine) {
    const auto calls = parse_text(
        "NET a\n"
        "  LOC = \"P1 ; PULLUP\r\n"
        "NET b;\n"
        "NET \"c;");
    ASSERT_EQ(calls.size(), 3u);
    EXPECT_EQ(calls[0].what, "syntax(2,9,\"P1 ; PULLUP)");
    EXPECT_EQ(calls[0].line, 1);
    EXPECT_EQ(calls[0].ascii, "NET a\n  LOC = \"P1 ; PULLUP");
    EXPECT_EQ(calls[1].what, "net(b;)");
    EXPECT_EQ(calls[2].what, "syntax(4,5,\"c;)");
}

TEST(ParserErrors, ControlBytes) {
    bool ok = true;
    const auto calls =
        parse_text("NET a LOC = P\x01;\nNET b;\n\x7f x; NET c \"\x02;\";\n\x1b", &ok);
    EXPECT_FALSE(ok);
    ASSERT_EQ(calls.size(), 5u);
    EXPECT_EQ(calls[0].what, "syntax(1,14,\\x01)");
    EXPECT_EQ(calls[0].ascii, "NET a LOC = P\x01;");
    EXPECT_EQ(calls[1].what, "net(b;)");
    // A control byte between statements starts a statement of its own.
    EXPECT_EQ(calls[2].what, "syntax(3,1,\\x7F)");
    EXPECT_EQ(calls[2].ascii, "\x7f x;");
    // Inside a quoted section: the ';' in the quotes does not end the statement.
    EXPECT_EQ(calls[3].what, "syntax(3,13,\\x02)");
    EXPECT_EQ(calls[3].ascii, "NET c \"\x02;\";");
    EXPECT_EQ(calls[4].what, "syntax(4,1,\\x1B)");
    EXPECT_EQ(calls[4].ascii, "\x1b");
}

TEST(ParserErrors, BinaryLineAndHugeName) {
    // Every byte value on one line: errors only, all on that line, nothing else disturbed.
    std::string all = "NET a;\n";
    for (int i = 0; i < 256; ++i)
        if (i != '\n') all.push_back(static_cast<char>(255 - i));
    all += "\nNET b;\nNET c;\n";
    bool ok = true;
    auto calls = parse_text(all, &ok);
    EXPECT_FALSE(ok);
    ASSERT_GE(calls.size(), 3u);
    EXPECT_EQ(calls.front().what, "net(a;)");
    EXPECT_EQ(calls.back().what, "net(c;)");
    for (std::size_t i = 1; i + 1 < calls.size(); ++i)
        EXPECT_EQ(calls[i].what.rfind("syntax(2,", 0), 0u) << calls[i].what;

    // Binary bytes up to a ';': one error, then the next statement.
    std::string line = "\x80\xff\x01\x02\xfe";
    calls = parse_text("NET a;\n" + line + ";\nNET b;\n");
    ASSERT_EQ(calls.size(), 3u);
    EXPECT_EQ(calls[1].what, "syntax(2,1,\x80\xff)");
    EXPECT_EQ(calls[1].ascii, line + ";");
    EXPECT_EQ(calls[2].what, "net(b;)");

    const std::string name(100000, 'n');
    const auto big = parse_text("NET " + name + " LOC = \"" + name + "\";\n");
    ASSERT_EQ(big.size(), 1u);
    EXPECT_EQ(big[0].what, "net(" + name + ";(LOC,1," + name + "))");
}

TEST(ParserFile, LargeFileWithoutFinalNewline) {
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
    text.pop_back();
    text.pop_back();
    const auto cut = parse_text(text, &ok);
    EXPECT_FALSE(ok);
    EXPECT_EQ(cut.back().what.substr(0, 21), "syntax(60001,16,\"qqqq");
}

TEST(ParserErrors, TokenSoupNeverBreaksTheParser) {
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
