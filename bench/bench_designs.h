// Generated designs shared by the benchmarks.
#pragma once

#include <cstdio>
#include <memory>

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
