#include "host/design/native_format.h"

#include <simdjson.h>

#include <cmath>
#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

#include "host/design/json_input.h"
#include "host/design/name_pool.h"
#include "host/port/file.h"
#include "host/port/json_text.h"
#include "host/port/msgman.h"

namespace {

namespace od = simdjson::ondemand;
using simdjson::error_code;

using Ndm_JsonInput::Msg;

constexpr const char kMarker[] = "lun-design";
constexpr int kVersion = 1;

// ---------------------------------------------------------------------------------------
// Writing

class Writer {
public:
    Writer(const Ndm_Design& design, const char* path) : design_(design), path_(path), file_(path) {
        buf_.reserve(kFlush + 4096);
    }

    bool Write() {
        if (!file_.error().empty()) return Fail(file_.error());
        Number();
        buf_ += "{\"format\":\"lun-design\",\"version\":1,\"name\":";
        Str(design_.GetName());
        Properties(design_);
        buf_ += ",\"views\":[";
        bool first = true;
        for (const Ndm_View* view : design_.GetViewItr()) {
            buf_ += first ? "\n" : ",\n";
            first = false;
            View(*view);
        }
        buf_ += "]}\n";
        Flush();
        if (!ok_) return Fail(why_.empty() ? file_.error() : why_);
        if (!file_.Commit()) return Fail(file_.error());
        return true;
    }

private:
    static constexpr size_t kFlush = 1 << 20;

    bool Fail(const std::string& why) {
        Msg().issueError("%s", Port_Format("Cannot write design file '%s': %s.", path_, why.c_str()).c_str());
        return false;
    }

    // Numbers every signal in file order: preorder of the blocks, a block's signals before
    // its children, views in order.
    void Number() {
        uint64_t next = 0;
        std::vector<const Ndm_Block*> stack;
        for (const Ndm_View* view : design_.GetViewItr()) {
            if (!view->GetBlock()) continue;
            stack.push_back(view->GetBlock());
            while (!stack.empty()) {
                const Ndm_Block* b = stack.back();
                stack.pop_back();
                for (const Ndm_Signal* s : b->GetSignalItr()) ordinal_.InsertIfAbsent(s, reinterpret_cast<void*>(++next));
                auto children = b->GetBlockItr();
                for (size_t i = children.size(); i-- > 0;) stack.push_back(children[i]);
            }
        }
    }

    void View(const Ndm_View& view) {
        buf_ += "{\"name\":";
        Str(view.GetName());
        Properties(view);
        if (view.GetBlock()) {
            buf_ += ",\"top\":\n";
            Block(*view.GetBlock());
        }
        buf_ += ",\"networks\":[";
        bool first = true;
        for (const Ndm_Network* net : view.GetNetworkItr()) {
            buf_ += first ? "\n" : ",\n";
            first = false;
            buf_ += "{\"name\":";
            Str(net->GetName());
            Properties(*net);
            buf_ += ",\"signals\":[";
            for (const Ndm_Signal* s = net->GetFirstSignal(); s; s = s->GetNextInNetwork()) {
                if (s != net->GetFirstSignal()) buf_ += ',';
                Uint(Ordinal(s) - 1);
            }
            buf_ += "]}";
            Check();
        }
        buf_ += "]}";
    }

    void Block(const Ndm_Block& block) {
        buf_ += "{\"name\":";
        Str(block.GetName());
        if (*block.GetTypeName()) {
            buf_ += ",\"type\":";
            Str(block.GetTypeName());
        }
        Properties(block);
        if (block.GetNumSignals()) {
            buf_ += ",\"signals\":[";
            bool first = true;
            for (const Ndm_Signal* s : block.GetSignalItr()) {
                buf_ += first ? "\n" : ",\n";
                first = false;
                buf_ += "{\"name\":";
                Str(s->GetName());
                Properties(*s);
                buf_ += '}';
                Check();
            }
            buf_ += ']';
        }
        if (block.GetNumPins()) {
            buf_ += ",\"pins\":[";
            bool first = true;
            for (const Ndm_Pin* p : block.GetPinItr()) {
                buf_ += first ? "\n" : ",\n";
                first = false;
                buf_ += "{\"name\":";
                Str(p->GetName());
                if (p->GetDirection() != Ndm_Dir::None) {
                    buf_ += ",\"dir\":\"";
                    buf_ += Ndm_DirName(p->GetDirection());
                    buf_ += '"';
                }
                // A pin may still point at a signal of a deleted block; that link is dropped.
                if (uint64_t n = p->GetSignal() ? Ordinal(p->GetSignal()) : 0; n) {
                    buf_ += ",\"signal\":";
                    Uint(n - 1);
                }
                Properties(*p);
                buf_ += '}';
                Check();
            }
            buf_ += ']';
        }
        if (block.GetNumBlocks()) {
            buf_ += ",\"blocks\":[";
            bool first = true;
            for (const Ndm_Block* child : block.GetBlockItr()) {
                buf_ += first ? "\n" : ",\n";
                first = false;
                Block(*child);
            }
            buf_ += ']';
        }
        buf_ += '}';
        Check();
    }

    // 1 + the signal's number, or 0 for a signal outside the written tree.
    uint64_t Ordinal(const Ndm_Signal* s) const {
        return reinterpret_cast<uintptr_t>(ordinal_.Find(s));
    }

    void Properties(const Ndm_PropertyHolder& holder) {
        if (!holder.GetNumProperties()) return;
        buf_ += ",\"properties\":";
        PropertyList(holder.GetPropertyItr());
    }

    void PropertyList(std::span<Ndm_Property* const> props) {
        buf_ += '[';
        bool first = true;
        for (const Ndm_Property* p : props) {
            if (!first) buf_ += ',';
            first = false;
            buf_ += "{\"name\":";
            Str(p->GetName());
            buf_ += ",\"type\":\"";
            const char* type = Ndm_PropTypeName(p->GetType());
            buf_ += type ? type : "bool";
            buf_ += "\",\"value\":";
            switch (p->GetType()) {
                case NDM_PROP_INT32: buf_ += std::to_string(p->GetInt32()); break;
                case NDM_PROP_FLOAT64: Float(p->GetFloat64()); break;
                case NDM_PROP_STRING: Str(p->GetValueString()); break;
                case NDM_PROP_STRING_LIST: {
                    buf_ += '[';
                    bool first_text = true;
                    for (const std::string& s : p->GetStrings()) {
                        if (!first_text) buf_ += ',';
                        first_text = false;
                        Str(s.data(), s.size());
                    }
                    buf_ += ']';
                    break;
                }
                case NDM_PROP_LIST: PropertyList(p->GetListItr()); break;
                default: buf_ += p->GetBool() ? "true" : "false"; break;
            }
            buf_ += '}';
        }
        buf_ += ']';
    }

    void Float(double v) {
        if (std::isnan(v)) {
            buf_ += std::signbit(v) ? "\"-nan\"" : "\"nan\"";
        } else if (std::isinf(v)) {
            buf_ += v < 0 ? "\"-inf\"" : "\"inf\"";
        } else {
            char num[40];
            std::snprintf(num, sizeof num, "%.17g", v);
            buf_ += num;
        }
    }

    void Uint(uint64_t v) {
        char num[24];
        char* end = num + sizeof num;
        char* p = end;
        do {
            *--p = static_cast<char>('0' + v % 10);
            v /= 10;
        } while (v);
        buf_.append(p, static_cast<size_t>(end - p));
    }

    void Str(const char* text) { Str(text ? text : "", text ? std::strlen(text) : 0); }

    void Str(const char* text, size_t size) { Port_AppendJsonString(buf_, std::string_view(text, size)); }

    void Check() {
        if (buf_.size() >= kFlush) Flush();
    }

    // Buffers hold whole objects, so each is valid UTF-8 on its own; one that is not would give
    // a file no reader accepts, and the file is then not written.
    void Flush() {
        if (ok_ && !simdjson::validate_utf8(buf_.data(), buf_.size())) {
            ok_ = false;
            why_ = "internal error: the text written is not valid UTF-8";
        }
        if (ok_ && !file_.Write(buf_.data(), buf_.size())) ok_ = false;
        buf_.clear();
    }

    const Ndm_Design& design_;
    const char* path_;
    Port::AtomicFile file_;
    std::string buf_;
    Ndm_PtrMap ordinal_;  // signal -> 1 + its number
    bool ok_ = true;
    std::string why_;
};

// ---------------------------------------------------------------------------------------
// Reading

class Reader {
public:
    Reader(const char* path, Ndm_Design& design) : path_(path), design_(design) {}

    bool Read() {
        std::string why;
        if (!buf_.Open(path_, why))
            return Error(Port_Format("Cannot read design file '%s': %s.", path_, why.c_str()));
        if (error_code e = parser_.iterate(buf_.view()).get(doc_))
            return SyntaxError(e, Ndm_JsonInput::EarlyErrorOffset(e, buf_));
        od::object root;
        od::json_type type;
        if (error_code e = doc_.type().get(type)) return SyntaxError(e, Where());
        if (error_code e = doc_.get_object().get(root)) return JsonError(e, "the file must hold a JSON object");
        bool marked = false;
        for (auto item : root) {
            od::field field;
            if (error_code e = std::move(item).get(field)) return JsonError(e, "bad member");
            od::raw_json_string key = field.key();
            if (key == "format") {
                std::string_view text;
                if (!String(field.value(), text, "\"format\"")) return false;
                if (text != kMarker) return Shape("\"format\" must be \"lun-design\"");
                marked = true;
            } else if (!marked) {
                return Error(Port_Format("'%s' is not a design file: it does not start with the "
                                         "\"format\": \"lun-design\" marker.",
                                         path_));
            } else if (key == "version") {
                int64_t version;
                if (error_code e = field.value().get_int64().get(version))
                    return JsonError(e, "\"version\" must be an integer");
                if (version != kVersion)
                    return Error(Port_Format("Design file '%s' has version %lld; this program reads version %d.",
                                             path_, static_cast<long long>(version), kVersion));
            } else if (key == "name") {
                std::string_view text;
                if (!String(field.value(), text, "\"name\"")) return false;
                design_.SetName(text);
            } else if (key == "properties") {
                if (!Properties(field.value(), design_)) return false;
            } else if (key == "views") {
                od::array views;
                if (error_code e = field.value().get_array().get(views))
                    return JsonError(e, "\"views\" must be an array");
                for (auto vitem : views) {
                    od::value view;
                    if (error_code e = std::move(vitem).get(view)) return JsonError(e, "bad view");
                    if (!View(view)) return false;
                }
            }
        }
        if (doc_.current_location().error() != simdjson::OUT_OF_BOUNDS)
            return SyntaxError(simdjson::TRAILING_CONTENT, Where());
        if (!marked)
            return Error(Port_Format("'%s' is not a design file: it has no \"format\": \"lun-design\" marker.",
                                     path_));
        // Pins that named signals further down the file.
        for (const auto& [pin, n] : pending_) {
            if (n >= signals_.size())
                return Error(Port_Format("Design file '%s' is damaged: a pin names signal %llu, but the file "
                                         "has %zu signals.",
                                         path_, static_cast<unsigned long long>(n), signals_.size()));
            pin->SetSignal(signals_[n]);
        }
        return true;
    }

private:
    bool Error(const std::string& text) {
        Msg().issueError("%s", text.c_str());
        return false;
    }
    size_t Where() { return Ndm_JsonInput::Offset(doc_, buf_); }
    bool SyntaxError(error_code e, size_t offset) {
        return Error(Port_Format("'%s' is not valid JSON: %s at byte %zu.", path_, Ndm_JsonInput::SyntaxReason(e),
                                 offset));
    }
    bool Shape(const std::string& what) {
        return Error(Port_Format("Design file '%s' is damaged: %s (at byte %zu).", path_, what.c_str(), Where()));
    }
    bool JsonError(error_code e, const std::string& what) {
        if (Ndm_JsonInput::IsSyntaxError(e)) return SyntaxError(e, Where());
        return Shape(what);
    }

    bool String(od::value value, std::string_view& out, const char* what) {
        od::raw_json_string raw;
        if (error_code e = value.get_raw_json_string().get(raw))
            return JsonError(e, std::string(what) + " must be a string");
        if (!Ndm_JsonInput::Text(raw, scratch_, out, true)) return SyntaxError(simdjson::STRING_ERROR, Where());
        return true;
    }

    // Interned, terminated copy of a string value.
    bool Name(od::value value, const char*& out, const char* what) {
        std::string_view text;
        if (!String(value, text, what)) return false;
        out = design_.Intern(text);
        return true;
    }

    bool View(od::value value) {
        od::object object;
        if (error_code e = value.get_object().get(object)) return JsonError(e, "a view must be an object");
        Ndm_View* view = nullptr;
        for (auto item : object) {
            od::field field;
            if (error_code e = std::move(item).get(field)) return JsonError(e, "bad view member");
            od::raw_json_string key = field.key();
            if (key == "name") {
                const char* name;
                if (!Name(field.value(), name, "view \"name\"")) return false;
                if (design_.GetViewByName(name)) return Shape(Port_Format("view '%s' appears twice", name));
                view = design_.CreateView(name);
                continue;
            }
            if (!view) return Shape("a view must start with its \"name\"");
            if (key == "properties") {
                if (!Properties(field.value(), *view)) return false;
            } else if (key == "top") {
                if (view->GetBlock()) return Shape("a view has two top blocks");
                if (!Block(field.value(), nullptr, view)) return false;
            } else if (key == "networks") {
                od::array nets;
                if (error_code e = field.value().get_array().get(nets))
                    return JsonError(e, "\"networks\" must be an array");
                for (auto nitem : nets) {
                    od::value net;
                    if (error_code e = std::move(nitem).get(net)) return JsonError(e, "bad network");
                    if (!Network(net, *view)) return false;
                }
            }
        }
        if (!view) return Shape("a view has no \"name\"");
        return true;
    }

    bool Block(od::value value, Ndm_Block* parent, Ndm_View* view) {
        od::object object;
        if (error_code e = value.get_object().get(object)) return JsonError(e, "a block must be an object");
        Ndm_Block* block = nullptr;
        for (auto item : object) {
            od::field field;
            if (error_code e = std::move(item).get(field)) return JsonError(e, "bad block member");
            od::raw_json_string key = field.key();
            if (key == "name") {
                const char* name;
                if (!Name(field.value(), name, "block \"name\"")) return false;
                if (block) return Shape("a block has two names");
                block = parent ? parent->CreateBlock(name) : view->CreateTopBlock(name);
                continue;
            }
            if (!block) return Shape("a block must start with its \"name\"");
            if (key == "type") {
                const char* type;
                if (!Name(field.value(), type, "block \"type\"")) return false;
                block->SetTypeName(type);
            } else if (key == "properties") {
                if (!Properties(field.value(), *block)) return false;
            } else if (key == "signals") {
                if (!Signals(field.value(), *block)) return false;
            } else if (key == "pins") {
                if (!Pins(field.value(), *block)) return false;
            } else if (key == "blocks") {
                od::array children;
                if (error_code e = field.value().get_array().get(children))
                    return JsonError(e, "\"blocks\" must be an array");
                for (auto citem : children) {
                    od::value child;
                    if (error_code e = std::move(citem).get(child)) return JsonError(e, "bad block");
                    if (!Block(child, block, view)) return false;
                }
            }
        }
        if (!block) return Shape("a block has no \"name\"");
        return true;
    }

    bool Signals(od::value value, Ndm_Block& block) {
        od::array array;
        if (error_code e = value.get_array().get(array)) return JsonError(e, "\"signals\" must be an array");
        for (auto item : array) {
            od::object object;
            if (error_code e = std::move(item).get_object().get(object))
                return JsonError(e, "a signal must be an object");
            Ndm_Signal* signal = nullptr;
            for (auto fitem : object) {
                od::field field;
                if (error_code e = std::move(fitem).get(field)) return JsonError(e, "bad signal member");
                od::raw_json_string key = field.key();
                if (key == "name") {
                    const char* name;
                    if (!Name(field.value(), name, "signal \"name\"")) return false;
                    if (signal) return Shape("a signal has two names");
                    signal = block.CreateSignal(name);
                    signals_.push_back(signal);
                } else if (key == "properties") {
                    if (!signal) return Shape("a signal must start with its \"name\"");
                    if (!Properties(field.value(), *signal)) return false;
                }
            }
            if (!signal) return Shape("a signal has no \"name\"");
        }
        return true;
    }

    bool Pins(od::value value, Ndm_Block& block) {
        od::array array;
        if (error_code e = value.get_array().get(array)) return JsonError(e, "\"pins\" must be an array");
        for (auto item : array) {
            od::object object;
            if (error_code e = std::move(item).get_object().get(object)) return JsonError(e, "a pin must be an object");
            Ndm_Pin* pin = nullptr;
            const char* name = nullptr;
            Ndm_Dir dir = Ndm_Dir::None;
            auto make = [&] {
                if (!pin) pin = block.CreatePin(name, dir);
            };
            for (auto fitem : object) {
                od::field field;
                if (error_code e = std::move(fitem).get(field)) return JsonError(e, "bad pin member");
                od::raw_json_string key = field.key();
                if (key == "name") {
                    if (name) return Shape("a pin has two names");
                    if (!Name(field.value(), name, "pin \"name\"")) return false;
                    continue;
                }
                if (!name) return Shape("a pin must start with its \"name\"");
                if (key == "dir") {
                    if (pin) return Shape("a pin's \"dir\" must come right after its name");
                    std::string_view text;
                    if (!String(field.value(), text, "pin \"dir\"")) return false;
                    if (!Ndm_DirFromName(text, dir))
                        return Shape("pin \"dir\" must be \"input\", \"output\" or \"inout\"");
                } else if (key == "signal") {
                    uint64_t n;
                    if (error_code e = field.value().get_uint64().get(n))
                        return JsonError(e, "pin \"signal\" must be a signal number");
                    make();
                    if (n < signals_.size())
                        pin->SetSignal(signals_[n]);
                    else
                        pending_.emplace_back(pin, n);
                } else if (key == "properties") {
                    make();
                    if (!Properties(field.value(), *pin)) return false;
                }
            }
            if (!name) return Shape("a pin has no \"name\"");
            make();
        }
        return true;
    }

    bool Network(od::value value, Ndm_View& view) {
        od::object object;
        if (error_code e = value.get_object().get(object)) return JsonError(e, "a network must be an object");
        Ndm_Network* net = view.CreateNetwork();
        for (auto item : object) {
            od::field field;
            if (error_code e = std::move(item).get(field)) return JsonError(e, "bad network member");
            od::raw_json_string key = field.key();
            if (key == "properties") {
                if (!Properties(field.value(), *net)) return false;
            } else if (key == "signals") {
                od::array array;
                if (error_code e = field.value().get_array().get(array))
                    return JsonError(e, "network \"signals\" must be an array");
                for (auto sitem : array) {
                    uint64_t n;
                    if (error_code e = std::move(sitem).get_uint64().get(n))
                        return JsonError(e, "network \"signals\" must hold signal numbers");
                    if (n >= signals_.size()) return Shape(Port_Format("a network names unknown signal %llu",
                                                                       static_cast<unsigned long long>(n)));
                    if (signals_[n]->GetNetwork())
                        return Shape(Port_Format("signal %llu is in two networks", static_cast<unsigned long long>(n)));
                    net->AddSignal(signals_[n]);
                }
            }
        }
        return true;
    }

    // Holder is a design object or a list property; both create properties the same way.
    template <class Holder>
    bool Properties(od::value value, Holder& holder) {
        od::array array;
        if (error_code e = value.get_array().get(array)) return JsonError(e, "\"properties\" must be an array");
        for (auto item : array) {
            od::object object;
            if (error_code e = std::move(item).get_object().get(object))
                return JsonError(e, "a property must be an object");
            std::string_view text;
            od::value v;
            if (error_code e = object.find_field("name").get(v)) return JsonError(e, "a property needs a \"name\"");
            if (!String(v, text, "property \"name\"")) return false;
            std::string name(text);
            if (error_code e = object.find_field("type").get(v))
                return JsonError(e, "property \"name\" must be followed by \"type\"");
            if (!String(v, text, "property \"type\"")) return false;
            std::string type(text);
            if (error_code e = object.find_field("value").get(v))
                return JsonError(e, "property \"type\" must be followed by \"value\"");
            if (!Value(v, holder, name.c_str(), type)) return false;
        }
        return true;
    }

    template <class Holder>
    bool Value(od::value v, Holder& holder, const char* name, const std::string& type) {
        if (type == "bool") {
            bool b;
            if (error_code e = v.get_bool().get(b)) return JsonError(e, "a bool property needs true or false");
            holder.CreatePropertyBool(name, b);
        } else if (type == "int32") {
            int64_t n;
            if (error_code e = v.get_int64().get(n)) return JsonError(e, "an int32 property needs an integer");
            if (n < INT32_MIN || n > INT32_MAX) return Shape("an int32 property is out of range");
            holder.CreatePropertyInt32(name, static_cast<int32_t>(n));
        } else if (type == "float64") {
            double d;
            od::json_type t;
            if (error_code e = v.type().get(t)) return JsonError(e, "bad float64 property");
            if (t == od::json_type::string) {
                std::string_view text;
                if (!String(v, text, "float64 property")) return false;
                if (text == "inf")
                    d = HUGE_VAL;
                else if (text == "-inf")
                    d = -HUGE_VAL;
                else if (text == "nan")
                    d = std::nan("");
                else if (text == "-nan")
                    d = -std::nan("");
                else
                    return Shape("a float64 property needs a number, \"inf\", \"-inf\" or \"nan\"");
            } else if (error_code e = v.get_double().get(d)) {
                return JsonError(e, "a float64 property needs a number");
            }
            holder.CreatePropertyFloat64(name, d);
        } else if (type == "string") {
            std::string_view text;
            if (!String(v, text, "string property")) return false;
            holder.CreatePropertyString(name, std::string(text).c_str());
        } else if (type == "string_list") {
            od::array array;
            if (error_code e = v.get_array().get(array)) return JsonError(e, "a string_list property needs an array");
            Ndm_Property* p = holder.CreatePropertyStringList(name);
            for (auto item : array) {
                od::value s;
                std::string_view text;
                if (error_code e = std::move(item).get(s)) return JsonError(e, "bad string_list entry");
                if (!String(s, text, "string_list entry")) return false;
                p->AddString(std::string(text).c_str());
            }
        } else if (type == "list") {
            Ndm_Property* p = holder.CreatePropertyList(name);
            if (!Properties(v, *p)) return false;
        } else {
            return Shape(Port_Format("unknown property type '%s'", type.c_str()));
        }
        return true;
    }

    const char* path_;
    Ndm_Design& design_;
    Ndm_JsonInput::Input buf_;
    od::parser parser_;
    od::document doc_;
    std::string scratch_;
    std::vector<Ndm_Signal*> signals_;  // by number
    std::vector<std::pair<Ndm_Pin*, uint64_t>> pending_;
};

}  // namespace

bool Ndm_WriteNative(const Ndm_Design& design, const char* path) {
    if (!path) return false;
    Writer writer(design, path);
    return writer.Write();
}

std::unique_ptr<Ndm_Design> Ndm_ReadNative(const char* path) {
    if (!path) return nullptr;
    auto design = std::make_unique<Ndm_Design>("");
    Reader reader(path, *design);
    if (!reader.Read()) return nullptr;
    return design;
}

bool Ndm_IsNativeText(const char* text, size_t size) {
    static constexpr std::string_view kStart = "\"format\"";
    static constexpr std::string_view kValue = "\"lun-design\"";
    std::string_view s(text, size);
    auto skip = [&s] {
        while (!s.empty() && (s.front() == ' ' || s.front() == '\t' || s.front() == '\n' || s.front() == '\r'))
            s.remove_prefix(1);
    };
    if (s.size() >= 3 && std::memcmp(s.data(), "\xEF\xBB\xBF", 3) == 0) s.remove_prefix(3);
    skip();
    if (s.empty() || s.front() != '{') return false;
    s.remove_prefix(1);
    skip();
    if (s.substr(0, kStart.size()) != kStart) return false;
    s.remove_prefix(kStart.size());
    skip();
    if (s.empty() || s.front() != ':') return false;
    s.remove_prefix(1);
    skip();
    return s.substr(0, kValue.size()) == kValue;
}
