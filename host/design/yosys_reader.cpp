#include "host/design/yosys_reader.h"

#include <simdjson.h>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <numeric>
#include <type_traits>
#include <unordered_map>
#include <string>
#include <vector>

#include "host/design/json_input.h"
#include "host/design/name_pool.h"
#include "host/port/msgman.h"

namespace {

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

struct Conn {
    const char* name;
    Ndm_Dir dir = Ndm_Dir::None;
    Range bits;
};

struct Cell {
    const char* name;
    const char* type = nullptr;
    uint32_t first_conn = 0;
    uint32_t num_conns = 0;
    int32_t sub = -1;  // module the cell instantiates, or -1 for a leaf
};

// One module as read from the file; names are interned in the design.
struct Module {
    const char* name = "";
    size_t offset = 0;  // byte offset of the module in the file, for messages
    bool top_attr = false;
    bool box = false;  // a blackbox or whitebox library cell: its instances stay leaves
    std::vector<Port> ports;
    std::vector<Net> nets;
    std::vector<Cell> cells;
    std::vector<Conn> conns;
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

std::string_view StripEscape(std::string_view name) {
    if (!name.empty() && name.front() == '\\') name.remove_prefix(1);
    return name;
}

void* AsValue(size_t index) { return reinterpret_cast<void*>(index + 1); }
size_t FromValue(void* value) { return reinterpret_cast<uintptr_t>(value) - 1; }

class Reader {
public:
    Reader(const char* path, Ndm_Design& design) : path_(path), design_(design) {}

    bool Load();
    bool Build(const char* top_module);

private:
    // ---- messages ----
    bool Error(const std::string& text) {
        Msg().issueError("%s", text.c_str());
        return false;
    }
    size_t Where() { return Ndm_JsonInput::Offset(doc_, buf_); }
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
    bool String(od::value value, std::string_view& out, const What& what);
    bool Int(od::value value, int64_t& out, const What& what);
    bool Bits(od::value value, Module& m, Range& range, const What& what);
    bool Direction(od::value value, Ndm_Dir& dir, const What& what);
    bool ParseRoot();
    bool ParseModule(od::object object, Module& m);
    bool ParseAttributes(od::value value, Module& m);
    bool ParsePorts(od::value value, Module& m);
    bool ParseCells(od::value value, Module& m);
    bool ParseCell(od::object object, Module& m, Cell& cell);
    bool ParseNets(od::value value, Module& m);
    void Finish(Module& m);

    // ---- building ----
    bool ResolveTypes();
    void BoxDirections(Module& m, const Cell& cell, Module& box);
    bool ChooseTop(const char* top_module, uint32_t& top);
    bool CheckCycles(uint32_t module, std::vector<uint32_t>& stack);
    const Port* FindPort(Module& m, const char* name);
    const char* BitName(const char* name, uint32_t width, int32_t offset, bool upto, uint32_t i);
    uint32_t Alloc(uint32_t count);
    uint32_t Find(uint32_t id);
    void Union(uint32_t a, uint32_t b);
    bool Expand(Ndm_Block* block, uint32_t module, uint32_t base);
    void TopPins(Ndm_Block* block, uint32_t module);
    void Networks(Ndm_View* view);
    void PadBoundary(Module& m);
    void SignalOrder(Module& m);

    const char* path_;
    Ndm_Design& design_;
    Ndm_JsonInput::Input buf_;
    od::parser parser_;
    od::document doc_;
    std::string scratch_;
    std::string name_buf_;
    const char* module_name_ = "";

    std::vector<Module> modules_;
    Ndm_PtrMap module_index_;  // module name -> index + 1
    std::vector<std::pair<const char*, Ndm_Dir>> dirs_;  // port_directions of the current cell
    std::vector<uint32_t> parent_;                        // union-find over global bit ids
    std::vector<Instance> instances_;                     // expanded blocks in preorder
};

// ---------------------------------------------------------------------------------------
// Parsing

bool Reader::Key(od::field& field, std::string_view& out) {
    if (!Ndm_JsonInput::Text(field.key(), scratch_, out))
        return SyntaxError(simdjson::STRING_ERROR, Where());
    return true;
}

bool Reader::String(od::value value, std::string_view& out, const What& what) {
    od::raw_json_string raw;
    if (error_code e = value.get_raw_json_string().get(raw)) return JsonError(e, what() + " must be a string");
    if (!Ndm_JsonInput::Text(raw, scratch_, out)) return SyntaxError(simdjson::STRING_ERROR, Where());
    return true;
}

bool Reader::Int(od::value value, int64_t& out, const What& what) {
    if (error_code e = value.get_int64().get(out)) return JsonError(e, what() + " must be an integer");
    return true;
}

bool Reader::Direction(od::value value, Ndm_Dir& dir, const What& what) {
    std::string_view text;
    if (!String(value, text, what)) return false;
    if (!Ndm_DirFromName(text, dir)) return ShapeError(what() + " must be \"input\", \"output\" or \"inout\"");
    return true;
}

bool Reader::Bits(od::value value, Module& m, Range& range, const What& what) {
    od::array array;
    if (error_code e = value.get_array().get(array))
        return JsonError(e, what() + " must be an array of bits");
    range.first = static_cast<uint32_t>(m.bits.size());
    for (auto item : array) {
        od::value bit;
        od::json_type type;
        if (error_code e = std::move(item).get(bit)) return JsonError(e, what() + " must be an array of bits");
        if (error_code e = bit.type().get(type)) return JsonError(e, what() + " must be an array of bits");
        if (type == od::json_type::number) {
            int64_t n;
            if (error_code e = bit.get_int64().get(n)) return JsonError(e, what() + " holds a bad bit number");
            if (n < 0 || n > INT32_MAX) return ShapeError(what() + " holds a bad bit number");
            m.bits.push_back(static_cast<int32_t>(n));
            if (n > m.max_bit) m.max_bit = n;
        } else if (type == od::json_type::string) {
            std::string_view text;
            if (!String(bit, text, what)) return false;
            int32_t c = text == "0" ? kConst0 : text == "1" ? kConst1 : text == "x" ? kConstX
                      : text == "z" ? kConstZ : 0;
            if (!c) return ShapeError(what() + " holds a constant other than \"0\", \"1\", \"x\", \"z\"");
            m.bits.push_back(c);
        } else {
            return ShapeError(what() + " must hold bit numbers and constants");
        }
    }
    range.count = static_cast<uint32_t>(m.bits.size() - range.first);
    return true;
}

bool Reader::Load() {
    std::string why;
    if (!buf_.Open(path_, why))
        return Error(Port_Format("Cannot read netlist file '%s': %s.", path_, why.c_str()));
    if (error_code e = parser_.iterate(buf_.view()).get(doc_))
        return SyntaxError(e, Ndm_JsonInput::EarlyErrorOffset(e, buf_));
    return ParseRoot();
}

bool Reader::ParseRoot() {
    od::object root;
    od::json_type type;
    if (error_code e = doc_.type().get(type)) return SyntaxError(e, Where());
    if (error_code e = doc_.get_object().get(root)) {
        if (Ndm_JsonInput::IsSyntaxError(e)) return SyntaxError(e, Where());
        return Error(Port_Format("'%s' is not a Yosys JSON netlist: the file does not hold a JSON object.",
                                 path_));
    }
    bool seen_modules = false;
    for (auto item : root) {
        od::field field;
        if (error_code e = std::move(item).get(field)) return JsonError(e, "bad member");
        if (field.key() != "modules") continue;
        if (seen_modules) return ShapeError("\"modules\" appears twice");
        seen_modules = true;
        od::object modules;
        if (error_code e = field.value().get_object().get(modules))
            return JsonError(e, "\"modules\" must be an object");
        for (auto mitem : modules) {
            od::field mfield;
            if (error_code e = std::move(mitem).get(mfield)) return JsonError(e, "bad module");
            std::string_view name;
            if (!Key(mfield, name)) return false;
            Module m;
            m.name = design_.Intern(StripEscape(name));
            m.offset = Where();
            module_name_ = m.name;
            if (module_index_.Find(m.name)) return ShapeError(Port_Format("module '%s' is defined twice", m.name));
            od::object object;
            if (error_code e = mfield.value().get_object().get(object))
                return JsonError(e, Port_Format("module '%s' must be an object", m.name));
            if (!ParseModule(object, m)) return false;
            Finish(m);
            module_index_.InsertIfAbsent(m.name, AsValue(modules_.size()));
            modules_.push_back(std::move(m));
        }
    }
    if (!AtEnd()) return SyntaxError(simdjson::TRAILING_CONTENT, Where());
    if (!seen_modules)
        return Error(Port_Format("'%s' is not a Yosys JSON netlist: it has no \"modules\" object.", path_));
    if (modules_.empty()) return Error(Port_Format("Netlist '%s' holds no module.", path_));
    return true;
}

bool Reader::ParseModule(od::object object, Module& m) {
    for (auto item : object) {
        od::field field;
        if (error_code e = std::move(item).get(field)) return JsonError(e, "bad member" + InModule());
        od::raw_json_string key = field.key();
        bool ok = true;
        if (key == "attributes")
            ok = ParseAttributes(field.value(), m);
        else if (key == "ports")
            ok = ParsePorts(field.value(), m);
        else if (key == "cells")
            ok = ParseCells(field.value(), m);
        else if (key == "netnames")
            ok = ParseNets(field.value(), m);
        if (!ok) return false;
    }
    return true;
}

bool Reader::ParseAttributes(od::value value, Module& m) {
    od::object object;
    if (error_code e = value.get_object().get(object))
        return JsonError(e, "\"attributes\"" + InModule() + " must be an object");
    for (auto item : object) {
        od::field field;
        if (error_code e = std::move(item).get(field)) return JsonError(e, "bad attribute" + InModule());
        od::raw_json_string key = field.key();
        bool* flag = key == "top" ? &m.top_attr
                   : key == "blackbox" || key == "whitebox" || key == "lib_whitebox" ? &m.box
                                                                                      : nullptr;
        if (!flag) continue;
        od::json_type type;
        if (error_code e = field.value().type().get(type)) return JsonError(e, "bad attribute" + InModule());
        if (type == od::json_type::number) {
            int64_t n;
            if (!Int(field.value(), n, [&] { return "attribute value" + InModule(); })) return false;
            *flag = n != 0;
        } else if (type == od::json_type::string) {
            // Yosys writes constant attribute values as binary digit strings.
            std::string_view text;
            if (!String(field.value(), text, "attribute value")) return false;
            *flag = text.find_first_not_of("01") == std::string_view::npos &&
                    text.find('1') != std::string_view::npos;
        }
    }
    return true;
}

bool Reader::ParsePorts(od::value value, Module& m) {
    od::object object;
    if (error_code e = value.get_object().get(object))
        return JsonError(e, "\"ports\"" + InModule() + " must be an object");
    for (auto item : object) {
        od::field field;
        if (error_code e = std::move(item).get(field)) return JsonError(e, "bad port" + InModule());
        std::string_view name;
        if (!Key(field, name)) return false;
        Port port;
        port.name = design_.Intern(StripEscape(name));
        auto what = [&] { return Port_Format("port '%s' in module '%s'", port.name, m.name); };
        od::object body;
        if (error_code e = field.value().get_object().get(body)) return JsonError(e, what() + " must be an object");
        bool has_bits = false;
        for (auto pitem : body) {
            od::field pfield;
            if (error_code e = std::move(pitem).get(pfield)) return JsonError(e, "bad member of " + what());
            od::raw_json_string key = pfield.key();
            if (key == "direction") {
                if (!Direction(pfield.value(), port.dir, [&] { return "\"direction\" of " + what(); })) return false;
            } else if (key == "bits") {
                if (!Bits(pfield.value(), m, port.bits, [&] { return "\"bits\" of " + what(); })) return false;
                has_bits = true;
            } else if (key == "offset") {
                int64_t n;
                if (!Int(pfield.value(), n, [&] { return "\"offset\" of " + what(); })) return false;
                port.offset = static_cast<int32_t>(n);
            } else if (key == "upto") {
                int64_t n;
                if (!Int(pfield.value(), n, [&] { return "\"upto\" of " + what(); })) return false;
                port.upto = n != 0;
            }
        }
        if (!has_bits) return ShapeError(what() + " has no \"bits\"");
        m.ports.push_back(port);
    }
    return true;
}

bool Reader::ParseCells(od::value value, Module& m) {
    od::object object;
    if (error_code e = value.get_object().get(object))
        return JsonError(e, "\"cells\"" + InModule() + " must be an object");
    for (auto item : object) {
        od::field field;
        if (error_code e = std::move(item).get(field)) return JsonError(e, "bad cell" + InModule());
        std::string_view name;
        if (!Key(field, name)) return false;
        Cell cell;
        cell.name = design_.Intern(StripEscape(name));
        od::object body;
        if (error_code e = field.value().get_object().get(body))
            return JsonError(e, Port_Format("cell '%s' in module '%s' must be an object", cell.name, m.name));
        if (!ParseCell(body, m, cell)) return false;
        m.cells.push_back(cell);
    }
    return true;
}

bool Reader::ParseCell(od::object object, Module& m, Cell& cell) {
    auto what = [&] { return Port_Format("cell '%s' in module '%s'", cell.name, m.name); };
    dirs_.clear();
    cell.first_conn = static_cast<uint32_t>(m.conns.size());
    for (auto item : object) {
        od::field field;
        if (error_code e = std::move(item).get(field)) return JsonError(e, "bad member of " + what());
        od::raw_json_string key = field.key();
        if (key == "type") {
            std::string_view type;
            if (!String(field.value(), type, [&] { return "\"type\" of " + what(); })) return false;
            cell.type = design_.Intern(StripEscape(type));
        } else if (key == "port_directions") {
            od::object dirs;
            if (error_code e = field.value().get_object().get(dirs))
                return JsonError(e, "\"port_directions\" of " + what() + " must be an object");
            for (auto ditem : dirs) {
                od::field dfield;
                if (error_code e = std::move(ditem).get(dfield)) return JsonError(e, "bad port direction of " + what());
                std::string_view pname;
                if (!Key(dfield, pname)) return false;
                const char* port = design_.Intern(StripEscape(pname));
                Ndm_Dir dir;
                if (!Direction(dfield.value(), dir, [&] { return Port_Format("direction of port '%s' of ", port) + what(); }))
                    return false;
                dirs_.emplace_back(port, dir);
            }
        } else if (key == "connections") {
            od::object conns;
            if (error_code e = field.value().get_object().get(conns))
                return JsonError(e, "\"connections\" of " + what() + " must be an object");
            for (auto citem : conns) {
                od::field cfield;
                if (error_code e = std::move(citem).get(cfield)) return JsonError(e, "bad connection of " + what());
                std::string_view pname;
                if (!Key(cfield, pname)) return false;
                Conn conn;
                conn.name = design_.Intern(StripEscape(pname));
                if (!Bits(cfield.value(), m, conn.bits,
                          [&] { return Port_Format("connection '%s' of ", conn.name) + what(); }))
                    return false;
                m.conns.push_back(conn);
            }
        }
    }
    if (!cell.type) return ShapeError(what() + " has no \"type\"");
    cell.num_conns = static_cast<uint32_t>(m.conns.size() - cell.first_conn);
    // Directions usually come in the order of the connections; search only when they do not.
    for (uint32_t k = 0; k < cell.num_conns; ++k) {
        Conn& conn = m.conns[cell.first_conn + k];
        if (k < dirs_.size() && dirs_[k].first == conn.name) {
            conn.dir = dirs_[k].second;
            continue;
        }
        for (const auto& d : dirs_) {
            if (d.first == conn.name) {
                conn.dir = d.second;
                break;
            }
        }
    }
    return true;
}

bool Reader::ParseNets(od::value value, Module& m) {
    od::object object;
    if (error_code e = value.get_object().get(object))
        return JsonError(e, "\"netnames\"" + InModule() + " must be an object");
    for (auto item : object) {
        od::field field;
        if (error_code e = std::move(item).get(field)) return JsonError(e, "bad netname" + InModule());
        std::string_view name;
        if (!Key(field, name)) return false;
        Net net;
        net.name = design_.Intern(StripEscape(name));
        od::object body;
        if (error_code e = field.value().get_object().get(body))
            return JsonError(e, Port_Format("netname '%s' in module '%s' must be an object", net.name, m.name));
        bool has_bits = false;
        for (auto nitem : body) {
            od::field nfield;
            if (error_code e = std::move(nitem).get(nfield)) return JsonError(e, "bad member of netname" + InModule());
            od::raw_json_string key = nfield.key();
            if (key == "bits") {
                if (!Bits(nfield.value(), m, net.bits, [&] {
                        return Port_Format("\"bits\" of netname '%s' in module '%s'", net.name, m.name);
                    }))
                    return false;
                has_bits = true;
            } else if (key == "offset" || key == "upto") {
                bool is_offset = key == "offset";
                int64_t n;
                if (!Int(nfield.value(), n, [&] {
                        return Port_Format("\"%s\" of netname '%s' in module '%s'", is_offset ? "offset" : "upto",
                                           net.name, m.name);
                    }))
                    return false;
                if (is_offset)
                    net.offset = static_cast<int32_t>(n);
                else
                    net.upto = n != 0;
            }
        }
        if (!has_bits)
            return ShapeError(Port_Format("netname '%s' in module '%s' has no \"bits\"", net.name, m.name));
        m.nets.push_back(net);
    }
    return true;
}

// Makes the bit ids of a module dense and derives the per-bit and per-signal tables.
void Reader::Finish(Module& m) {
    if (m.max_bit + 1 <= static_cast<int64_t>(2 * m.bits.size() + 1024)) {
        m.num_bits = static_cast<uint32_t>(m.max_bit + 1);
    } else {
        // Sparse numbering (not what Yosys writes, but legal): renumber 0..n-1.
        std::vector<int32_t> ids;
        for (int32_t b : m.bits)
            if (b >= 0) ids.push_back(b);
        std::sort(ids.begin(), ids.end());
        ids.erase(std::unique(ids.begin(), ids.end()), ids.end());
        for (int32_t& b : m.bits)
            if (b >= 0) b = static_cast<int32_t>(std::lower_bound(ids.begin(), ids.end(), b) - ids.begin());
        m.num_bits = static_cast<uint32_t>(ids.size());
    }
    m.num_signals = 0;
    for (const Net& net : m.nets) m.num_signals += net.bits.count;
    m.net_first_signal.resize(m.nets.size());
    m.signal_bit.resize(m.num_signals);
    m.bit_signal.assign(m.num_bits, -1);
    uint32_t s = 0;
    for (size_t n = 0; n < m.nets.size(); ++n) {
        const Net& net = m.nets[n];
        m.net_first_signal[n] = s;
        for (uint32_t i = 0; i < net.bits.count; ++i, ++s) {
            int32_t bit = m.bits[net.bits.first + i];
            m.signal_bit[s] = bit >= 0 ? bit : -1;
            if (bit >= 0 && m.bit_signal[bit] < 0) m.bit_signal[bit] = static_cast<int32_t>(s);
        }
    }
    m.bits.shrink_to_fit();
    m.conns.shrink_to_fit();
    m.cells.shrink_to_fit();
}

// ---------------------------------------------------------------------------------------
// Building

bool Reader::ResolveTypes() {
    for (Module& m : modules_) {
        for (Cell& cell : m.cells) {
            if (void* v = module_index_.Find(cell.type)) {
                Module& sub = modules_[FromValue(v)];
                sub.instantiated = true;
                if (!sub.box)
                    cell.sub = static_cast<int32_t>(FromValue(v));
                else
                    BoxDirections(m, cell, sub);
            }
        }
    }
    return true;
}

// Connections of a library cell without port_directions take them from its module.
void Reader::BoxDirections(Module& m, const Cell& cell, Module& box) {
    for (uint32_t k = 0; k < cell.num_conns; ++k) {
        Conn& conn = m.conns[cell.first_conn + k];
        if (conn.dir != Ndm_Dir::None) continue;
        if (const Port* port = FindPort(box, conn.name)) conn.dir = port->dir;
    }
}

std::string NameList(const std::vector<const char*>& names) {
    std::string out;
    for (size_t i = 0; i < names.size() && i < 5; ++i) {
        if (i) out += ", ";
        out += '\'';
        out += names[i];
        out += '\'';
    }
    if (names.size() > 5) out += ", ...";
    return out;
}

bool Reader::ChooseTop(const char* top_module, uint32_t& top) {
    if (top_module) {
        const char* name = design_.FindInterned(StripEscape(top_module));
        void* v = name ? module_index_.Find(name) : nullptr;
        if (!v) return Error(Port_Format("Top module '%s' not found in '%s'.", top_module, path_));
        top = static_cast<uint32_t>(FromValue(v));
        return true;
    }
    std::vector<const char*> marked, free;
    uint32_t marked_index = 0, free_index = 0;
    for (uint32_t i = 0; i < modules_.size(); ++i) {
        if (modules_[i].top_attr) {
            marked.push_back(modules_[i].name);
            marked_index = i;
        }
        if (!modules_[i].instantiated && !modules_[i].box) {
            free.push_back(modules_[i].name);
            free_index = i;
        }
    }
    if (marked.size() == 1) {
        top = marked_index;
        return true;
    }
    if (marked.size() > 1)
        return Error(Port_Format("Cannot tell the top module of '%s': modules %s all carry the \"top\" "
                                 "attribute. Name the top module.",
                                 path_, NameList(marked).c_str()));
    if (free.size() == 1) {
        top = free_index;
        return true;
    }
    if (free.empty())
        return Error(Port_Format("Cannot tell the top module of '%s': every module is instantiated by "
                                 "another. Name the top module.",
                                 path_));
    return Error(Port_Format("Cannot tell the top module of '%s': modules %s are not instantiated by any "
                             "other module. Name the top module.",
                             path_, NameList(free).c_str()));
}

bool Reader::CheckCycles(uint32_t module, std::vector<uint32_t>& stack) {
    Module& m = modules_[module];
    if (m.state == 2) return true;
    stack.push_back(module);
    if (m.state == 1) {
        auto first = std::find(stack.begin(), stack.end(), module);
        std::string chain;
        for (auto it = first; it != stack.end(); ++it) {
            if (!chain.empty()) chain += " -> ";
            chain += modules_[*it].name;
        }
        return Error(Port_Format("Module '%s' in '%s' instantiates itself: %s.", m.name, path_, chain.c_str()));
    }
    m.state = 1;
    for (const Cell& cell : m.cells)
        if (cell.sub >= 0 && !CheckCycles(static_cast<uint32_t>(cell.sub), stack)) return false;
    m.state = 2;
    stack.pop_back();
    return true;
}

const Port* Reader::FindPort(Module& m, const char* name) {
    if (m.ports.size() <= 8) {
        for (const Port& p : m.ports)
            if (p.name == name) return &p;
        return nullptr;
    }
    if (!m.port_index.Find(m.ports.front().name))
        for (size_t i = 0; i < m.ports.size(); ++i) m.port_index.InsertIfAbsent(m.ports[i].name, AsValue(i));
    void* v = m.port_index.Find(name);
    return v ? &m.ports[FromValue(v)] : nullptr;
}

// Name of bit i of a vector: the plain name for a single bit at index 0, else name[index]
// where bit 0 is the least significant and index counts from offset (downwards when upto).
const char* Reader::BitName(const char* name, uint32_t width, int32_t offset, bool upto, uint32_t i) {
    if (width == 1 && offset == 0) return name;
    int64_t index = upto ? int64_t{offset} + width - 1 - i : int64_t{offset} + i;
    name_buf_.assign(name);
    name_buf_ += '[';
    name_buf_ += std::to_string(index);
    name_buf_ += ']';
    return name_buf_.c_str();
}

uint32_t Reader::Alloc(uint32_t count) {
    uint32_t base = static_cast<uint32_t>(parent_.size());
    parent_.resize(parent_.size() + count);
    std::iota(parent_.begin() + base, parent_.end(), base);
    return base;
}

uint32_t Reader::Find(uint32_t id) {
    while (parent_[id] != id) {
        parent_[id] = parent_[parent_[id]];
        id = parent_[id];
    }
    return id;
}

void Reader::Union(uint32_t a, uint32_t b) {
    a = Find(a);
    b = Find(b);
    if (a == b) return;
    // The smaller id (the earlier instance) stays the root.
    if (a < b)
        parent_[b] = a;
    else
        parent_[a] = b;
}

bool Reader::Expand(Ndm_Block* block, uint32_t module, uint32_t base) {
    Module& m = modules_[module];
    instances_.push_back({block, module, base});
    block->Reserve(m.cells.size(), m.num_signals, 0);
    for (const Net& net : m.nets)
        for (uint32_t i = 0; i < net.bits.count; ++i)
            block->CreateSignal(BitName(net.name, net.bits.count, net.offset, net.upto, i));
    std::span<Ndm_Signal* const> signals = block->GetSignalItr();

    for (const Cell& cell : m.cells) {
        Ndm_Block* child = block->CreateBlock(cell.name);
        child->SetTypeName(cell.type);
        Module* sub = cell.sub >= 0 ? &modules_[cell.sub] : nullptr;
        uint32_t num_pins = 0;
        for (uint32_t k = 0; k < cell.num_conns; ++k) num_pins += m.conns[cell.first_conn + k].bits.count;
        child->Reserve(0, 0, num_pins);
        for (uint32_t k = 0; k < cell.num_conns; ++k) {
            const Conn& conn = m.conns[cell.first_conn + k];
            const Port* port = nullptr;
            if (sub && !(port = FindPort(*sub, conn.name)))
                return Error(Port_Format("Cell '%s' in module '%s' of '%s' connects port '%s', which module "
                                         "'%s' does not have.",
                                         cell.name, m.name, path_, conn.name, sub->name));
            Ndm_Dir dir = port ? port->dir : conn.dir;
            for (uint32_t i = 0; i < conn.bits.count; ++i) {
                const char* name = port ? BitName(conn.name, conn.bits.count, port->offset, port->upto, i)
                                        : BitName(conn.name, conn.bits.count, 0, false, i);
                Ndm_Pin* pin = child->CreatePin(name, dir);
                int32_t bit = m.bits[conn.bits.first + i];
                if (bit >= 0 && m.bit_signal[bit] >= 0) pin->SetSignal(signals[m.bit_signal[bit]]);
            }
        }
        if (!sub) continue;
        uint32_t child_base = Alloc(sub->num_bits);
        if (!Expand(child, static_cast<uint32_t>(cell.sub), child_base)) return false;
        for (uint32_t k = 0; k < cell.num_conns; ++k) {
            const Conn& conn = m.conns[cell.first_conn + k];
            const Port* port = FindPort(*sub, conn.name);
            uint32_t width = std::min(conn.bits.count, port->bits.count);
            for (uint32_t i = 0; i < width; ++i) {
                int32_t outer = m.bits[conn.bits.first + i];
                int32_t inner = sub->bits[port->bits.first + i];
                if (outer >= 0 && inner >= 0)
                    Union(base + static_cast<uint32_t>(outer), child_base + static_cast<uint32_t>(inner));
            }
        }
    }
    return true;
}

// Pins of the top block: one per port bit, on the port's own netname when it has one.
void Reader::TopPins(Ndm_Block* block, uint32_t module) {
    Module& m = modules_[module];
    std::span<Ndm_Signal* const> signals = block->GetSignalItr();
    Ndm_PtrMap net_index;
    for (size_t n = 0; n < m.nets.size(); ++n) net_index.InsertIfAbsent(m.nets[n].name, AsValue(n));
    size_t num_pins = 0;
    for (const Port& port : m.ports) num_pins += port.bits.count;
    block->Reserve(0, 0, num_pins);
    for (const Port& port : m.ports) {
        void* v = net_index.Find(port.name);
        const Net* net = v ? &m.nets[FromValue(v)] : nullptr;
        bool same = net && net->bits.count == port.bits.count;
        for (uint32_t i = 0; i < port.bits.count; ++i) {
            Ndm_Pin* pin = block->CreatePin(BitName(port.name, port.bits.count, port.offset, port.upto, i), port.dir);
            int32_t bit = m.bits[port.bits.first + i];
            if (same)
                pin->SetSignal(signals[m.net_first_signal[FromValue(v)] + i]);
            else if (bit >= 0 && m.bit_signal[bit] >= 0)
                pin->SetSignal(signals[m.bit_signal[bit]]);
        }
    }
}

// One network per connected set of bits carrying at least one signal; blocks join in preorder.
// Within a block, the bits of port names join first, then other public names, then generated
// ("$...") names: the first of the top-most signals to join names the network, so a net that
// reaches a port is named after the port.
//
// Top-level port bits that share a local bit with another port bit get networks of their own
// (see PadBoundary). So do port bits joined to another one only through a submodule (a wire
// from an input port to an output port inside a cell), the first input bit keeping the net:
// there the split port's network takes every name of its local bit in the top module.
void Reader::Networks(Ndm_View* view) {
    constexpr uint32_t kNone = UINT32_MAX;
    std::vector<uint32_t> network_of_root(parent_.size(), kNone);
    std::unordered_map<uint32_t, uint32_t> keeper;     // net (root) -> the top port signal keeping it
    std::unordered_map<int32_t, uint32_t> split_bits;  // top local bit -> its network, kNone before
    for (const Instance& inst : instances_) {
        Module& m = modules_[inst.module];
        if (m.signal_order.size() != m.num_signals) SignalOrder(m);
        std::span<Ndm_Signal* const> signals = inst.block->GetSignalItr();
        const bool top = &inst == &instances_.front() && !m.pad_only.empty();
        if (top) {
            auto root_of = [&](uint32_t s) { return Find(inst.base + static_cast<uint32_t>(m.signal_bit[s])); };
            for (uint32_t s : m.signal_order) {
                if (!m.port_kind[s] || m.pad_only[s] || m.signal_bit[s] < 0) continue;
                auto [it, fresh] = keeper.try_emplace(root_of(s), s);
                if (!fresh && m.port_kind[it->second] == 1 && m.port_kind[s] == 2) it->second = s;
            }
            for (uint32_t s : m.signal_order)
                if (m.port_kind[s] && !m.pad_only[s] && m.signal_bit[s] >= 0 && keeper[root_of(s)] != s)
                    split_bits.emplace(m.signal_bit[s], kNone);
        }
        for (uint32_t s : m.signal_order) {
            int32_t bit = m.signal_bit[s];
            if (bit < 0) continue;
            if (top && m.pad_only[s]) {
                view->CreateNetwork()->AddSignal(signals[s]);
                continue;
            }
            if (top && !split_bits.empty()) {
                if (auto it = split_bits.find(bit); it != split_bits.end()) {
                    if (it->second == kNone) {
                        it->second = static_cast<uint32_t>(view->GetNumNetworks());
                        view->CreateNetwork();
                    }
                    view->GetNetworkItr()[it->second]->AddSignal(signals[s]);
                    continue;
                }
            }
            uint32_t root = Find(inst.base + static_cast<uint32_t>(bit));
            uint32_t& index = network_of_root[root];
            if (index == kNone) {
                index = static_cast<uint32_t>(view->GetNumNetworks());
                view->CreateNetwork();
            }
            view->GetNetworkItr()[index]->AddSignal(signals[s]);
        }
    }
}

// The pad boundary of the top module: each top-level port bit is a pad of its own. When one
// local bit carries several port bits (assign y = x), one keeps the net: the first input (or
// inout) port bit, else the first port bit, in stored order. The others are marked in
// m.pad_only and will each get a network holding only their own signal, so that the pad
// constraints given to each port (LOC, IOSTANDARD, ...) stay its own; cell pins on the bit
// connect to the signal that keeps the net.
void Reader::PadBoundary(Module& m) {
    std::vector<uint8_t>& kind = m.port_kind;
    kind.assign(m.num_signals, 0);
    for (size_t n = 0; n < m.nets.size(); ++n) {
        const Port* p = FindPort(m, m.nets[n].name);
        if (!p) continue;
        uint8_t k = p->dir == Ndm_Dir::Input || p->dir == Ndm_Dir::Inout ? 2 : 1;
        for (uint32_t i = 0; i < m.nets[n].bits.count; ++i) kind[m.net_first_signal[n] + i] = k;
    }
    std::vector<int32_t> keeper(m.num_bits, -1);
    bool shared = false;
    for (uint32_t s = 0; s < m.num_signals; ++s) {
        int32_t bit = m.signal_bit[s];
        if (!kind[s] || bit < 0) continue;
        int32_t& k = keeper[bit];
        if (k >= 0) shared = true;
        if (k < 0 || (kind[k] == 1 && kind[s] == 2)) k = static_cast<int32_t>(s);
    }
    m.pad_only.assign(m.num_signals, 0);
    if (!shared) return;
    for (uint32_t s = 0; s < m.num_signals; ++s) {
        int32_t bit = m.signal_bit[s];
        if (!kind[s] || bit < 0 || keeper[bit] == static_cast<int32_t>(s)) continue;
        m.pad_only[s] = 1;
        if (m.bit_signal[bit] == static_cast<int32_t>(s)) m.bit_signal[bit] = keeper[bit];
    }
}

// Signals of a module in the order they join networks: port names, other public names,
// generated names, each group in stored order.
void Reader::SignalOrder(Module& m) {
    Ndm_PtrMap ports;
    for (const Port& port : m.ports) ports.InsertIfAbsent(port.name, const_cast<char*>(port.name));
    m.signal_order.clear();
    m.signal_order.reserve(m.num_signals);
    for (int rank = 0; rank < 3; ++rank) {
        for (size_t n = 0; n < m.nets.size(); ++n) {
            const Net& net = m.nets[n];
            int r = ports.Find(net.name) ? 0 : (net.name[0] == '$' ? 2 : 1);
            if (r != rank) continue;
            for (uint32_t i = 0; i < net.bits.count; ++i) m.signal_order.push_back(m.net_first_signal[n] + i);
        }
    }
}

bool Reader::Build(const char* top_module) {
    uint32_t top = 0;
    if (!ResolveTypes() || !ChooseTop(top_module, top)) return false;
    std::vector<uint32_t> stack;
    if (!CheckCycles(top, stack)) return false;
    // The JSON input and the parser's buffers are no longer needed.
    doc_ = od::document();
    parser_ = od::parser();
    buf_.Release();

    const Module& m = modules_[top];
    design_.SetName(m.name);
    Ndm_View* view = design_.CreateView("EXPANDED");
    Ndm_Block* block = view->CreateTopBlock(m.name);
    block->SetTypeName(m.name);
    PadBoundary(modules_[top]);
    if (!Expand(block, top, Alloc(m.num_bits))) return false;
    TopPins(block, top);
    Networks(view);
    return true;
}

}  // namespace

std::unique_ptr<Ndm_Design> Ndm_ReadYosysJson(const char* path, const char* top_module) {
    if (!path) return nullptr;
    auto design = std::make_unique<Ndm_Design>("");
    Reader reader(path, *design);
    if (!reader.Load() || !reader.Build(top_module)) return nullptr;
    return design;
}
