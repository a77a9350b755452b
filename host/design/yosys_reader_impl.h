// The Yosys netlist reader's own types (internal to host/design): the modules as read, and
// the reader that parses them (yosys_reader.cpp) and builds the design (yosys_netlist.cpp).
#pragma once

#include <simdjson.h>

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <type_traits>
#include <unordered_map>
#include <utility>
#include <vector>

#include "host/design/json_chunks.h"
#include "host/design/json_input.h"
#include "host/design/name_pool.h"
#include "host/design/ndm.h"
#include "host/design/waiting_names.h"

namespace ndm_yosys {

namespace od = simdjson::ondemand;
using simdjson::error_code;

using Ndm_JsonInput::Msg;

// Constant bits are stored as negative numbers.
constexpr int32_t kConst0 = -1;
constexpr int32_t kConst1 = -2;
constexpr int32_t kConstX = -3;
constexpr int32_t kConstZ = -4;

// A run of bits in Module::bits.
struct Range {
    uint32_t first = 0;
    uint32_t count = 0;
};

struct Port {
    const char* name;
    Ndm_Dir dir = Ndm_Dir::None;
    bool upto = false;
    int32_t offset = 0;
    Range bits;
};

struct Net {
    const char* name;
    bool upto = false;
    int32_t offset = 0;
    Range bits;
};

struct Conn {  // its direction is in Module::conn_dirs, which keeps a connection at 16 bytes
    const char* name;
    Range bits;
};

// The names of one kind of object (ports, cells or nets) of the module being read, for telling
// a second object of a name. A name new to the design cannot name a second object: it is only
// noted, and the set is made when a name the design knew comes. A flat netlist's million cell
// names then cost no lookup in a set that large.
class SeenNames {
public:
    // False when the module has an object of this kind and name already; the name is noted.
    bool Add(const char* name, bool new_to_design) {
        if (new_to_design) {
            noted_.push_back(name);
            return true;
        }
        if (!noted_.empty()) Settle();
        if (set_.Find(name)) return false;
        set_.InsertIfAbsent(name, const_cast<char*>(name));
        return true;
    }
    void Reserve(size_t names) { noted_.reserve(names); }
    void Clear() {
        set_.Clear();
        noted_.clear();
    }
    // Gives back all memory (the reader is done with modules).
    void Release() {
        set_ = Ndm_PtrMap();
        noted_ = std::vector<const char*>();
    }

private:
    void Settle();
    Ndm_PtrMap set_;
    std::vector<const char*> noted_;
};

struct Cell {
    const char* name;
    const char* type = nullptr;
    uint32_t first_conn = 0;
    uint32_t num_conns = 0;
    int32_t sub = -1;  // module the cell instantiates, or -1 for a leaf
};

// A list in blocks of 65,536 entries (the last one growing as a vector), whose entries never move
// and whose blocks before an index can be given back while the rest is still read: the cells and
// connections of a module made once are let go as its expansion passes them.
template <class T>
class Blocks {
public:
    static constexpr size_t kShift = 16, kBlock = size_t{1} << kShift;
    size_t size() const { return size_; }
    T& operator[](size_t i) { return blocks_[i >> kShift][i & (kBlock - 1)]; }
    const T& operator[](size_t i) const { return blocks_[i >> kShift][i & (kBlock - 1)]; }
    void push_back(const T& value) {
        if (blocks_.empty() || blocks_.back().size() == kBlock) {
            blocks_.emplace_back();
            if (blocks_.size() > 1) blocks_.back().reserve(kBlock);
        }
        blocks_.back().push_back(value);
        ++size_;
    }
    // Gives back the blocks wholly before entry i (which are not read again).
    void DropBefore(size_t i) {
        for (size_t b = 0; b < (i >> kShift) && b < blocks_.size(); ++b) std::vector<T>().swap(blocks_[b]);
    }
    void shrink_to_fit() {
        if (!blocks_.empty()) blocks_.back().shrink_to_fit();
    }
    void clear() {
        blocks_.clear();
        size_ = 0;
    }

    class Iterator {
    public:
        Iterator(Blocks* list, size_t i) : list_(list), i_(i) {}
        T& operator*() const { return (*list_)[i_]; }
        Iterator& operator++() {
            ++i_;
            return *this;
        }
        bool operator!=(const Iterator& other) const { return i_ != other.i_; }

    private:
        Blocks* list_;
        size_t i_;
    };
    Iterator begin() { return Iterator(this, 0); }
    Iterator end() { return Iterator(this, size_); }

private:
    std::vector<std::vector<T>> blocks_;
    size_t size_ = 0;
};

// What expanding one instance of a module makes, its whole subtree counted; each count stops
// at kMany rather than wrap (a netlist can double its size at every level).
struct Expansion {
    static constexpr uint64_t kMany = uint64_t{1} << 62;
    uint64_t blocks = 0;   // blocks below the instance's own
    uint64_t bits = 0;     // bit ids, the instance's own included
    uint64_t signals = 0;
    uint64_t pins = 0;
    static uint64_t Add(uint64_t a, uint64_t b) { return a >= kMany - b ? kMany : a + b; }
};

// One module as read from the file; names are interned in the design.
struct Module {
    const char* name = "";
    size_t offset = 0;  // byte offset of the module in the file, for messages
    bool top_attr = false;
    bool box = false;  // a blackbox or whitebox library cell: its instances stay leaves
    std::vector<Port> ports;
    std::vector<Net> nets;
    Blocks<Cell> cells;
    Blocks<Conn> conns;
    Blocks<Ndm_Dir> conn_dirs;  // per connection: its direction, None when not given
    uint64_t instances = 0;          // how many the expansion makes: its cells go with the last
    std::vector<int32_t> bits;  // local bit ids 0..num_bits-1 once finished, constants < 0
    int64_t max_bit = -1;
    uint32_t num_bits = 0;
    uint32_t num_signals = 0;
    std::vector<uint32_t> net_first_signal;  // per netname: index of its first signal
    std::vector<int32_t> signal_bit;         // per signal: local bit id, or -1 for a constant
    std::vector<int32_t> bit_signal;         // per local bit id: first signal carrying it, or -1
    std::vector<uint32_t> signal_order;      // signals in the order they join networks
    std::vector<uint8_t> port_kind;          // top module, per signal: 1 port bit, 2 input/inout port bit
    std::vector<uint8_t> pad_only;           // top module: port bits that get a network of their own
    Ndm_PtrMap port_index;                   // port name -> index + 1
    int state = 0;                           // for the instantiation cycle check
    bool instantiated = false;
    Expansion below;                         // what one instance makes, itself included
};

// Describes the value being read, for messages; built only when a message is issued.
class What {
public:
    template <class F>
        requires std::is_invocable_r_v<std::string, const F&>
    What(const F& f)  // NOLINT: implicit on purpose
        : obj_(&f), call_([](const void* o) { return std::string((*static_cast<const F*>(o))()); }) {}
    What(const char* text)  // NOLINT
        : obj_(text), call_([](const void* o) { return std::string(static_cast<const char*>(o)); }) {}
    std::string operator()() const { return call_(obj_); }

private:
    const void* obj_;
    std::string (*call_)(const void*);
};

struct Instance {
    Ndm_Block* block;
    uint32_t module;
    uint32_t base;  // global id of local bit 0
};

inline std::string_view StripEscape(std::string_view name) {
    if (!name.empty() && name.front() == '\\') name.remove_prefix(1);
    return name;
}

inline void* AsValue(size_t index) { return reinterpret_cast<void*>(index + 1); }
inline size_t FromValue(void* value) { return reinterpret_cast<uintptr_t>(value) - 1; }

class Reader {
public:
    Reader(const char* path, Ndm_Design& design, uint64_t max_cells)
        : path_(path), design_(design), max_cells_(max_cells) {}

    bool Load();
    bool Build(const char* top_module);

private:
    // ---- messages ----
    bool Error(const std::string& text) {
        if (!settling_ && !waiting_.empty()) SettleAll();
        if (in_body_ && body_second_) return false;  // about a second object's body: left out
        Msg().issueError("%s", text.c_str());
        return false;
    }
    size_t Where() { return pieces_ ? pieces_->Offset() : Ndm_JsonInput::Offset(doc_, buf_); }
    bool AtEnd() { return doc_.current_location().error() == simdjson::OUT_OF_BOUNDS; }
    // A simdjson error while reading `what`: a syntax error, or a value of the wrong kind.
    bool JsonError(error_code e, const std::string& what) {
        if (Ndm_JsonInput::IsSyntaxError(e)) return SyntaxError(e, Where());
        return ShapeError(what);
    }
    bool SyntaxError(error_code e, size_t offset) {
        return Error(Port_Format("'%s' is not valid JSON: %s at byte %zu.", path_,
                                 Ndm_JsonInput::SyntaxReason(e), offset));
    }
    bool ShapeError(const std::string& what) {
        return Error(Port_Format("'%s' is not a Yosys JSON netlist: %s (at byte %zu).", path_,
                                 what.c_str(), Where()));
    }
    std::string InModule() const { return Port_Format(" in module '%s'", module_name_); }

    // ---- parsing ----
    bool Key(od::field& field, std::string_view& out);
    bool KeyText(od::raw_json_string key, std::string_view& out);
    bool String(od::value value, std::string_view& out, const What& what);
    bool Int(od::value value, int64_t& out, const What& what);
    bool Bits(od::value value, Module& m, Range& range, const What& what);
    bool Direction(od::value value, Ndm_Dir& dir, const What& what);
    class Pieces;  // reads a large file in pieces (yosys_reader.cpp)
    bool ParseRoot();
    bool Parsed();  // the checks once the whole file is read
    bool SeeModules();
    bool Modules(od::value value);
    bool ModuleWhole(od::raw_json_string key, od::value value);
    bool BeginModule(od::raw_json_string key, bool& skip);
    void EndModule();
    bool ModuleMember(od::raw_json_string key, od::value value);  // of module_
    bool ParseAttributes(od::value value, Module& m);
    bool ParsePorts(od::value value, Module& m);
    void ExpectMembers(int seen, size_t members);
    bool PortName(Module& m, od::raw_json_string key, const char*& name);
    bool NetBody(od::value value, Module& m, Net& net);
    bool PortMember(Module& m, od::raw_json_string name_key, od::value value);
    bool ParseCells(od::value value, Module& m);
    bool CellMember(Module& m, od::raw_json_string name_key, od::value value);
    bool ParseCell(od::object object, Module& m, Cell& cell);
    bool ParseNets(od::value value, Module& m);
    bool NetMember(Module& m, od::raw_json_string name_key, od::value value);
    bool NameOk(std::string_view name, const Module* m, const char* kind, bool may_be_empty = false);
    bool FirstOfName(SeenNames& seen, const char* name, bool new_to_design, const Module& m, const char* kind,
                     size_t where);
    // Cell and net names wait from their keys until a few objects later to be interned, so that
    // the slot each takes in the name set has come into the cache meanwhile. A message first
    // settles every waiting name, so that a second object of a name is reported before anything
    // after its key; the body of one found while it is read is left out with its messages. (The
    // netlist is refused for a second object anyway.)
    struct Waiting {
        int seen = 0;       // which of seen_
        size_t where = 0;   // byte of the key, for the message about a second object
        size_t object = 0;  // the cell's or net's index in the module being read, or kNoObject
    };
    static constexpr size_t kNoObject = SIZE_MAX;
    using WaitingName = Ndm_WaitingNames<Waiting>::Name;
    // Starts reading an object of the module being read: text is its name (valid while the
    // object waits), null after an error when it is left out for its name; false for a
    // malformed key.
    bool BeginName(od::raw_json_string key, int seen, const char*& text);
    // After its body: false when the object is a second one of its name (left out). Else name is
    // the interned name, or the waiting text: then the object's index, once kept, goes to Keep.
    bool EndBody(const char*& name);
    void Keep(size_t object);
    void SettleOldest();
    void SettleAll();
    Ndm_WaitingNames<Waiting> waiting_;
    bool settling_ = false;            // a message about a waiting name is being given
    bool in_body_ = false;             // an object's body is read
    WaitingName* body_ = nullptr;      // the name of the object read last, until settled
    bool body_second_ = false;         // its name has been settled as a second one
    const char* body_name_ = nullptr;  // its interned name, once settled
    bool FirstConnection(const Module& m, const Cell& cell, const char* name);
    void Finish(Module& m);

    // ---- building ----
    bool ResolveTypes();
    void BoxDirections(Module& m, const Cell& cell, Module& box);
    bool ChooseTop(const char* top_module, uint32_t& top);
    bool CheckCycles(uint32_t top);
    void CountInstances(uint32_t top);
    void Count(Module& m);
    bool CheckSize(uint32_t top);
    const Port* FindPort(Module& m, const char* name);
    // The interned name of bit i of a port or net: the name itself for a single bit at 0, else
    // "name[index]". PinName keeps those of ports, which every cell of a type repeats.
    const char* BitName(const char* name, uint32_t width, int32_t offset, bool upto, uint32_t i);
    const char* PinName(const char* name, uint32_t width, int32_t offset, bool upto, uint32_t i);
    uint32_t Alloc(uint32_t count);
    uint32_t Find(uint32_t id);
    void Union(uint32_t a, uint32_t b);
    bool Expand(Ndm_Block* block, uint32_t module);
    void FetchSignalsOf(const Module& m, const Cell& cell);
    bool ExpandCell(Ndm_Block* child, Module& m, const Cell& cell);
    void TopPins(Ndm_Block* block, uint32_t module);
    void Networks(Ndm_View* view);
    void PadBoundary(Module& m);
    void SignalOrder(Module& m);

    const char* path_;
    Ndm_Design& design_;
    uint64_t max_cells_;
    Ndm_JsonInput::Input buf_;
    od::parser parser_;
    od::document doc_;
    std::string scratch_;
    std::span<const char* const> BitNames(const char* name, uint32_t width, int32_t offset, bool upto);
    std::vector<const char*> bit_names_;  // what BitNames gave last, and its texts before interning
    std::string bit_text_;                // (BitName's text too)
    std::vector<size_t> bit_ends_;
    std::vector<std::string_view> bit_views_;
    struct PinNames {
        uint32_t width;
        int32_t offset;
        bool upto;
        std::vector<const char*> names;
    };
    std::vector<PinNames> pin_names_;
    Ndm_PtrMap pin_names_of_;  // port name -> its first entry in pin_names_, plus one
    const char* module_name_ = "";
    enum { kSeenPorts, kSeenCells, kSeenNets };
    SeenNames seen_[3];      // names of the ports, cells and netnames of the module being read
    Ndm_PtrMap seen_conns_;  // names of the connections of a cell with many
    size_t bad_names_ = 0;  // objects left out for their names

    Ndm_JsonChunks::Reader* pieces_ = nullptr;  // while a large file is read in pieces
    bool seen_modules_ = false;
    Module module_;  // the module being read
    std::vector<Module> modules_;
    Ndm_PtrMap module_index_;  // module name -> index + 1
    std::vector<std::pair<const char*, Ndm_Dir>> dirs_;  // port_directions of the current cell
    std::vector<uint32_t> parent_;                        // union-find over global bit ids
    std::vector<Instance> instances_;                     // expanded blocks in preorder
    std::vector<uint32_t> postorder_;                     // modules below the top, children first
};

}  // namespace ndm_yosys
