// Portability layer: string helpers, formatting, the host string, messages, atomic files.
#include <gtest/gtest.h>
#include <algorithm>
#include <simdjson.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cctype>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <memory>
#include <random>
#include <cstring>
#include <vector>

#include "host/port/atomic_file.h"
#include "host/port/env.h"
#include "host/port/file.h"
#include "host/port/json_text.h"
#include "host/port/msgman.h"
#include "host/port/string_base.h"
#include "host/port/ut_str.h"

namespace {

struct Owned {
    explicit Owned(char* p) : p(p) {}
    ~Owned() { delete[] p; }
    char* p;
};

TEST(UtStrTest, WildcardMatching) {
    EXPECT_TRUE(UT_STR::Match("u1/reg_3", "u1/reg*"));
    EXPECT_TRUE(UT_STR::Match("data<7>", "data<?>"));
    EXPECT_FALSE(UT_STR::Match("data<17>", "data<?>"));
    EXPECT_TRUE(UT_STR::Match("abcabcx", "*abc*x"));  // needs backtracking over the first *
    EXPECT_FALSE(UT_STR::Match("bc", "*abc"));         // the end of the text is shorter
    EXPECT_TRUE(UT_STR::IMatch("xaABC", "*a**b?"));    // the last star takes all but the end
    EXPECT_FALSE(UT_STR::Match("xabcab", "*abc"));
    EXPECT_TRUE(UT_STR::Match("", "*"));
    EXPECT_FALSE(UT_STR::Match("", "?"));
    EXPECT_FALSE(UT_STR::Match("U1/REG", "u1/reg"));
    EXPECT_TRUE(UT_STR::IMatch("U1/REG_0", "u1/reg*"));
    EXPECT_FALSE(UT_STR::IMatch("u1/reg", "u1/reg?"));
    // a long text against a pattern of many stars stays fast (no exponential backtracking)
    std::string text(20000, 'a');
    EXPECT_FALSE(UT_STR::Match(text.c_str(), "*a*a*a*a*a*a*b"));
}

// Against a plain dynamic-programming matcher, on every short text and pattern of a few letters.
TEST(UtStrTest, WildcardMatchingAgreesWithReference) {
    auto reference = [](const std::string& t, const std::string& p, bool fold) {
        auto same = [&](char a, char b) { return fold ? std::tolower(a) == std::tolower(b) : a == b; };
        std::vector<std::vector<char>> m(t.size() + 1, std::vector<char>(p.size() + 1, 0));
        m[0][0] = 1;
        for (size_t j = 1; j <= p.size(); ++j) m[0][j] = p[j - 1] == '*' && m[0][j - 1];
        for (size_t i = 1; i <= t.size(); ++i)
            for (size_t j = 1; j <= p.size(); ++j)
                m[i][j] = p[j - 1] == '*' ? (m[i - 1][j] || m[i][j - 1])
                                          : (m[i - 1][j - 1] && (p[j - 1] == '?' || same(t[i - 1], p[j - 1])));
        return m[t.size()][p.size()] != 0;
    };
    std::mt19937 random(5);
    auto word = [&](const char* letters, size_t most) {
        std::string w(random() % (most + 1), ' ');
        for (char& c : w) c = letters[random() % std::strlen(letters)];
        return w;
    };
    for (int i = 0; i < 20000; ++i) {
        const std::string t = word("abA", 12), p = word("ab*?B", 8);
        ASSERT_EQ(UT_STR::Match(t.c_str(), p.c_str()) != 0, reference(t, p, false)) << t << " ~ " << p;
        ASSERT_EQ(UT_STR::IMatch(t.c_str(), p.c_str()) != 0, reference(t, p, true)) << t << " ~ " << p;
    }
    // Pieces of more than 16 bytes between stars, taken from the text so that some match.
    for (int i = 0; i < 3000; ++i) {
        std::string t = word("aab", 80);
        while (t.size() < 24) t += "ab";
        const std::string piece = t.substr(random() % (t.size() - 20), 17 + random() % 4);
        std::string p = "*" + piece + "*";
        if (random() % 2) p[1 + random() % piece.size()] ^= 'a' ^ 'b';
        if (random() % 2) p += t.substr(t.size() - std::min<size_t>(t.size(), 2));
        ASSERT_EQ(UT_STR::Match(t.c_str(), p.c_str()) != 0, reference(t, p, false)) << t << " ~ " << p;
        ASSERT_EQ(UT_STR::IMatch(t.c_str(), p.c_str()) != 0, reference(t, p, true)) << t << " ~ " << p;
    }
    // Long pieces between stars, where the long search is used.
    const std::string piece = "abababababababababac", text = "xx" + std::string(30, 'a') + "ababababababababababac" + "yy";
    EXPECT_TRUE(UT_STR::Match(text.c_str(), ("*" + piece + "*").c_str()));
    EXPECT_TRUE(UT_STR::IMatch(text.c_str(), "*ABABABABABABABABABAC*yy"));
    EXPECT_FALSE(UT_STR::Match(text.c_str(), ("*" + piece + "*ac*").c_str()));
    EXPECT_TRUE(UT_STR::Match(text.c_str(), ("x*" + piece + "*y").c_str()));
}

// A long piece between stars against a long name that almost holds it at every place: the old
// search compared the piece again from every start (a 1 MB name took seconds per pattern).
TEST(UtStrTest, WildcardSearchIsLinearInTheName) {
    std::string name;
    for (int i = 0; i < 20; ++i) name += std::string(9999, 'a') + "x";
    const std::string pattern = "*" + std::string(10000, 'a') + "*";
    const auto start = std::chrono::steady_clock::now();
    EXPECT_FALSE(UT_STR::Match(name.c_str(), pattern.c_str()));
    EXPECT_FALSE(UT_STR::IMatch(name.c_str(), ("*x" + std::string(10000, 'A') + "*").c_str()));
    EXPECT_TRUE(UT_STR::Match((name + std::string(10000, 'a')).c_str(), pattern.c_str()));
    EXPECT_LT(std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count(), 0.5);
}

TEST(UtStrTest, ComparisonsAndCopies) {
    EXPECT_EQ(UT_STR::ICompare("Clk", "cLK"), 0);
    EXPECT_NE(UT_STR::Compare("Clk", "clk"), 0);
    EXPECT_EQ(UT_STR::INCompare("TOPx", "topy", 3), 0);
    EXPECT_LT(UT_STR::ICompare("ab", "abc"), 0);
    EXPECT_EQ(UT_STR::Compare(nullptr, ""), 0);

    Owned dup(UT_STR::Dup("loc"));
    EXPECT_STREQ(UT_STR::Upper(dup.p), "LOC");
    EXPECT_EQ(UT_STR::Dup(nullptr), nullptr);
    Owned cat(UT_STR::Cat("a,", "b"));
    EXPECT_STREQ(cat.p, "a,b");

    char buf[4];
    EXPECT_STREQ(UT_STR::NCopy(buf, "abcdef", 3), "abc");
    EXPECT_EQ(UT_STR::Len(nullptr), 0u);
}

TEST(UtStrTest, GetTokenSplitsAtFirstDelimiter) {
    char text[] = "u1/u2.D.x";
    char token[8];
    ASSERT_EQ(UT_STR::GetToken(text, token, sizeof token, "."), 1);
    EXPECT_STREQ(token, "u1/u2");
    EXPECT_STREQ(text, "D.x");

    char none[] = "nodot";
    EXPECT_EQ(UT_STR::GetToken(none, token, sizeof token, "."), 0);
    EXPECT_STREQ(none, "nodot");

    char longname[] = "abcdefghijkl.P";
    ASSERT_EQ(UT_STR::GetToken(longname, token, sizeof token, "."), 1);
    EXPECT_STREQ(token, "abcdefg");  // truncated to the token buffer
    EXPECT_STREQ(longname, "P");
}

TEST(UtStrTest, StrToInt32) {
    bool ok = false;
    EXPECT_EQ(UT_STR::StrToINT32(" 50 ", &ok), 50);
    EXPECT_TRUE(ok);
    EXPECT_EQ(UT_STR::StrToINT32("-7", &ok), -7);
    EXPECT_EQ(UT_STR::StrToINT32("12abc", &ok), -1);
    EXPECT_FALSE(ok);
    EXPECT_EQ(UT_STR::StrToINT32("99999999999", &ok), -1);
    EXPECT_FALSE(ok);
    EXPECT_EQ(UT_STR::StrToINT32("", &ok), -1);
}

TEST(FormatTest, IntegerDirectiveAndFixedPoint) {
    Owned text(zepform("%s %I %f pS %%I", "x", 42, 2500.0));
    EXPECT_STREQ(text.p, "x 42 2500.000000 pS %I");
    EXPECT_EQ(Port_Format("%5I|%-3I|", 7, 1), "    7|1  |");
    std::string big(5000, 'n');
    EXPECT_EQ(Port_Format("<%s>", big.c_str()).size(), 5002u);
}

TEST(StringBaseTest, SplitTrimSearch) {
    using S = Port::StringBase<char>;
    auto pieces = S::Split(S("ag1 = SITE_A0:SITE_A7"), "=", true, "", "");
    ASSERT_EQ(pieces.size(), 2u);
    EXPECT_EQ(pieces[0].Trim(" \t").str(), "ag1");
    EXPECT_EQ(pieces[1].Trim(" \t").str(), "SITE_A0:SITE_A7");

    EXPECT_EQ(S::Split(S("a  b   c"), " ", true, "", "").size(), 3u);
    EXPECT_EQ(S::Split(S("a  b"), " ", false, "", "").size(), 3u);
    auto quoted = S::Split(S("x \"a b\" y"), " ", true, "\"", "\"");
    ASSERT_EQ(quoted.size(), 3u);
    EXPECT_EQ(quoted[1].str(), "\"a b\"");

    S key("initp_0F");
    EXPECT_EQ(key.GetIndexOfString("INITP_", S::IGNORE_CASE), 0);
    EXPECT_EQ(key.GetIndexOfString("INITP_", S::EXACT), -1);
    EXPECT_EQ(S("abc").Compare("ABC", S::IGNORE_CASE), 0);
    EXPECT_EQ(S("abcdef").Truncate(2).str(), "ab");
    EXPECT_EQ(S().doFormat("%I-%s", 3, "x").str(), "3-x");
}

TEST(MessageTest, SinksCountsAndDebugChannel) {
    Port_MsgManData::ResetCounts();
    {
        Port_MsgCapture capture;
        auto msg = Port_MsgManData::createObject("Quillmap", "lunbase", __LINE__, "1.0");
        msg.issueError("Line %i in '%s': bad.\n", 3, "a.ucf");
        msg.issueWarning("w\n");
        Port_MsgManData::debugStub("hidden %I\n", 1);
        ASSERT_EQ(capture.messages().size(), 2u);
        EXPECT_EQ(capture.messages()[0].text, "Line 3 in 'a.ucf': bad.\n");
        EXPECT_EQ(capture.messages()[0].module, "lunbase");
        EXPECT_EQ(Port_MsgManData::Count(Port_Severity::Error), 1);
        EXPECT_EQ(Port_MsgManData::Count(Port_Severity::Warning), 1);
    }
    {
        Port_MsgCapture capture(/*debug=*/true);
        Port_MsgManData::debugStub("MGR::cb_net %I\n", 7);
        EXPECT_EQ(capture.Texts(Port_Severity::Debug), std::vector<std::string>{"MGR::cb_net 7\n"});
    }
}

TEST(MessageTest, FatalIsDeliveredThenThrown) {
    Port_MsgCapture capture;
    auto msg = Port_MsgManData::createObject("Quillmap", "lunbase", __LINE__, "1.0");
    try {
        msg.issueFatal(2, "No design supplied!\n");
        FAIL() << "fatal returned";
    } catch (const Port_FatalError& e) {
        EXPECT_EQ(e.code(), 2);
        EXPECT_FALSE(e.user());
    }
    ASSERT_EQ(capture.messages().size(), 1u);
    EXPECT_EQ(capture.messages()[0].severity, Port_Severity::Fatal);
    EXPECT_TRUE(capture.messages()[0].has_code);
    EXPECT_THROW(msg.issueUserFatal(5, "x\n"), Port_FatalError);
}

TEST(MessageTest, JsonLinesEscapeText) {
    char* buf = nullptr;
    size_t size = 0;
    FILE* mem = open_memstream(&buf, &size);
    Port_JsonSink sink(mem);
    Port_Message m{Port_Severity::Internal, "Quillmap", "lunmgr", 1, true, 2, "a \"q\"\\\n\x01"};
    sink.Emit(m);
    std::fclose(mem);
    std::string line(buf, size);
    std::free(buf);
    EXPECT_EQ(line,
              "{\"severity\":\"internal_error\",\"program\":\"Quillmap\",\"module\":\"lunmgr\","
              "\"code\":2,\"text\":\"a \\\"q\\\"\\\\\\n\\u0001\"}\n");
}

// Any byte string becomes a valid UTF-8 JSON string that a strict parser accepts and that
// decodes back to the same bytes through the byte escapes.
TEST(JsonTextTest, AnyBytesGiveValidJson) {
    struct Case {
        std::string bytes, literal;
    } cases[] = {
        {"plain", "\"plain\""},
        {"P\xe9" "1", "\"P\\uf7e91\""},                   // Latin-1 byte
        {"caf\xc3\xa9", "\"caf\xc3\xa9\""},                // valid UTF-8 stays as it is
        {"\xf0\x9f\x98\x80", "\"\xf0\x9f\x98\x80\""},  // four-byte sequence
        {"\xc3", "\"\\uf7c3\""},                         // cut sequence
        {"\xc0\xaf", "\"\\uf7c0\\uf7af\""},              // overlong form
        {"\xed\xa0\x80", "\"\\uf7ed\\uf7a0\\uf780\""},  // surrogate
        {"\xef\x9f\xa9", "\"\\uf7ef\\uf79f\\uf7a9\""},  // a real U+F7E9 is escaped bytewise
        {"\xef\x9d\xbf", "\"\xef\x9d\xbf\""},            // U+F77F is outside the escape range
        {std::string("a\0b\x7f", 4), "\"a\\u0000b\\u007f\""},
    };
    for (const Case& c : cases) {
        std::string out;
        Port_AppendJsonString(out, c.bytes);
        EXPECT_EQ(out, c.literal);
    }
    std::string all;
    for (int b = 0; b < 256; ++b) all += static_cast<char>(b);
    all += "\xef\x9e\x80\xe2\x82\xac";
    std::string literal;
    Port_AppendJsonString(literal, all);
    simdjson::dom::parser parser;
    std::string_view decoded;
    ASSERT_EQ(parser.parse(simdjson::padded_string(literal)).get(decoded), simdjson::SUCCESS);
    std::string back = Port_DecodeByteEscapes(decoded);
    EXPECT_EQ(back, all);
}

// Saving: nothing half-written is ever seen, a failure at any step keeps the old file, and
// only a regular, writable file (or what a link names) is replaced, keeping its mode.
TEST(FileTest, SavesReplaceOnlyWhatTheyMay) {
    namespace fs = std::filesystem;
    const fs::path dir = fs::temp_directory_path() / ("lun_port_" + std::to_string(getpid()));
    fs::create_directories(dir);
    const std::string target = (dir / "out.txt").string();
    auto save = [](const std::string& path, const std::string& text) {
        Port::AtomicFile f(path);
        return f.Write(text) && f.Commit() ? std::string() : f.error();
    };
    auto content = [](const std::string& path) {
        std::ifstream in(path);
        return std::string(std::istreambuf_iterator<char>(in), {});
    };
    {
        Port::AtomicFile f(target);
        ASSERT_TRUE(f.Write("partial"));
    }  // destroyed without Commit: neither target nor temporary remains
    EXPECT_TRUE(fs::is_empty(dir));
    ASSERT_EQ(save(target, "old"), "");

    static std::string fail_at;
    Port::SetSaveFaultHook([](const char* step) { return fail_at != step; });
    for (const char* step : {"open", "write", "sync", "close", "rename"}) {
        fail_at = step;
        EXPECT_NE(save(target, "new"), "") << step;
        EXPECT_EQ(content(target), "old") << step;
        EXPECT_EQ(std::distance(fs::directory_iterator(dir), {}), 1) << step;  // no temporary left
    }
    Port::SetSaveFaultHook(nullptr);

    fs::permissions(target, fs::perms::owner_read | fs::perms::owner_write);
    ASSERT_EQ(save(target, "private"), "");
    EXPECT_EQ(fs::status(target).permissions() & fs::perms::all, fs::perms::owner_read | fs::perms::owner_write);
    fs::create_symlink(target, dir / "link");
    ASSERT_EQ(save((dir / "link").string(), "through"), "");
    EXPECT_TRUE(fs::is_symlink(dir / "link"));
    EXPECT_EQ(content(target), "through");
    // a leftover of a process that is gone is removed by the next save of the same file
    char host[256] = {};
    ::gethostname(host, sizeof host - 1);
    std::string machine = *host ? host : "host";  // as temporaries name it
    std::replace(machine.begin(), machine.end(), '.', '_');
    std::replace(machine.begin(), machine.end(), '/', '_');
    const std::string stale = ".out.txt." + machine + ".999999999.partial";
    std::ofstream(dir / stale) << "stale";
    std::ofstream(dir / ".out.txt.otherhost.999999999.partial") << "another machine's";
    ASSERT_EQ(save(target, "again"), "");
    EXPECT_FALSE(fs::exists(dir / stale));
    EXPECT_TRUE(fs::exists(dir / ".out.txt.otherhost.999999999.partial"));
    fs::remove(dir / ".out.txt.otherhost.999999999.partial");

    // a save stopped by SIGTERM takes its temporary with it
    if (pid_t child = ::fork(); child == 0) {
        Port::AtomicFile f(target);
        f.Write("half");
        ::raise(SIGTERM);
        ::_exit(0);
    } else {
        int status = 0;
        ::waitpid(child, &status, 0);
        EXPECT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == SIGTERM);
        EXPECT_EQ(std::distance(fs::directory_iterator(dir), {}), 2);  // the file and the link
        EXPECT_EQ(content(target), "again");
    }

    ASSERT_EQ(::mkfifo((dir / "fifo").c_str(), 0600), 0);
    fs::create_symlink(dir / "nowhere", dir / "dangling");
    std::ofstream(dir / "ro") << "keep";
    fs::permissions(dir / "ro", fs::perms::owner_read);
    struct Refused {
        fs::path path;
        const char* why;
    } refused[] = {{dir / "fifo", "is not a regular file"},
                   {dir, "is not a regular file"},
                   {dir / "dangling", "is a symbolic link to nothing"},
                   {dir / "ro", "is read-only"},
                   {dir / "missing" / "x", "No such file or directory"}};
    for (const Refused& r : refused) {
        std::string why = save(r.path.string(), "x");
        EXPECT_NE(why.find(r.why), std::string::npos) << r.path << ": " << why;
    }
    EXPECT_EQ(content((dir / "ro").string()), "keep");
    EXPECT_TRUE(Port::SameFile(target, (dir / "link").string()));
    EXPECT_FALSE(Port::SameFile(target, (dir / "ro").string()));
    fs::remove_all(dir);
}

TEST(FileTest, EnvAndDirectories) {
    ::setenv("LUN_TEST_EMPTY_VAR", "", 1);
    ASSERT_NE(Port_Env::GetEnv("LUN_TEST_EMPTY_VAR"), nullptr);  // empty counts as set
    ::unsetenv("LUN_TEST_EMPTY_VAR");
    EXPECT_EQ(Port_Env::GetEnv("LUN_TEST_EMPTY_VAR"), nullptr);
    auto dir = std::filesystem::temp_directory_path() / ("lun_mk_" + std::to_string(getpid()));
    std::string nested = (dir / "a" / "b").string();
    EXPECT_FALSE(Port::File::mkdir(nested.c_str(), false));
    EXPECT_TRUE(Port::File::mkdir(nested.c_str(), true));
    EXPECT_TRUE(Port::File::exist(nested.c_str()));
    std::filesystem::remove_all(dir);
}

}  // namespace
