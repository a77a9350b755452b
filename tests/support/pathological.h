// Constraint files whose cost must grow linearly with their size, each with the design it is
// annotated over: made by the tests (small sizes, time ratios) and the benchmarks (the sizes
// users have hit, time and peak memory).
#pragma once

#include <cstdio>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "host/design/ndm.h"

namespace lun_test {

struct PathologicalInput {
    const char* name;
    const char* unit;  // what the size counts
    size_t full;       // the size to stand up to
    std::function<std::unique_ptr<Ndm_Design>(size_t)> design;
    std::function<std::string(size_t)> text;
};

// Design "d", top block "top": the networks clk, din, bus[0] and bus[1], the block u1 with pin
// P, and `count` signals and blocks named `length` a's followed by a distinct suffix (the last
// one "b").
inline std::unique_ptr<Ndm_Design> PathologicalDesign(int count = 0, size_t length = 0) {
    auto design = std::make_unique<Ndm_Design>("d");
    Ndm_View* view = design->CreateView("EXPANDED");
    Ndm_Block* top = view->CreateTopBlock("top");
    for (const char* name : {"clk", "din", "bus[0]", "bus[1]"}) view->CreateNetwork()->AddSignal(top->CreateSignal(name));
    top->CreateBlock("u1")->CreatePin("P");
    for (int i = 0; i < count; ++i) {
        const std::string name = std::string(length, 'a') + (i + 1 < count ? "x" + std::to_string(i) : "b");
        view->CreateNetwork()->AddSignal(top->CreateSignal(name.c_str()));
        top->CreateBlock(name.c_str())->CreatePin("P");
    }
    return design;
}

inline std::string Numbered(const char* format, size_t i) {
    char text[128];
    std::snprintf(text, sizeof text, format, i, i);
    return text;
}

// The inputs, in the order the tests and the benchmarks print them.
inline const std::vector<PathologicalInput>& PathologicalInputs() {
    static const std::vector<PathologicalInput> inputs = {
        // One name of n bytes: found, found as an instance and a pin, missed (which tries it
        // ignoring case and with every other bus delimiter), and a group of as long a name.
        {"long name", "bytes", 1000000, [](size_t n) { return PathologicalDesign(1, n); },
         [](size_t n) {
             const std::string a(n, 'a'), g(n, 'g');
             return "NET \"" + a + "b\" LOC = P1 | TNM_NET = \"" + g + "\";\nINST \"" + a + "b\" LOC = SLICE_X0Y0;\n" +
                    "PIN \"" + a + "b.P\" TIG;\nNET \"" + a + "c<1>\" LOC = P2;\nTIMESPEC TS_g = PERIOD \"" + g +
                    "\" 10 ns;\nTIMEGRP \"" + g + "2\" = \"" + g + "\";\n";
         }},
        // n constraints joined with "|" in one statement, on a net and on an instance.
        {"| constraints", "constraints", 100000, [](size_t) { return PathologicalDesign(); },
         [](size_t n) {
             static const char* const kinds[] = {"TNM_NET = g%zu", "IOSTANDARD = LVCMOS33", "SLEW = FAST",
                                                 "DRIVE = %zu", "PULLUP", "KEEP"};
             std::string net = "NET \"din\" ", inst = "INST \"u1\" ";
             for (size_t i = 0; i < n / 2; ++i) {
                 net += (i ? " | " : "") + Numbered(kinds[i % 6], i % 24 + 2);
                 inst += (i ? " | " : "") + Numbered(i % 2 ? "TNM = t%zu" : "LOC = SLICE_X%zuY%zu", i);
             }
             return net + ";\n" + inst + ";\n";
         }},
        // Patterns with many stars against ten names of n / 10 bytes (one of them matches).
        {"*a*a*a*a*a*a*a*a*a*b", "name bytes", 1000000, [](size_t n) { return PathologicalDesign(10, n / 10); },
         [](size_t) {
             return "NET \"*a*a*a*a*a*a*a*a*a*b\" TNM_NET = w;\nINST \"*a*a*a*a*a*a*a*a*a*b\" TNM = w2;\n"
                    "INST \"*a*a*a*a*a*a*a*a*a*b/*\" TNM = w3;\nNET \"*a*a*a*a*a*a*a*a*a*c\" TIG;\n"
                    "PIN \"*a*a*a*a*a*a*a*a*a*b.P\" TIG;\nTIMEGRP w4 = NETS(\"*a*a*a*a*a*a*a*a*a*b\");\n";
         }},
        // A piece of n / 20 a's between stars against names of n bytes that nearly hold it at
        // every place (runs of n / 20 - 1 a's).
        {"*aaa...aaa*", "name bytes", 1000000,
         [](size_t n) {
             auto design = PathologicalDesign();
             Ndm_View* view = design->GetWorkView();
             std::string name;
             while (name.size() < n) name += std::string(n / 20 - 1, 'a') + "x";
             for (const char* end : {"", "y"})
                 view->CreateNetwork()->AddSignal(view->GetBlock()->CreateSignal((name + end).c_str()));
             return design;
         },
         [](size_t n) {
             const std::string piece(n / 20, 'a');
             return "NET \"*" + piece + "*\" TIG;\nINST \"*" + piece + "*\" TNM = t;\nNET \"*x" + piece + "*\" TIG;\n";
         }},
        // n subscripts nested in one name, of one delimiter and of the four in turn.
        {"nested subscripts", "levels", 100000, [](size_t) { return PathologicalDesign(); },
         [](size_t n) {
             std::string same = "bus" + std::string(n, '[') + "0" + std::string(n, ']'), mixed = "bus";
             for (size_t i = 0; i < n; ++i) mixed += "([<{"[i % 4];
             mixed += "0";
             for (size_t i = n; i-- > 0;) mixed += ")]>}"[i % 4];
             return "NET \"" + same + "\" LOC = P1;\nNET \"" + mixed + "\" LOC = P2;\nINST \"" + mixed +
                    "\" TNM = t;\nNET \"" + mixed + "*\" TIG;\n";
         }},
        // n statements naming nothing in the design.
        {"unmatched statements", "statements", 1000000, [](size_t) { return PathologicalDesign(); },
         [](size_t n) {
             std::string text;
             for (size_t i = 0; i < n; ++i)
                 text += Numbered(i % 2 ? "NET \"nope%zu\" LOC = P%zu;\n" : "INST \"nope%zu\" TNM = t%zu;\n", i);
             return text;
         }},
        // A file of n bytes of comments and statements on the same few objects.
        {"big file", "bytes", 200000000, [](size_t) { return PathologicalDesign(); },
         [](size_t n) {
             static const std::string kBlock =
                 "# the board's data lines, as wired on revision B\n"
                 "NET \"din\" IOSTANDARD = LVCMOS33 | SLEW = FAST | DRIVE = 8;\n"
                 "INST \"u1\" LOC = SLICE_X1Y1 | TNM = regs;\n"
                 "NET \"clk\" TNM_NET = clocks;\n";
             std::string text;
             text.reserve(n + kBlock.size());
             while (text.size() < n) text += kBlock;
             return text;
         }},
    };
    return inputs;
}

}  // namespace lun_test
