// Pathological designs: hierarchies and property lists tens of thousands of levels deep, and
// netlists that double at every level. Nothing may recurse once per level, grow with the
// square of the depth, or expand before it has been counted.
#include <gtest/gtest.h>

#include <functional>
#include <ostream>
#include <streambuf>

#include "design_test_util.h"
#include "host/design/design_io.h"
#include "host/design/dump.h"
#include "host/design/native_format.h"
#include "host/design/yosys_reader.h"
#include "host/port/msgman.h"
#include "support/chain_netlist.h"
#include "support/test_support.h"

namespace {

using design_test::ReadAll;
using design_test::TempDir;

// A native design file whose top block "t" nests `levels` blocks "b", with a signal each.
std::string NestedBlocks(int levels) {
    std::string text = R"({"format":"lun-design","version":1,"name":"d","views":[{"name":"EXPANDED","top":{"name":"t")";
    for (int i = 0; i < levels; ++i) text += R"(,"blocks":[{"name":"b","signals":[{"name":"s"}])";
    for (int i = 0; i < levels; ++i) text += "}]";
    return text + "}}]}\n";
}

// A native design file whose design holds a list property nesting `levels` lists.
std::string NestedLists(int levels) {
    std::string text = R"({"format":"lun-design","version":1,"name":"d","properties":[)";
    for (int i = 0; i < levels; ++i) text += R"({"name":"p","type":"list","value":[)";
    text += R"({"name":"leaf","type":"int32","value":7})";
    for (int i = 0; i < levels; ++i) text += "]}";
    return text + "]}\n";
}

// Levels below the top block down its first children, and levels of lists down the design's
// first property.
int Depth(const Ndm_Design& design) {
    int depth = 0;
    if (Ndm_View* view = design.GetWorkView())
        for (const Ndm_Block* b = view->GetBlock(); b->GetNumBlocks(); b = b->GetBlockItr()[0]) ++depth;
    if (design.GetNumProperties())
        for (const Ndm_Property* p = design.GetPropertyItr()[0]; p->GetNumEntries(); p = p->GetListItr()[0]) ++depth;
    return depth;
}

// Counts what is written to it.
class CountingBuf : public std::streambuf {
public:
    size_t count = 0;

protected:
    std::streamsize xsputn(const char*, std::streamsize n) override {
        count += static_cast<size_t>(n);
        return n;
    }
    int_type overflow(int_type c) override {
        ++count;
        return traits_type::not_eof(c);
    }
};

// The chain netlist reached 60,000 levels, the native files 45,000 nested blocks and 40,000
// nested lists before their readers overflowed the main thread's 8 MB stack; here a thread of
// 128 KB stands in for it, which the old readers, writer, dump, deletion and destructors, at a
// few dozen bytes a level, overflow at a sixth of those depths.
TEST(DeepDesigns, ReadWriteDumpAndDeleteKeepTheirOwnStacks) {
    constexpr int kLevels = 10000;
    struct Case {
        const char* name;
        std::function<std::string(int)> text;
    };
    const Case cases[] = {
        {"chain.json", [](int levels) { return lun_test::ChainNetlist(levels); }},
        {"blocks.qdf", NestedBlocks},
        {"lists.qdf", NestedLists},
    };
    TempDir dir;
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        const std::string deep = dir.Write(c.name, c.text(kLevels));
        const std::string first = dir.File("first.qdf"), second = dir.File("second.qdf");
        bool ran = false;
        ASSERT_TRUE(design_test::OnSmallStack(128 << 10, [&] {
            Port_MsgCapture capture;
            auto design = Ndm_LoadDesign(deep.c_str(), nullptr);
            ASSERT_TRUE(design);
            EXPECT_EQ(Depth(*design), kLevels);
            // A design we wrote reads back as it was.
            ASSERT_TRUE(Ndm_WriteNative(*design, first.c_str()));
            auto again = Ndm_ReadNative(first.c_str());
            ASSERT_TRUE(again);
            ASSERT_TRUE(Ndm_WriteNative(*again, second.c_str()));
            EXPECT_EQ(ReadAll(first), ReadAll(second));
            {  // and so it does when read in pieces, where every level is a large block
                design_test::PieceSize size(64);
                auto pieces = Ndm_ReadNative(first.c_str());
                ASSERT_TRUE(pieces);
                ASSERT_TRUE(Ndm_WriteNative(*pieces, second.c_str()));
                EXPECT_EQ(ReadAll(first), ReadAll(second));
            }
            // Below some depth lines stop growing: a few kilobytes a level at most.
            CountingBuf counted;
            std::ostream out(&counted);
            Ndm_Dump(*again, out);
            EXPECT_GT(counted.count, static_cast<size_t>(kLevels));
            EXPECT_LT(counted.count, static_cast<size_t>(kLevels) * 4000);
            // Deleting the whole hierarchy below the top takes its signals out of the networks.
            Ndm_View* view = again->GetWorkView();
            if (view && view->GetBlock()->GetNumBlocks()) {
                ASSERT_TRUE(view->GetBlock()->DeleteBlock(view->GetBlock()->GetBlockItr()[0]));
                for (const Ndm_Network* net : view->GetNetworkItr())
                    EXPECT_EQ(net->GetTopSignal()->GetBlock(), view->GetBlock());
            }
            EXPECT_TRUE(capture.Texts(Port_Severity::Error).empty());
            ran = true;
        }));  // the designs, deep property lists included, are destroyed on the small stack too
        EXPECT_TRUE(ran);
    }
}

// A network is named after its top signal: a name is made when asked for, not stored for every
// network, so the design, its file and its dump grow with the depth, not its square.
TEST(DeepDesigns, SizesGrowLinearlyWithDepth) {
    TempDir dir;
    struct Size {
        size_t name_bytes, file_bytes, dump_bytes;
    };
    auto measure = [&](int levels) {
        const std::string path = dir.Write("chain.json", lun_test::ChainNetlist(levels));
        auto design = Ndm_LoadDesign(path.c_str(), nullptr);
        EXPECT_TRUE(design);
        if (!design) return Size{0, 0, 0};
        const size_t name_bytes = design->GetStats().name_bytes;
        const std::string saved = dir.File("chain.qdf");
        EXPECT_TRUE(Ndm_WriteNative(*design, saved.c_str()));
        // The deepest net is still named by its full path.
        const Ndm_Block* deepest = design->GetWorkView()->GetBlock();
        while (deepest->GetBlockByName("u")) deepest = deepest->GetBlockByName("u");
        EXPECT_EQ(deepest->GetSignalByName("w")->GetNetwork()->GetName(), deepest->GetFullName() + "/w");
        CountingBuf counted;
        std::ostream out(&counted);
        Ndm_Dump(*design, out);
        return Size{name_bytes, ReadAll(saved).size(), counted.count};
    };
    const Size once = measure(3000), twice = measure(6000);
    EXPECT_LT(twice.name_bytes, once.name_bytes * 2.2);
    EXPECT_LT(twice.file_bytes, once.file_bytes * 2.2);
    EXPECT_LT(twice.dump_bytes, once.dump_bytes * 2.2);
}

// Netlists are counted before they are expanded, against the instance limit and the counts
// one design holds.
TEST(DeepDesigns, ExpansionIsCountedBeforeAnythingIsMade) {
    TempDir dir;
    struct Case {
        const char* name;
        std::string text;
        uint64_t max_cells;      // 0: the default
        const char* env;         // LUN_MAX_CELLS, or null
        const char* error;       // expected error ('@' for the path), or null for a design
        const char* warning;     // expected warning, or null
    };
    const Case cases[] = {
        {"doubling.json", lun_test::ChainNetlist(40, true), 0, nullptr,
         "Netlist '@' expands to 1649267441663 instances below top module 'm0', more than the limit of 100000000. "
         "Raise the limit (LUN_MAX_CELLS, or quillmap --max-cells) if the machine has the memory for that many.",
         nullptr},
        {"over.json", lun_test::ChainNetlist(10), 10, nullptr,
         "Netlist '@' expands to 11 instances below top module 'm0', more than the limit of 10.", nullptr},
        {"at.json", lun_test::ChainNetlist(10), 11, nullptr, nullptr, nullptr},
        {"env.json", lun_test::ChainNetlist(10), 0, "10", "more than the limit of 10.", nullptr},
        {"given.json", lun_test::ChainNetlist(10), 11, "10", nullptr, nullptr},
        {"badenv.json", lun_test::ChainNetlist(10), 0, "many", nullptr,
         "LUN_MAX_CELLS is 'many', not a positive number of instances; the limit stays 100000000."},
        {"bits.json", lun_test::ChainNetlist(26, true, 64), 1000000000000, nullptr,
         "Netlist '@' expands to 4630511547 bits below top module 'm0', more than the 2147483647 one design can "
         "hold.",
         nullptr},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        const std::string path = dir.Write(c.name, c.text);
        lun_test::ScopedEnv env("LUN_MAX_CELLS", c.env);
        Port_MsgCapture capture;
        auto design = Ndm_LoadDesign(path.c_str(), nullptr, c.max_cells);
        std::vector<std::string> errors = capture.Texts(Port_Severity::Error);
        if (c.error) {
            EXPECT_FALSE(design);
            std::string expect = c.error;
            if (size_t at = expect.find('@'); at != std::string::npos) expect.replace(at, 1, path);
            ASSERT_EQ(errors.size(), 1u);
            EXPECT_NE(errors[0].find(expect), std::string::npos) << errors[0];
        } else {
            EXPECT_TRUE(design);
            EXPECT_TRUE(errors.empty());
        }
        EXPECT_EQ(capture.Texts(Port_Severity::Warning),
                  c.warning ? std::vector<std::string>{c.warning} : std::vector<std::string>{});
    }
}

}  // namespace
