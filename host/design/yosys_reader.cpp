#include "host/design/yosys_reader.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>

#include "host/design/yosys_reader_impl.h"
#include "host/port/env.h"
#include "host/port/json_text.h"
#include "host/port/msgman.h"

namespace ndm_yosys {

// ---------------------------------------------------------------------------------------
// Parsing

bool Reader::Key(od::field& field, std::string_view& out) { return KeyText(field.key(), out); }

bool Reader::KeyText(od::raw_json_string key, std::string_view& out) {
    if (!Ndm_JsonInput::Text(key, scratch_, out)) return SyntaxError(simdjson::STRING_ERROR, Where());
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
    od::raw_json_string raw;
    if (error_code e = value.get_raw_json_string().get(raw)) return JsonError(e, what() + " must be a string");
    // Millions of cells give their directions: the usual texts are taken as they stand in the
    // file, and only others decoded.
    for (Ndm_Dir usual : {Ndm_Dir::Input, Ndm_Dir::Output, Ndm_Dir::Inout}) {
        if (raw.unsafe_is_equal(std::string_view(Ndm_DirName(usual)))) {
            dir = usual;
            return true;
        }
    }
    std::string_view text;
    if (!Ndm_JsonInput::Text(raw, scratch_, text)) return SyntaxError(simdjson::STRING_ERROR, Where());
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

// Reads a file in pieces: the large objects (the modules, a large module, its cells, netnames
// and ports) arrive member by member, and each member goes to the reader that the whole-file
// reading would give it to, so both readings check the same rules.
class Reader::Pieces : public Ndm_JsonChunks::Visitor {
public:
    explicit Pieces(Reader& reader) : r_(reader) { stack_.push_back(Ctx::Root); }

    bool Member(od::raw_json_string key, od::value value) override {
        switch (stack_.back()) {
            case Ctx::Root: return key == "modules" ? r_.Modules(value) : true;
            case Ctx::Modules: return r_.ModuleWhole(key, value);
            case Ctx::Module: return r_.ModuleMember(key, value);
            case Ctx::Cells: return r_.CellMember(r_.module_, key, value);
            case Ctx::Nets: return r_.NetMember(r_.module_, key, value);
            case Ctx::Ports: return r_.PortMember(r_.module_, key, value);
            case Ctx::Skip: return true;
        }
        return true;
    }

    // A large member is read in parts where the whole-file reading would walk into it, and
    // whole (where its reader reports what is wrong with it) anywhere else.
    bool Enter(od::raw_json_string key, bool object, size_t members, Take& take) override {
        Ctx next = Ctx::Skip;
        take = Take::Whole;
        switch (stack_.back()) {
            case Ctx::Root:
                if (key == "modules") {
                    if (!object) return true;
                    if (!r_.SeeModules()) return false;
                    next = Ctx::Modules;
                }
                break;
            case Ctx::Modules: {
                if (!object) return true;
                bool skip = false;
                if (!r_.BeginModule(key, skip)) return false;
                next = skip ? Ctx::Skip : Ctx::Module;
                break;
            }
            case Ctx::Module:
                if (object && key == "cells") {
                    next = Ctx::Cells;
                    r_.ExpectMembers(kSeenCells, members);
                } else if (object && key == "netnames") {
                    next = Ctx::Nets;
                    r_.ExpectMembers(kSeenNets, members);
                } else if (object && key == "ports") {
                    next = Ctx::Ports;
                    r_.ExpectMembers(kSeenPorts, members);
                } else if (key == "attributes" || key == "cells" || key == "netnames" || key == "ports") {
                    return true;
                }
                break;
            case Ctx::Cells:
            case Ctx::Nets:
            case Ctx::Ports: return true;
            case Ctx::Skip: break;
        }
        take = Take::Parts;
        stack_.push_back(next);
        return true;
    }

    bool Leave() override {
        if (stack_.back() == Ctx::Module) r_.EndModule();
        stack_.pop_back();
        return true;
    }

private:
    enum class Ctx { Root, Modules, Module, Cells, Nets, Ports, Skip };
    Reader& r_;
    std::vector<Ctx> stack_;
};

bool Reader::Load() {
    std::string why;
    if (!buf_.Open(path_, why))
        return Error(Port_Format("Cannot read netlist file '%s': %s.", path_, why.c_str()));
    // A large file is read in pieces, so that the parser's index of the whole file (larger
    // than the file) is never held beside what is built from it.
    Pieces visitor(*this);
    const Ndm_JsonChunks::LargeRead large = Ndm_JsonChunks::ReadLarge(buf_, visitor, pieces_);
    if (large.read) {
        if (!large.ok) return large.error ? SyntaxError(large.error, large.error_offset) : false;
        return Parsed();
    }
    if (error_code e = Ndm_JsonInput::Iterate(parser_, buf_, doc_))
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
    for (auto item : root) {
        od::field field;
        if (error_code e = std::move(item).get(field)) return JsonError(e, "bad member");
        if (field.key() != "modules") continue;
        if (!Modules(field.value())) return false;
    }
    if (!AtEnd()) return SyntaxError(simdjson::TRAILING_CONTENT, Where());
    return Parsed();
}

bool Reader::Parsed() {
    if (!seen_modules_)
        return Error(Port_Format("'%s' is not a Yosys JSON netlist: it has no \"modules\" object.", path_));
    if (bad_names_) return false;  // each was reported
    if (modules_.empty()) return Error(Port_Format("Netlist '%s' holds no module.", path_));
    return true;
}

bool Reader::SeeModules() {
    if (seen_modules_) return ShapeError("\"modules\" appears twice");
    seen_modules_ = true;
    return true;
}

bool Reader::Modules(od::value value) {
    if (!SeeModules()) return false;
    od::object modules;
    if (error_code e = value.get_object().get(modules)) return JsonError(e, "\"modules\" must be an object");
    for (auto mitem : modules) {
        od::field mfield;
        if (error_code e = std::move(mitem).get(mfield)) return JsonError(e, "bad module");
        if (!ModuleWhole(mfield.key(), mfield.value())) return false;
    }
    return true;
}

bool Reader::ModuleWhole(od::raw_json_string key, od::value value) {
    bool skip = false;
    if (!BeginModule(key, skip)) return false;
    if (skip) return true;
    od::object object;
    if (error_code e = value.get_object().get(object))
        return JsonError(e, Port_Format("module '%s' must be an object", module_.name));
    for (auto item : object) {
        od::field field;
        if (error_code e = std::move(item).get(field)) return JsonError(e, "bad member" + InModule());
        if (!ModuleMember(field.key(), field.value())) return false;
    }
    EndModule();
    return true;
}

// Starts reading the module of that name; skip when the name is refused (the module is left out).
bool Reader::BeginModule(od::raw_json_string key, bool& skip) {
    std::string_view name;
    if (!KeyText(key, name)) return false;
    skip = !NameOk(StripEscape(name), nullptr, "module");
    if (skip) return true;
    module_ = Module();
    module_.name = design_.Intern(StripEscape(name));
    module_.offset = Where();
    for (SeenNames& seen : seen_) seen.Clear();
    module_name_ = module_.name;
    if (module_index_.Find(module_.name))
        return ShapeError(Port_Format("module '%s' is defined twice", module_.name));
    return true;
}

void Reader::EndModule() {
    SettleAll();
    buf_.DropBefore(Where());
    Finish(module_);
    module_index_.InsertIfAbsent(module_.name, AsValue(modules_.size()));
    modules_.push_back(std::move(module_));
    module_ = Module();
}

// A name of the file that a design object will carry (a module, port, cell or net name, or a
// cell type or connection name with may_be_empty): false, after an error naming the file, the
// module and the name, when it is empty or holds a NUL byte, which would cut it short wherever
// names are texts. The caller leaves the object out and reads on, so that one run lists every
// such name; the netlist is then refused (ParseRoot).
bool Reader::NameOk(std::string_view name, const Module* m, const char* kind, bool may_be_empty) {
    const bool empty = name.empty() && !may_be_empty;
    if (!empty && name.find('\0') == std::string_view::npos) return true;
    const std::string owner = m ? Port_Format("Module '%s' in '%s'", m->name, path_) : Port_Format("Netlist '%s'", path_);
    if (empty) {
        Error(Port_Format("%s has a %s with an empty name (at byte %zu).", owner.c_str(), kind, Where()));
    } else {
        std::string shown;
        Port_AppendJsonString(shown, name);
        shown = shown.substr(1, shown.size() - 2);
        Error(Port_Format("%s has a %s named '%s', which holds a NUL character (at byte %zu).", owner.c_str(), kind,
                          shown.c_str(), Where()));
    }
    ++bad_names_;
    return false;
}

void SeenNames::Settle() {
    set_.Reserve(noted_.size() + 1);
    // The noted names go in eight ahead of their slots, which are far apart in a large set.
    constexpr size_t kAhead = 8;
    for (size_t i = 0; i < noted_.size(); ++i) {
        if (i + kAhead < noted_.size()) set_.Prefetch(noted_[i + kAhead]);
        set_.InsertIfAbsent(noted_[i], const_cast<char*>(noted_[i]));
    }
    noted_.clear();
}

// False, after an error naming the file, the module and the name, when the module already has
// an object of that kind and name (interned); the caller leaves the second one out.
bool Reader::FirstOfName(SeenNames& seen, const char* name, bool new_to_design, const Module& m, const char* kind,
                         size_t where) {
    if (seen.Add(name, new_to_design)) return true;
    Error(Port_Format("Module '%s' in '%s' has two %ss named '%s' (at byte %zu).", m.name, path_, kind, name, where));
    ++bad_names_;
    return false;
}

bool Reader::ModuleMember(od::raw_json_string key, od::value value) {
    if (key == "attributes") return ParseAttributes(value, module_);
    if (key == "ports") return ParsePorts(value, module_);
    if (key == "cells") return ParseCells(value, module_);
    if (key == "netnames") return ParseNets(value, module_);
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
        if (!PortMember(m, field.key(), field.value())) return false;
    }
    return true;
}

// A large module's ports, cells or netnames (seen: which of seen_) are about to be read: their
// names get room at once rather than as they come.
void Reader::ExpectMembers(int seen, size_t members) {
    // A netlist has about as many nets as cells, and the cells come first: room for both at once
    // spares the name set a second growth.
    if (seen == kSeenCells) design_.ReserveNames(2 * members);
    if (seen == kSeenNets) {
        design_.ReserveNames(members);
        module_.nets.reserve(module_.nets.size() + members);
    }
    seen_[seen].Reserve(members);
}

// The interned name of a port of m from its key. False for a malformed key; name null, after an
// error, when the port is left out for its name.
bool Reader::PortName(Module& m, od::raw_json_string key, const char*& name) {
    name = nullptr;
    std::string_view text;
    if (!KeyText(key, text)) return false;
    const std::string_view bare = StripEscape(text);
    if (!NameOk(bare, &m, "port")) return true;
    // Port names come back on every cell of the module's type, through the short texts' table.
    const char* interned = design_.Intern(bare);
    if (FirstOfName(seen_[kSeenPorts], interned, false, m, "port", Where())) name = interned;
    return true;
}

bool Reader::BeginName(od::raw_json_string key, int seen, const char*& text) {
    text = nullptr;
    std::string_view raw;
    if (!KeyText(key, raw)) return false;
    const std::string_view bare = StripEscape(raw);
    if (!NameOk(bare, &module_, seen == kSeenCells ? "cell" : "net")) return true;
    if (waiting_.full()) SettleOldest();
    body_ = &waiting_.Add(bare, design_.PrefetchName(bare));
    body_->payload = Waiting{seen, Where(), kNoObject};
    in_body_ = true;
    body_second_ = false;
    body_name_ = nullptr;
    text = body_->text.c_str();
    return true;
}

bool Reader::EndBody(const char*& name) {
    in_body_ = false;
    if (body_second_) return false;
    if (body_name_) name = body_name_;
    return true;
}

void Reader::Keep(size_t object) {
    if (!body_name_) body_->payload.object = object;
}

void Reader::SettleOldest() {
    WaitingName& name = waiting_.TakeOldest();
    const Waiting& w = name.payload;
    bool added = false;
    const char* interned = design_.InternRare(name.text, name.hash, added);
    const bool cell = w.seen == kSeenCells;
    settling_ = true;
    const bool second = !FirstOfName(seen_[w.seen], interned, added, module_, cell ? "cell" : "net", w.where);
    settling_ = false;
    if (w.object != kNoObject) (cell ? module_.cells[w.object].name : module_.nets[w.object].name) = interned;
    if (&name == body_) {  // the object read last
        body_second_ = second;
        body_name_ = interned;
    }
}

void Reader::SettleAll() {
    while (!waiting_.empty()) SettleOldest();
}

bool Reader::PortMember(Module& m, od::raw_json_string name_key, od::value value) {
    Port port;
    if (!PortName(m, name_key, port.name)) return false;
    if (!port.name) return true;  // left out
    auto what = [&] { return Port_Format("port '%s' in module '%s'", port.name, m.name); };
    od::object body;
    if (error_code e = value.get_object().get(body)) return JsonError(e, what() + " must be an object");
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
    return true;
}

bool Reader::ParseCells(od::value value, Module& m) {
    od::object object;
    if (error_code e = value.get_object().get(object))
        return JsonError(e, "\"cells\"" + InModule() + " must be an object");
    for (auto item : object) {
        od::field field;
        if (error_code e = std::move(item).get(field)) return JsonError(e, "bad cell" + InModule());
        if (!CellMember(m, field.key(), field.value())) return false;
    }
    return true;
}

bool Reader::CellMember(Module& m, od::raw_json_string name_key, od::value value) {
    Cell cell;
    if (!BeginName(name_key, kSeenCells, cell.name)) return false;
    if (!cell.name) return true;  // left out
    const size_t bad = bad_names_;
    od::object body;
    const error_code e = value.get_object().get(body);
    const bool ok = e ? JsonError(e, Port_Format("cell '%s' in module '%s' must be an object", cell.name, m.name))
                      : ParseCell(body, m, cell);
    if (!EndBody(cell.name)) return true;  // left out
    if (!ok) return false;
    if (bad_names_ == bad) {
        m.cells.push_back(cell);
        Keep(m.cells.size() - 1);
    }
    if ((m.cells.size() & 1023) == 0) buf_.DropBefore(Where());
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
            if (!NameOk(StripEscape(type), &m, "cell type", true)) type = "";
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
                if (!NameOk(StripEscape(pname), &m, "port direction", true)) continue;
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
                if (!NameOk(StripEscape(pname), &m, "connection", true)) continue;
                Conn conn;
                conn.name = design_.Intern(StripEscape(pname));
                if (!FirstConnection(m, cell, conn.name)) continue;
                if (!Bits(cfield.value(), m, conn.bits,
                          [&] { return Port_Format("connection '%s' of ", conn.name) + what(); }))
                    return false;
                m.conns.push_back(conn);
                m.conn_dirs.push_back(Ndm_Dir::None);
            }
        }
    }
    if (!cell.type) return ShapeError(what() + " has no \"type\"");
    cell.num_conns = static_cast<uint32_t>(m.conns.size() - cell.first_conn);
    // Directions usually come in the order of the connections; search only when they do not.
    for (uint32_t k = 0; k < cell.num_conns; ++k) {
        const Conn& conn = m.conns[cell.first_conn + k];
        Ndm_Dir& dir = m.conn_dirs[cell.first_conn + k];
        if (k < dirs_.size() && dirs_[k].first == conn.name) {
            dir = dirs_[k].second;
            continue;
        }
        for (const auto& d : dirs_) {
            if (d.first == conn.name) {
                dir = d.second;
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
        if (!NetMember(m, field.key(), field.value())) return false;
    }
    return true;
}

bool Reader::NetMember(Module& m, od::raw_json_string name_key, od::value value) {
    Net net;
    if (!BeginName(name_key, kSeenNets, net.name)) return false;
    if (!net.name) return true;  // left out
    const bool ok = NetBody(value, m, net);
    if (!EndBody(net.name)) return true;  // left out
    if (!ok) return false;
    m.nets.push_back(net);
    Keep(m.nets.size() - 1);
    return true;
}

bool Reader::NetBody(od::value value, Module& m, Net& net) {
    od::object body;
    if (error_code e = value.get_object().get(body))
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
    return true;
}

// False, after an error, when the cell being read already connects a port of that name (the
// second connection is left out). Cells of a few connections are searched directly.
bool Reader::FirstConnection(const Module& m, const Cell& cell, const char* name) {
    constexpr size_t kDirect = 8;
    const size_t count = m.conns.size() - cell.first_conn;
    bool twice = false;
    if (count <= kDirect) {
        for (size_t k = cell.first_conn; k < m.conns.size() && !twice; ++k) twice = m.conns[k].name == name;
    } else {
        Ndm_PtrMap& seen = seen_conns_;
        if (count == kDirect + 1) {
            seen.Clear();
            for (size_t k = cell.first_conn; k < m.conns.size(); ++k)
                seen.InsertIfAbsent(m.conns[k].name, const_cast<char*>(m.conns[k].name));
        }
        twice = seen.Find(name) != nullptr;
        if (!twice) seen.InsertIfAbsent(name, const_cast<char*>(name));
    }
    if (!twice) return true;
    Error(Port_Format("Cell '%s' in module '%s' of '%s' connects port '%s' twice (at byte %zu).", cell.name, m.name,
                      path_, name, Where()));
    ++bad_names_;
    return false;
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
    m.conn_dirs.shrink_to_fit();
    m.cells.shrink_to_fit();
}

}  // namespace ndm_yosys

uint64_t Ndm_DefaultMaxCells() {
    const char* text = Port_Env::GetEnv("LUN_MAX_CELLS");
    if (!text) return kNdm_MaxCells;
    char* end = nullptr;
    errno = 0;
    const unsigned long long n = std::strtoull(text, &end, 10);
    if (errno || end == text || *end || n == 0 || text[0] == '-') {
        ndm_yosys::Msg().issueWarning(
            "%s", Port_Format("LUN_MAX_CELLS is '%s', not a positive number of instances; the limit stays %llu.", text,
                              static_cast<unsigned long long>(kNdm_MaxCells))
                      .c_str());
        return kNdm_MaxCells;
    }
    return n;
}

std::unique_ptr<Ndm_Design> Ndm_ReadYosysJson(const char* path, const char* top_module, uint64_t max_cells) {
    if (!path) return nullptr;
    auto design = std::make_unique<Ndm_Design>("");
    ndm_yosys::Reader reader(path, *design, max_cells ? max_cells : Ndm_DefaultMaxCells());
    if (!reader.Load() || !reader.Build(top_module)) return nullptr;
    return design;
}
