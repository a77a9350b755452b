// Extractor tests: a design with view EXPANDED and top block "top", block builders, runners.
#pragma once

#include <gtest/gtest.h>

#include <initializer_list>
#include <sstream>
#include <string>
#include <utility>

#include "extract/cst_extractor.h"
#include "host/port/msgman.h"

class ExtractTest : public ::testing::Test {
protected:
    using Entries = std::initializer_list<std::pair<const char*, const char*>>;

    // A constraint block as annotation leaves it; a TIMESPEC/TIMEGRP block gets its list.
    static Ndm_Block* Block(Ndm_Block* parent, const char* name, const char* type, Entries entries = {}) {
        Ndm_Block* b = parent->CreateBlock(name);
        b->CreatePropertyString("TYPE", type);
        b->CreatePropertyBool("UCF");
        b->CreatePropertyBool("TERMINAL");
        if (std::string(type) != "CONFIG") {
            Ndm_Property* list = b->CreatePropertyList(type);
            for (const auto& [n, v] : entries) list->CreatePropertyString(n, v);
        }
        return b;
    }
    static void List(Ndm_PropertyHolder* h, const char* name, std::initializer_list<const char*> texts) {
        Ndm_Property* p = h->CreatePropertyStringList(name);
        for (const char* t : texts) p->AddString(t);
    }
    std::string Run(CstExtractor& ex) {
        std::ostringstream text;
        Port::Stream stream(text);
        ex.Extract(view, stream);
        return text.str();
    }
    // Runs f expecting one fatal message (code 2, module CstExtractor); returns its text.
    template <class F>
    static std::string Fatal(F&& f) {
        Port_MsgCapture capture;
        EXPECT_THROW(f(), Port_FatalError);
        const auto& m = capture.messages();
        if (m.size() != 1 || m[0].severity != Port_Severity::Fatal) return "<no single fatal>";
        EXPECT_EQ(m[0].code, 2);
        EXPECT_EQ(m[0].module, "CstExtractor");
        return m[0].text;
    }

    Ndm_Design design{"d"};
    Ndm_View* view = design.CreateView("EXPANDED");
    Ndm_Block* top = view->CreateTopBlock("top");
};
