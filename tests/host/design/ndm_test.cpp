// The design database: name lookups, full names, properties, deletion and networks.
#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "host/design/ndm.h"

namespace {

struct Tree {
    Ndm_Design design{"d"};
    Ndm_View* view = design.CreateView("EXPANDED");
    Ndm_Block* top = view->CreateTopBlock("top");
};

// Fills a block with n blocks, signals and pins named m0..m(n-1), plus duplicates that differ
// in case and in position, so the first-in-stored-order rule is visible.
void Populate(Ndm_Block* b, int n) {
    for (int i = 0; i < n; ++i) {
        std::string name = "m" + std::to_string(i);
        b->CreateBlock(name.c_str());
        b->CreateSignal(name.c_str());
        b->CreatePin(name.c_str());
    }
    b->CreateBlock("Dup");
    b->CreateSignal("Dup");
    b->CreatePin("Dup");
    b->CreateBlock("dup");
    b->CreateSignal("dup");
    b->CreatePin("dup");
    b->CreateBlock("dup");
    b->CreateSignal("dup");
    b->CreatePin("dup");
}

template <class T>
int IndexOf(const auto& items, const T* item) {
    int i = 0;
    for (const T* m : items) {
        if (m == item) return i;
        ++i;
    }
    return -1;
}

void CheckLookups(Ndm_Block* b, int n) {
    // Exact: the first "dup" (not "Dup"), case-insensitive: "Dup", which comes first.
    EXPECT_EQ(IndexOf(b->GetBlockItr(), b->GetBlockByName("dup")), n + 1);
    EXPECT_EQ(IndexOf(b->GetSignalItr(), b->GetSignalByName("dup")), n + 1);
    EXPECT_EQ(IndexOf(b->GetPinItr(), b->GetPinByName("dup")), n + 1);
    EXPECT_EQ(IndexOf(b->GetBlockItr(), b->GetBlockByIName("DUP")), n);
    EXPECT_EQ(IndexOf(b->GetSignalItr(), b->GetSignalByIName("dUp")), n);
    EXPECT_EQ(IndexOf(b->GetPinItr(), b->GetPinByIName("dup")), n);
    EXPECT_EQ(b->GetBlockByName("DUP"), nullptr);
    EXPECT_EQ(b->GetSignalByName("never-seen-name"), nullptr);
    EXPECT_EQ(b->GetPinByIName("NEVER-SEEN-NAME"), nullptr);
    EXPECT_EQ(b->GetBlockByName(nullptr), nullptr);
    for (int i = 0; i < n; ++i) {
        std::string name = "m" + std::to_string(i);
        std::string upper = "M" + std::to_string(i);
        EXPECT_EQ(IndexOf(b->GetBlockItr(), b->GetBlockByName(name.c_str())), i);
        EXPECT_EQ(IndexOf(b->GetSignalItr(), b->GetSignalByIName(upper.c_str())), i);
        EXPECT_EQ(IndexOf(b->GetPinItr(), b->GetPinByIName(upper.c_str())), i);
    }
}

TEST(DesignDatabase, LookupsFindTheFirstInStoredOrderInSmallAndLargeBlocks) {
    Tree t;
    Ndm_Block* small = t.top->CreateBlock("small");
    Populate(small, 2);  // 5 members of each kind: searched directly
    CheckLookups(small, 2);
    Ndm_Block* large = t.top->CreateBlock("large");
    Populate(large, 40);  // hashed
    CheckLookups(large, 40);

    // Members added after the index exists are found, without displacing earlier ones.
    large->CreateSignal("late");
    large->CreateSignal("LATE");
    large->CreateSignal("m3");
    EXPECT_EQ(large->GetSignalByName("late"), large->GetSignalItr()[large->GetNumSignals() - 3]);
    EXPECT_EQ(large->GetSignalByIName("Late"), large->GetSignalItr()[large->GetNumSignals() - 3]);
    EXPECT_EQ(large->GetSignalByName("LATE"), large->GetSignalItr()[large->GetNumSignals() - 2]);
    EXPECT_EQ(IndexOf(large->GetSignalItr(), large->GetSignalByName("m3")), 3);
}

TEST(DesignDatabase, FullNames) {
    Tree t;
    Ndm_Block* a = t.top->CreateBlock("a");
    Ndm_Block* b = a->CreateBlock("b");
    EXPECT_EQ(t.top->GetFullName(), "");
    EXPECT_EQ(a->GetFullName(), "a");
    EXPECT_EQ(b->GetFullName(), "a/b");
    EXPECT_EQ(t.top->CreateSignal("clk")->GetFullName(), "clk");
    EXPECT_EQ(b->CreateSignal("n[1]")->GetFullName(), "a/b/n[1]");
    EXPECT_EQ(t.top->CreatePin("clk", Ndm_Dir::Input)->GetFullName(), "clk");
    EXPECT_EQ(b->CreatePin("D")->GetFullName(), "a/b.D");
    // Deep hierarchies are named completely.
    Ndm_Block* deep = t.top;
    std::string expect;
    for (int i = 0; i < 300; ++i) {
        deep = deep->CreateBlock("x");
        expect += i ? "/x" : "x";
    }
    EXPECT_EQ(deep->GetFullName(), expect);
}

TEST(DesignDatabase, PropertiesReplaceInPlaceAndListsKeepDuplicates) {
    Tree t;
    t.top->CreatePropertyInt32("a", 1);
    t.top->CreatePropertyString("b", "x");
    t.top->CreatePropertyBool("c");
    Ndm_Property* replaced = t.top->CreatePropertyFloat64("b", 2.5);
    ASSERT_EQ(t.top->GetNumProperties(), 3);
    EXPECT_EQ(t.top->GetPropertyItr()[1], replaced);
    EXPECT_EQ(replaced->GetType(), NDM_PROP_FLOAT64);
    EXPECT_EQ(t.top->GetPropertyByName("b")->GetFloat64(), 2.5);
    EXPECT_EQ(replaced->GetValueString(), nullptr);  // neutral value for another type
    EXPECT_EQ(replaced->GetInt32(), 0);

    Ndm_Property* list = t.top->CreatePropertyList("TIMING");
    Ndm_Property* first = list->CreatePropertyString("OFFSET", "IN 2 ns");
    list->CreatePropertyString("OFFSET", "OUT 3 ns");
    EXPECT_EQ(list->GetNumEntries(), 2);
    EXPECT_EQ(list->GetEntryByName("OFFSET"), first);
    EXPECT_EQ(first->GetOwner(), t.top);
    EXPECT_TRUE(list->DeleteEntry(first));
    EXPECT_STREQ(list->GetEntryByName("OFFSET")->GetValueString(), "OUT 3 ns");
    EXPECT_EQ(t.top->CreatePropertyInt32("x", 1)->CreatePropertyInt32("y", 2), nullptr);

    // Long lists answer from a hash index, which must keep "first of that name" through
    // additions and deletions.
    Ndm_Property* big = t.top->CreatePropertyList("BIG");
    std::vector<Ndm_Property*> firsts;
    for (int i = 0; i < 40; ++i) firsts.push_back(big->CreatePropertyString(("e" + std::to_string(i % 20)).c_str(), "v"));
    EXPECT_EQ(big->GetEntryByName("e7"), firsts[7]);
    Ndm_Property* late = big->CreatePropertyString("late", "v");
    EXPECT_EQ(big->GetEntryByName("late"), late);
    EXPECT_TRUE(big->DeleteEntry(firsts[7]));
    EXPECT_EQ(big->GetEntryByName("e7"), firsts[27]);
    EXPECT_EQ(big->GetEntryByName("nosuch"), nullptr);
    t.top->DeleteProperty("BIG");

    EXPECT_TRUE(t.top->DeleteProperty("a"));
    EXPECT_FALSE(t.top->DeleteProperty("a"));
    EXPECT_EQ(t.top->GetNumProperties(), 4);  // b, c, TIMING, x
    EXPECT_STREQ(t.top->GetPropertyItr()[0]->GetName(), "b");
}

// Equal string lists are one value shared between objects; changing one object's list, or
// growing it past the shared length, never shows on another. Setters keep a property's type.
TEST(DesignDatabase, SharedValuesNeverLeakBetweenObjects) {
    Tree t;
    std::vector<Ndm_Property*> lists;
    Ndm_Block* u1 = t.top->CreateBlock("u1");
    for (Ndm_PropertyHolder* holder : {static_cast<Ndm_PropertyHolder*>(t.top), static_cast<Ndm_PropertyHolder*>(u1),
                                       static_cast<Ndm_PropertyHolder*>(u1->CreatePin("A"))}) {
        Ndm_Property* list = holder->CreatePropertyStringList("FROM_UCF");
        list->AddString("TNM");
        list->AddString(nullptr);
        lists.push_back(list);
    }
    EXPECT_EQ(&lists[0]->GetStrings(), &lists[1]->GetStrings());  // one value for equal lists
    lists[1]->AddString("LOC");
    const std::vector<std::string> two = {"TNM", ""}, three = {"TNM", "", "LOC"};
    EXPECT_EQ(lists[0]->GetStrings(), two);
    EXPECT_EQ(lists[1]->GetStrings(), three);
    std::vector<std::string> expect = two;
    for (int i = 0; i < 40; ++i) {  // past the shared length, the list is the property's own
        const std::string text = "T" + std::to_string(i % 3);
        lists[2]->AddString(text.c_str());
        expect.push_back(text);
        if (i == 20) lists[0]->AddString("T0");
    }
    EXPECT_EQ(lists[2]->GetStrings(), expect);
    EXPECT_EQ(lists[0]->GetStrings(), (std::vector<std::string>{"TNM", "", "T0"}));
    EXPECT_EQ(lists[1]->GetStrings(), three);

    Ndm_Property* text = t.top->CreatePropertyString("LOC", "P1");
    text->SetInt32(7);
    text->SetFloat64(1.5);
    text->SetBool(true);
    EXPECT_STREQ(text->GetValueString(), "P1");
    text->SetValueString(nullptr);
    EXPECT_STREQ(text->GetValueString(), "");
    Ndm_Property* number = t.top->CreatePropertyInt32("N", 3);
    number->SetValueString("x");
    number->AddString("x");
    EXPECT_EQ(number->GetInt32(), 3);
    EXPECT_TRUE(number->GetStrings().empty());
}

// Property storage is shared by every design of the process: designs made, used and dropped
// in turn must each read back exactly their own names and values, wherever the texts sit among
// the design's names (past the first megabyte, or a text too long to share a chunk).
TEST(DesignDatabase, PropertiesOfDesignsAliveTogetherStayApart) {
    const std::string huge(300000, 'h');
    const std::string long_name = "A_PROPERTY_NAME_LONGER_THAN_SIXTEEN";
    auto fill = [&](Tree& t, int tag) {
        for (int i = 0; i < 40000; ++i)  // over a megabyte of names before the later values
            t.top->CreateSignal(("a_rather_long_signal_name_" + std::to_string(i) + "_" + std::to_string(tag)).c_str());
        for (int i = 0; i < 50; ++i) {
            Ndm_Block* b = t.top->CreateBlock(("u" + std::to_string(i)).c_str());
            b->CreatePropertyString("LOC", ("SITE_" + std::to_string(tag) + "_" + std::to_string(i)).c_str());
            b->CreatePropertyFloat64(long_name.c_str(), tag + i / 4.0);
            Ndm_Property* list = b->CreatePropertyList("TIMING");
            list->CreatePropertyString("OFFSET", std::to_string(tag).c_str());
            list->CreatePropertyInt32("N", tag * 100 + i);
        }
        t.top->CreatePropertyString("HUGE", (huge + std::to_string(tag)).c_str());
    };
    auto check = [&](Tree& t, int tag) {
        for (int i = 0; i < 50; ++i) {
            Ndm_Block* b = t.top->GetBlockByName(("u" + std::to_string(i)).c_str());
            ASSERT_NE(b, nullptr);
            EXPECT_EQ(b->GetPropertyByName("LOC")->GetValueString(), "SITE_" + std::to_string(tag) + "_" + std::to_string(i));
            EXPECT_EQ(b->GetPropertyByName(long_name.c_str())->GetFloat64(), tag + i / 4.0);
            Ndm_Property* list = b->GetPropertyByName("TIMING");
            ASSERT_EQ(list->GetNumEntries(), 2);
            EXPECT_EQ(list->GetListItr()[0]->GetValueString(), std::to_string(tag));
            EXPECT_EQ(list->GetListItr()[1]->GetInt32(), tag * 100 + i);
            EXPECT_EQ(list->GetListItr()[1]->GetOwner(), b);
        }
        EXPECT_EQ(t.top->GetPropertyByName("HUGE")->GetValueString(), huge + std::to_string(tag));
    };
    auto first = std::make_unique<Tree>();
    auto second = std::make_unique<Tree>();
    fill(*first, 1);
    fill(*second, 2);
    check(*first, 1);
    first.reset();  // its cells, handles and text chunks go back to be reused
    Tree third;
    fill(third, 3);
    check(*second, 2);
    check(third, 3);
    for (int i = 0; i < 50; i += 2) third.top->GetBlockByName(("u" + std::to_string(i)).c_str())->DeleteAllProperties();
    second.reset();
    EXPECT_EQ(third.top->GetBlockByName("u0")->GetNumProperties(), 0);
    EXPECT_STREQ(third.top->GetBlockByName("u1")->GetPropertyByName("LOC")->GetValueString(), "SITE_3_1");
}

TEST(DesignDatabase, NetworksAreNamedAfterTheHighestSignal) {
    Tree t;
    Ndm_Block* a = t.top->CreateBlock("a");
    Ndm_Block* b = a->CreateBlock("b");
    Ndm_Signal* deep = b->CreateSignal("x");
    Ndm_Signal* mid = a->CreateSignal("y");
    Ndm_Signal* mid2 = a->CreateSignal("z");
    Ndm_Signal* high = t.top->CreateSignal("w");
    Ndm_Network* net = t.view->CreateNetwork();
    net->AddSignal(deep);
    EXPECT_STREQ(net->GetName(), "a/b/x");
    net->AddSignal(mid);
    EXPECT_STREQ(net->GetName(), "a/y");
    net->AddSignal(mid2);  // same depth: the first stays the top signal
    EXPECT_STREQ(net->GetName(), "a/y");
    net->AddSignal(high);
    EXPECT_STREQ(net->GetName(), "w");
    EXPECT_EQ(net->GetTopSignal(), high);
    net->AddSignal(high);  // already in a network: ignored
    EXPECT_EQ(net->GetNumSignals(), 4);
    // Members keep the order they were added in.
    EXPECT_EQ(net->GetFirstSignal(), deep);
    EXPECT_EQ(deep->GetNextInNetwork(), mid);
    EXPECT_EQ(high->GetNextInNetwork(), nullptr);
    Ndm_Pin* pin = b->CreatePin("P");
    pin->SetSignal(mid);
    EXPECT_EQ(pin->GetNetwork(), net);
}

TEST(DesignDatabase, DeleteBlockRemovesTheSubtreeFromLookupsAndNetworks) {
    Tree t;
    for (int i = 0; i < 12; ++i) t.top->CreateBlock(i == 5 ? "dup" : ("b" + std::to_string(i)).c_str());
    Ndm_Block* second_dup = t.top->CreateBlock("dup");
    Ndm_Block* victim = t.top->GetBlockByName("dup");
    ASSERT_NE(victim, second_dup);
    Ndm_Block* inner = victim->CreateBlock("inner");
    Ndm_Signal* s1 = inner->CreateSignal("s1");
    Ndm_Signal* s2 = second_dup->CreateSignal("s2");
    Ndm_Signal* s3 = victim->CreateSignal("s3");
    Ndm_Network* shared = t.view->CreateNetwork();
    shared->AddSignal(s3);
    shared->AddSignal(s1);
    shared->AddSignal(s2);
    Ndm_Network* doomed = t.view->CreateNetwork();
    doomed->AddSignal(inner->CreateSignal("only"));
    ASSERT_STREQ(shared->GetName(), "dup/s3");

    EXPECT_FALSE(t.top->DeleteBlock(inner));  // not a child of top
    EXPECT_TRUE(t.top->DeleteBlock(victim));
    EXPECT_FALSE(t.top->DeleteBlock(victim));
    EXPECT_EQ(t.top->GetNumBlocks(), 12);
    EXPECT_EQ(t.top->GetBlockByName("dup"), second_dup);
    EXPECT_EQ(t.top->GetBlockByIName("DUP"), second_dup);
    EXPECT_EQ(shared->GetNumSignals(), 1);
    EXPECT_EQ(shared->GetFirstSignal(), s2);
    EXPECT_STREQ(shared->GetName(), "dup/s2");
    EXPECT_EQ(s1->GetNetwork(), nullptr);
    ASSERT_EQ(t.view->GetNumNetworks(), 1);  // the emptied network is gone
    EXPECT_EQ(t.view->GetNetworkItr()[0], shared);
    // New children are indexed as before.
    Ndm_Block* fresh = t.top->CreateBlock("dup2");
    EXPECT_EQ(t.top->GetBlockByName("dup2"), fresh);
}

// Properties are linked one to the next and the last to their object: every edit at the front,
// in the middle and at the end must keep the order, the owner and the list entries right.
TEST(DesignDatabase, PropertyEditsKeepOrderAndOwnerAnywhereInTheList) {
    Tree t;
    Ndm_Block* cell = t.top->CreateBlock("u");
    const std::vector<Ndm_PropertyHolder*> holders = {&t.design, t.view, t.top, cell, cell->CreatePin("A"),
                                                      t.top->CreateSignal("s"), t.view->CreateNetwork()};
    struct Step {
        const char* op;  // "+name" creates or replaces, "-name" deletes
        const char* expect;
    };
    const std::vector<Step> steps = {
        {"+a", "a"},        {"+b", "a b"},      {"+c", "a b c"},    {"+a", "a b c"},  {"+b", "a b c"},
        {"+c", "a b c"},    {"-b", "a c"},      {"+d", "a c d"},    {"-a", "c d"},    {"-d", "c"},
        {"-c", ""},         {"+e", "e"},        {"-x", "e"},
    };
    for (Ndm_PropertyHolder* h : holders) {
        int made = 0;
        for (const Step& step : steps) {
            const std::string name = step.op + 1;
            if (step.op[0] == '+')
                h->CreatePropertyInt32(name.c_str(), ++made);
            else
                EXPECT_EQ(h->DeleteProperty(name.c_str()), name != "x");
            std::string names;
            for (Ndm_Property* p : h->GetPropertyItr()) {
                names += (names.empty() ? "" : " ") + std::string(p->GetName());
                EXPECT_EQ(p->GetOwner(), h) << step.op;
                EXPECT_EQ(h->GetPropertyByName(p->GetName()), p);
            }
            EXPECT_EQ(names, step.expect) << h->GetName() << " after " << step.op;
            EXPECT_EQ(h->GetNumProperties(), static_cast<int>(h->GetPropertyItr().size()));
        }
        EXPECT_EQ(h->GetPropertyByName("e")->GetInt32(), made);
    }

    // A list of one entry, grown to two, shrunk to none and grown again.
    Ndm_Property* list = cell->CreatePropertyList("L");
    Ndm_Property* one = list->CreatePropertyString("A", "1");
    EXPECT_EQ(list->GetNumEntries(), 1);
    EXPECT_EQ(list->GetEntryByName("A"), one);
    EXPECT_FALSE(list->DeleteEntry(cell->GetPropertyByName("e")));
    Ndm_Property* two = list->CreatePropertyString("B", "2");
    ASSERT_EQ(list->GetNumEntries(), 2);
    EXPECT_EQ(list->GetListItr()[0], one);
    EXPECT_EQ(two->GetOwner(), cell);
    EXPECT_TRUE(list->DeleteEntry(one));
    EXPECT_TRUE(list->DeleteEntry(two));
    EXPECT_EQ(list->GetNumEntries(), 0);
    Ndm_Property* again = list->CreatePropertyString("C", "3");
    EXPECT_EQ(list->GetEntryByName("C"), again);
    Ndm_Property* deep = list->CreatePropertyList("IN")->CreatePropertyList("IN2")->CreatePropertyFloat64("D", 0.5);
    EXPECT_EQ(deep->GetOwner(), cell);  // an entry of a list in a list in a list
    EXPECT_EQ(deep->GetFloat64(), 0.5);
    Ndm_Property* single = cell->CreatePropertyList("S");
    EXPECT_TRUE(single->DeleteEntry(single->CreatePropertyBool("X")));
    EXPECT_EQ(single->GetNumEntries(), 0);
    EXPECT_EQ(single->GetEntryByName("X"), nullptr);
}

// Signals and pins live in chunks of their block: members made one at a time past a
// reservation, and a reservation made when the block already has some, keep stored order, their
// block and their lookups, also when blocks grow in turn.
TEST(DesignDatabase, MembersMadePastTheirReservationKeepOrderAndBlock) {
    Tree t;
    const std::vector<int> reserves = {0, 1, 3, 40};
    std::vector<Ndm_Block*> blocks;
    std::vector<std::vector<Ndm_Signal*>> all_signals(reserves.size());
    std::vector<std::vector<Ndm_Pin*>> all_pins(reserves.size());
    for (int reserve : reserves) {
        blocks.push_back(t.top->CreateBlock(("b" + std::to_string(reserve)).c_str()));
        blocks.back()->Reserve(0, reserve, reserve);
    }
    for (int i = 0; i < 30; ++i)
        for (size_t k = 0; k < blocks.size(); ++k) {
            if (i == 7) blocks[k]->Reserve(0, 5, 5);
            const std::string name = "m" + std::to_string(i);
            all_signals[k].push_back(blocks[k]->CreateSignal(name.c_str()));
            if (k % 2 == 0) all_signals[k].push_back(blocks[k]->CreateSignal((name + "x").c_str()));
            all_pins[k].push_back(blocks[k]->CreatePin(name.c_str()));
        }
    for (size_t k = 0; k < blocks.size(); ++k) {
        Ndm_Block* b = blocks[k];
        const std::vector<Ndm_Signal*>& signals = all_signals[k];
        const std::vector<Ndm_Pin*>& pins = all_pins[k];
        ASSERT_EQ(b->GetNumSignals(), k % 2 ? 30 : 60);
        ASSERT_EQ(b->GetNumPins(), 30);
        int i = 0;
        for (Ndm_Signal* s : b->GetSignalItr()) {
            EXPECT_EQ(s, signals[i]);
            EXPECT_EQ(b->GetSignalItr()[i], s);
            EXPECT_EQ(s->GetBlock(), b);
            EXPECT_EQ(s->GetOrder(), static_cast<uint32_t>(i));
            EXPECT_EQ(b->GetSignalByName(s->GetName()), s);
            ++i;
        }
        i = 0;
        for (Ndm_Pin* p : b->GetPinItr()) {
            EXPECT_EQ(p, pins[i]);
            EXPECT_EQ(b->GetPinItr()[i], p);
            EXPECT_EQ(p->GetBlock(), b);
            EXPECT_EQ(b->GetPinByIName(("M" + std::to_string(i)).c_str()), p);
            ++i;
        }
        std::vector<Ndm_Signal*> prefixed;
        b->GetSignalsByPrefix("m2", false, prefixed);
        ASSERT_EQ(prefixed.size(), k % 2 ? 11u : 22u);  // m2, m20..m29 (and m2x...) in stored order
        EXPECT_EQ(prefixed.front(), signals[k % 2 ? 2 : 4]);
        EXPECT_EQ(prefixed.back(), signals.back());
    }
}

// A network keeps its signals in a ring: deleting a subtree that holds its first, a middle or
// its last signal leaves the others in their order.
TEST(DesignDatabase, DeletedSignalsLeaveTheirNetworksInOrder) {
    for (int doomed = 0; doomed < 3; ++doomed) {
        Tree t;
        std::vector<Ndm_Block*> blocks;
        Ndm_Network* net = t.view->CreateNetwork();
        for (int i = 0; i < 3; ++i) {
            blocks.push_back(t.top->CreateBlock(("u" + std::to_string(i)).c_str()));
            net->AddSignal(blocks.back()->CreateSignal("s"));
        }
        ASSERT_TRUE(t.top->DeleteBlock(blocks[doomed]));
        std::string order;
        for (Ndm_Signal* s = net->GetFirstSignal(); s; s = s->GetNextInNetwork()) order += s->GetBlock()->GetName();
        const std::vector<std::string> expect = {"u1u2", "u0u2", "u0u1"};
        EXPECT_EQ(order, expect[doomed]);
        EXPECT_EQ(net->GetNumSignals(), 2);
        Ndm_Signal* later = blocks[doomed == 2 ? 0 : 2]->CreateSignal("t");
        net->AddSignal(later);
        EXPECT_EQ(net->GetNumSignals(), 3);
        Ndm_Signal* last = net->GetFirstSignal();
        while (last->GetNextInNetwork()) last = last->GetNextInNetwork();
        EXPECT_EQ(last, later);
    }
}

TEST(DesignDatabase, ViewsAndStats) {
    Tree t;
    EXPECT_EQ(t.design.CreateView("EXPANDED"), t.view);
    EXPECT_EQ(t.design.GetViewByName("OTHER"), nullptr);
    EXPECT_EQ(t.view->CreateTopBlock("again"), t.top);
    t.top->CreateBlock("a")->CreatePin("p");
    t.top->CreateSignal("s");
    Ndm_Design::Stats s = t.design.GetStats();
    EXPECT_EQ(s.blocks, 2u);
    EXPECT_EQ(s.signals, 1u);
    EXPECT_EQ(s.pins, 1u);
    EXPECT_EQ(t.design.FindInterned("a"), t.design.Intern("a"));
    EXPECT_EQ(t.design.FindInterned("no-such-text"), nullptr);
}

}  // namespace
