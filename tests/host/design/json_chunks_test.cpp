// The outline of a large JSON text (the containers a reading in pieces walks into, and the
// commas that cut them), checked against an outline made a byte at a time on random texts whose
// strings are full of brackets, commas, quotes and runs of backslashes across block boundaries.
#include <gtest/gtest.h>

#include <random>
#include <string>

#include "host/design/json_chunks.h"

namespace {

using Ndm_JsonChunks::Container;
using Ndm_JsonChunks::Outline;

// The outline, one byte at a time. A backslash escapes the next byte outside strings as well.
bool SlowOutline(const std::string& t, size_t piece, Outline& out) {
    out = Outline();
    const size_t first = t.find_first_not_of(" \t\r\n");
    if (first == std::string::npos || (t[first] != '{' && t[first] != '[')) return false;
    struct Open {
        size_t open, separator, cut, element;
        uint32_t record;
        bool object;
        size_t commas = 0;
    };
    std::vector<Open> stack;
    auto record = [&](Open& o) {
        if (o.record == UINT32_MAX) {
            o.record = static_cast<uint32_t>(out.containers.size());
            Container c;
            c.open = o.open;
            c.element = o.element;
            c.object = o.object;
            out.containers.push_back(c);
        }
        return o.record;
    };
    bool in_string = false, closed = false;
    for (size_t i = first; i < t.size(); ++i) {
        const char c = t[i];
        if (c == '\\') {
            ++i;
        } else if (c == '"') {
            in_string = !in_string;
        } else if (in_string) {
        } else if (c == ',') {
            if (stack.empty()) return false;
            if (i - stack.back().cut >= piece) {
                out.containers[record(stack.back())].cuts.push_back(i);
                stack.back().cut = i;
            }
            stack.back().separator = i;
            ++stack.back().commas;
        } else if (c == '[' || c == '{') {
            if (closed) return false;
            stack.push_back({i, i, i, stack.empty() ? i : stack.back().separator + 1, UINT32_MAX, c == '{'});
        } else if (c == ']' || c == '}') {
            if (stack.empty()) return false;
            Open o = stack.back();
            if (o.object != (c == '}')) return false;
            stack.pop_back();
            closed = stack.empty();
            if (o.record == UINT32_MAX && i - o.open < piece) continue;
            const uint32_t r = record(o);
            out.containers[r].close = i;
            out.containers[r].members = o.commas + 1;
            if (stack.empty())
                out.root = r;
            else
                out.containers[record(stack.back())].children.push_back(r);
        }
    }
    if (in_string || !stack.empty() || !closed) return false;
    return out.root == UINT32_MAX || out.containers[out.root].close == t.find_last_not_of(" \t\r\n");
}

void Space(std::mt19937& rng, std::string& out) {
    static const char* const kSpace[] = {"", "", " ", "\n  ", "\t", "\r\n"};
    out += kSpace[rng() % 6];
}

void RandomString(std::mt19937& rng, std::string& out) {
    static const char* const kPieces[] = {"a", "bc", "[", "]", "{", "}", ",", ":", " ", "\\\"", "\\\\",
                                          "\\\\\\\\", "\\\\\\\"", "\\u005c", "\xc3\xa9", "\\n"};
    out += '"';
    const int n = static_cast<int>(rng() % (rng() % 8 == 0 ? 90 : 6));
    for (int i = 0; i < n; ++i) out += kPieces[rng() % 16];
    out += '"';
}

void RandomValue(std::mt19937& rng, int depth, std::string& out) {
    const unsigned kind = depth > 5 ? rng() % 3 : rng() % 6;
    if (kind == 0) {
        out += std::to_string(static_cast<int>(rng() % 2000) - 1000);
    } else if (kind == 1) {
        RandomString(rng, out);
    } else if (kind == 2) {
        out += rng() % 2 ? "true" : "null";
    } else {
        const bool object = kind % 2;
        out += object ? '{' : '[';
        const int n = static_cast<int>(rng() % 7);
        for (int i = 0; i < n; ++i) {
            if (i) out += ',';
            Space(rng, out);
            if (object) {
                RandomString(rng, out);
                Space(rng, out);
                out += ':';
                Space(rng, out);
            }
            RandomValue(rng, depth + 1, out);
            Space(rng, out);
        }
        out += object ? '}' : ']';
    }
}

void ExpectSameOutline(const Outline& fast, const Outline& slow, const std::string& text) {
    ASSERT_EQ(fast.root, slow.root) << text;
    ASSERT_EQ(fast.containers.size(), slow.containers.size()) << text;
    for (size_t i = 0; i < fast.containers.size(); ++i) {
        const Container &f = fast.containers[i], &s = slow.containers[i];
        ASSERT_EQ(f.open, s.open) << text;
        ASSERT_EQ(f.close, s.close) << text;
        ASSERT_EQ(f.element, s.element) << text;
        ASSERT_EQ(f.object, s.object) << text;
        ASSERT_EQ(f.cuts, s.cuts) << text;
        ASSERT_EQ(f.children, s.children) << text;
        ASSERT_EQ(f.members, s.members) << text;
    }
}

// The outline matches the slow one, whether the text is classified with wide registers or not.
void ExpectSame(const std::string& text, size_t piece) {
    Outline slow;
    const bool ok = SlowOutline(text, piece, slow);
    for (bool wide : {true, false}) {
        Ndm_JsonChunks::UseWideBlocks() = wide;
        Outline fast;
        const bool fast_ok = Ndm_JsonChunks::MakeOutline(text.data(), text.size(), piece, fast);
        Ndm_JsonChunks::UseWideBlocks() = true;
        ASSERT_EQ(fast_ok, ok) << text;
        if (ok) ExpectSameOutline(fast, slow, text);
    }
}

TEST(JsonOutline, MatchesAByteAtATimeOutline) {
    std::mt19937 rng(20261124);
    for (int round = 0; round < 250; ++round) {
        std::string text;
        Space(rng, text);
        text += rng() % 2 ? '[' : '{';
        const bool object = text.back() == '{';
        for (int i = 0, n = static_cast<int>(rng() % 40); i < n; ++i) {
            if (i) text += ',';
            if (object) {
                RandomString(rng, text);
                text += ':';
            }
            RandomValue(rng, 0, text);
        }
        text += object ? '}' : ']';
        Space(rng, text);
        for (size_t piece : {size_t{1}, size_t{2}, size_t{9}, size_t{64}, size_t{150}, size_t{700}, size_t{4000}}) {
            SCOPED_TRACE(piece);
            ExpectSame(text, piece);
            // Cut short, or with text after the value: outlined alike (mostly refused).
            ExpectSame(text.substr(0, rng() % text.size()), piece);
            ExpectSame(text + (rng() % 2 ? "]" : " x"), piece);
        }
    }
}

// Containers nested deeper than a small one is followed, and small ones beside a large one that
// opens and closes in the same block.
TEST(JsonOutline, DeepAndCrowdedNestingMatches) {
    std::string deep;
    for (int i = 0; i < 300; ++i) deep += i % 3 ? "[1, " : "{\"k\": ";
    for (int i = 299; i >= 0; --i) deep += i % 3 ? "]" : "}";
    std::string crowded = "[";
    for (int i = 0; i < 200; ++i) crowded += (i ? "," : "") + std::string(i % 7 ? "[[],{}]" : "[\"]\\\\\",[1,[2,[3,[4,[5]]]]]]");
    crowded += "]";
    for (const std::string& text : {deep, crowded, "[" + deep + "," + crowded + "]"})
        for (size_t piece : {size_t{1}, size_t{5}, size_t{40}, size_t{64}, size_t{65}, size_t{200}, size_t{1000}}) {
            SCOPED_TRACE(piece);
            ExpectSame(text, piece);
        }
}

TEST(JsonOutline, RefusesWhatIsNotOneArrayOrObject) {
    const char* const kTexts[] = {"",         "  \n", "1",       "\"[x]\"",  "[1] x",   "[1]]",
                                  "[1][2]",   "x[1]", "[\"abc]", "[{]",      "{\"a\\\"}", "[1,",
                                  "[{\"a\":1]]", "{\"a\":[1}}"};
    for (const char* text : kTexts) {
        Outline out;
        EXPECT_FALSE(Ndm_JsonChunks::MakeOutline(text, std::char_traits<char>::length(text), 1, out)) << text;
    }
    // Brackets that do not match inside containers too small to be outlined.
    for (const char* text : {"[[{]}]", "{\"a\": [{\"b\": [1}], 2]}", "[[[[[[]]]]]}"}) {
        Outline out;
        EXPECT_FALSE(Ndm_JsonChunks::MakeOutline(text, std::char_traits<char>::length(text), 1000, out)) << text;
    }
    Outline out;
    const std::string text = " [ [1, 2], {\"k\": [3]} ] \n";
    ASSERT_TRUE(Ndm_JsonChunks::MakeOutline(text.data(), text.size(), 8, out));
    ASSERT_NE(out.root, UINT32_MAX);
    const Container& root = out.containers[out.root];
    EXPECT_EQ(root.open, 1u);
    EXPECT_EQ(root.close, text.size() - 3);
    EXPECT_EQ(root.cuts, std::vector<size_t>{9});
    EXPECT_EQ(root.members, 2u);
    ASSERT_EQ(root.children.size(), 1u);  // {"k": [3]} spans 10 bytes, [1, 2] only 6
    EXPECT_EQ(out.containers[root.children[0]].open, 11u);
    EXPECT_EQ(out.containers[root.children[0]].element, 10u);
}

}  // namespace
