// Generated designs shared by the benchmarks.
#pragma once

#include <cstdio>
#include <fstream>
#include <memory>
#include <random>
#include <string>

#include "host/design/ndm.h"

// A flat design: the top block "top" holds cells cell_0 .. cell_{N-1}, each with the pins A,
// B, C and Y, and one signal n_i per cell, each in a network of its own.
inline std::unique_ptr<Ndm_Design> MakeFlatDesign(int cells) {
    auto design = std::make_unique<Ndm_Design>("bench");
    Ndm_View* view = design->CreateView("EXPANDED");
    Ndm_Block* top = view->CreateTopBlock("top");
    char name[64];
    for (int i = 0; i < cells; ++i) {
        std::snprintf(name, sizeof name, "cell_%d", i);
        Ndm_Block* cell = top->CreateBlock(name);
        for (const char* pin : {"A", "B", "C", "Y"}) cell->CreatePin(pin);
        std::snprintf(name, sizeof name, "n_%d", i);
        view->CreateNetwork()->AddSignal(top->CreateSignal(name));
    }
    return design;
}

// Writes 10,000 exact-name statements over a flat design of cells (two constraints each: a LOC
// and a TNM on a cell, or an IOSTANDARD and a TNM_NET on a net) and one TIMESPEC between two of
// their groups, to path; returns path.
inline std::string WriteExactStatements(int cells, const std::string& path) {
    std::ofstream out(path);
    std::mt19937 rng(11);
    std::uniform_int_distribution<int> pick(0, cells - 1);
    for (int i = 0; i < 10000; ++i) {
        int k = pick(rng);
        if (i % 2)
            out << "INST cell_" << k << " LOC = SITE_X" << (k % 97) << "Y" << (k % 89) << " | TNM = grp" << (k % 7)
                << ";\n";
        else
            out << "NET n_" << k << " IOSTANDARD = LVCMOS33 | TNM_NET = ngrp" << (k % 13) << ";\n";
    }
    out << "TIMESPEC TS_a = FROM grp1 TO ngrp2 5 ns;\n";
    return path;
}
