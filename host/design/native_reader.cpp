// The native design file, reading side: the design rebuilt from the file, with its own stacks
// for the block tree and nested property lists, and one clear error for a damaged file.
#include <simdjson.h>

#include <cmath>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "host/design/json_chunks.h"
#include "host/design/json_input.h"
#include "host/design/native_format.h"
#include "host/design/waiting_names.h"
#include "host/port/msgman.h"

namespace {

namespace od = simdjson::ondemand;
using simdjson::error_code;

using Ndm_JsonInput::Msg;

constexpr const char kMarker[] = "lun-design";
constexpr int kVersion = 2;  // reads 1 as well: version 2 adds the short signal and pin forms

class Reader {
public:
    Reader(const char* path, Ndm_Design& design) : path_(path), design_(design) {}
    ~Reader() { NameAll(); }  // no block keeps a stand-in name

    bool Read() {
        std::string why;
        if (!buf_.Open(path_, why))
            return Error(Port_Format("Cannot read design file '%s': %s.", path_, why.c_str()));
        // A large file is read in pieces, so that the parser's index of the whole file (larger
        // than the file) is never held beside what is built from it.
        Pieces visitor(*this);
        const Ndm_JsonChunks::LargeRead large = Ndm_JsonChunks::ReadLarge(buf_, visitor, pieces_);
        if (large.read) {
            if (!large.ok) return large.error ? SyntaxError(large.error, large.error_offset) : false;
            return Finish();
        }
        if (error_code e = Ndm_JsonInput::Iterate(parser_, buf_, doc_))
            return SyntaxError(e, Ndm_JsonInput::EarlyErrorOffset(e, buf_));
        od::object root;
        od::json_type type;
        if (error_code e = doc_.type().get(type)) return SyntaxError(e, Where());
        if (error_code e = doc_.get_object().get(root)) return JsonError(e, "the file must hold a JSON object");
        for (auto item : root) {
            od::field field;
            if (error_code e = std::move(item).get(field)) return JsonError(e, "bad member");
            if (!RootMember(field.key(), field.value())) return false;
        }
        if (doc_.current_location().error() != simdjson::OUT_OF_BOUNDS)
            return SyntaxError(simdjson::TRAILING_CONTENT, Where());
        return Finish();
    }

private:
    // The checks made once the whole file is read.
    bool Finish() {
        NameAll();
        if (!marked_)
            return Error(Port_Format("'%s' is not a design file: it has no \"format\": \"lun-design\" marker.",
                                     path_));
        ConnectAhead();
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

    // False, after an error, when a member other than the marker comes first.
    bool Marked(od::raw_json_string key) {
        if (marked_ || key == "format") return true;
        return Error(Port_Format("'%s' is not a design file: it does not start with the "
                                 "\"format\": \"lun-design\" marker.",
                                 path_));
    }

    bool RootMember(od::raw_json_string key, od::value value) {
        if (!Marked(key)) return false;
        if (key == "format") {
            std::string_view text;
            if (!String(value, text, "\"format\"")) return false;
            if (text != kMarker) return Shape("\"format\" must be \"lun-design\"");
            marked_ = true;
        } else if (key == "version") {
            int64_t version;
            if (error_code e = value.get_int64().get(version)) return JsonError(e, "\"version\" must be an integer");
            if (version != kVersion && version != 1)
                return Error(Port_Format("Design file '%s' has version %lld; this program reads versions 1 to %d.",
                                         path_, static_cast<long long>(version), kVersion));
        } else if (key == "name") {
            std::string_view text;
            if (!String(value, text, "\"name\"")) return false;
            design_.SetName(text);
        } else if (key == "properties") {
            if (!Properties(value, design_)) return false;
        } else if (key == "views") {
            od::array views;
            if (error_code e = value.get_array().get(views)) return JsonError(e, "\"views\" must be an array");
            for (auto vitem : views) {
                od::value view;
                if (error_code e = std::move(vitem).get(view)) return JsonError(e, "bad view");
                if (!View(view)) return false;
            }
        }
        return true;
    }

    bool Error(const std::string& text) {
        Msg().issueError("%s", text.c_str());
        return false;
    }
    size_t Where() { return pieces_ ? pieces_->Offset() : Ndm_JsonInput::Offset(doc_, buf_); }
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
        // Names and texts of a design are terminated byte strings: a NUL would cut one short.
        if (out.find('\0') != std::string_view::npos) return Shape(std::string(what) + " holds a NUL character");
        return true;
    }

    // Interned, terminated copy of a string value; rare for block and signal names, which seldom
    // come back soon (pin names and types do).
    bool Name(od::value value, const char*& out, const char* what, bool rare = false) {
        std::string_view text;
        if (!String(value, text, what)) return false;
        out = rare ? design_.InternRare(text) : design_.Intern(text);
        return true;
    }

    bool View(od::value value) {
        od::object object;
        if (error_code e = value.get_object().get(object)) return JsonError(e, "a view must be an object");
        Ndm_View* view = nullptr;
        for (auto item : object) {
            od::field field;
            if (error_code e = std::move(item).get(field)) return JsonError(e, "bad view member");
            if (!ViewMember(view, field.key(), field.value())) return false;
        }
        if (!view) return Shape("a view has no \"name\"");
        return true;
    }

    // A member of a view; view is null until the view's name is read.
    bool ViewMember(Ndm_View*& view, od::raw_json_string key, od::value value) {
        if (key == "name") {
            const char* name;
            if (!Name(value, name, "view \"name\"")) return false;
            if (design_.GetViewByName(name)) return Shape(Port_Format("view '%s' appears twice", name));
            view = design_.CreateView(name);
            return true;
        }
        if (!view) return Shape("a view must start with its \"name\"");
        if (key == "properties") return Properties(value, *view);
        if (key == "top") {
            if (view->GetBlock()) return Shape("a view has two top blocks");
            return Tree(value, view, nullptr);
        }
        if (key == "networks") {
            od::array nets;
            if (error_code e = value.get_array().get(nets)) return JsonError(e, "\"networks\" must be an array");
            for (auto nitem : nets) {
                od::value net;
                if (error_code e = std::move(nitem).get(net)) return JsonError(e, "bad network");
                if (!NetworkOf(net, *view)) return false;
            }
        }
        return true;
    }

    bool NetworkOf(od::value value, Ndm_View& view) {
        if (!Network(value, view)) return false;
        if ((++networks_ & 1023) == 0) buf_.DropBefore(Where());
        return true;
    }

    // A block and its subtree, the top block of view or a child of parent. Blocks nest as
    // deeply as the design does, so the reader keeps its own stack: a frame per open block,
    // holding where its members and, while they are read, its children stand. A child is read to
    // its end before its parent moves on.
    bool Tree(od::value value, Ndm_View* view, Ndm_Block* parent) {
        struct Frame {
            Ndm_Block* block = nullptr;
            od::object_iterator member, members_end;
            bool in_children = false;
            od::array_iterator child, children_end;
        };
        std::vector<Frame> stack;
        auto open = [&](od::value v) {
            od::object object;
            Frame frame;
            if (error_code e = v.get_object().get(object)) return JsonError(e, "a block must be an object");
            if (error_code e = object.begin().get(frame.member)) return JsonError(e, "bad block member");
            if (error_code e = object.end().get(frame.members_end)) return JsonError(e, "bad block member");
            stack.push_back(frame);
            if ((++opened_ & 1023) == 0) buf_.DropBefore(Where());
            return true;
        };
        if (!open(value)) return false;
        while (!stack.empty()) {
            Frame& frame = stack.back();
            if (frame.in_children) {
                if (frame.child != frame.children_end) {
                    od::value child;
                    if (error_code e = (*frame.child).get(child)) return JsonError(e, "bad block");
                    if (!open(child)) return false;  // frame is not used after this
                    continue;
                }
                frame.in_children = false;
                ++frame.member;
                continue;
            }
            if (!(frame.member != frame.members_end)) {
                if (!frame.block) return Shape("a block has no \"name\"");
                stack.pop_back();
                if (!stack.empty()) ++stack.back().child;
                continue;
            }
            od::field field;
            if (error_code e = (*frame.member).get(field)) return JsonError(e, "bad block member");
            od::raw_json_string key = field.key();
            if (key == "blocks" && frame.block) {
                od::array children;
                if (error_code e = field.value().get_array().get(children))
                    return JsonError(e, "\"blocks\" must be an array");
                if (error_code e = children.begin().get(frame.child)) return JsonError(e, "bad block");
                if (error_code e = children.end().get(frame.children_end)) return JsonError(e, "bad block");
                frame.in_children = true;
                continue;  // the member moves on once the children are read
            }
            Ndm_Block* above = stack.size() > 1 ? stack[stack.size() - 2].block : parent;
            if (!BlockMember(frame.block, view, above, key, field.value())) return false;
            ++frame.member;
        }
        return true;
    }

    // A member of a block other than its children; block is null until its name is read, and is
    // then made, a child of parent or the top block of view.
    bool BlockMember(Ndm_Block*& block, Ndm_View* view, Ndm_Block* parent, od::raw_json_string key,
                     od::value value) {
        if (key == "name") {
            if (block) return Shape("a block has two names");
            if (!parent) {
                const char* name;
                if (!Name(value, name, "block \"name\"", true)) return false;
                block = view->CreateTopBlock(name);
                return true;
            }
            std::string_view text;
            if (!String(value, text, "block \"name\"")) return false;
            block = CreateWaiting(*parent, text);
            return true;
        }
        if (!block) return Shape("a block must start with its \"name\"");
        if (key == "type") {
            const char* type;
            if (!Name(value, type, "block \"type\"")) return false;
            block->SetTypeName(Ndm_Interned{type});
        } else if (key == "properties") {
            return Properties(value, *block);
        } else if (key == "signals") {
            return Signals(value, *block);
        } else if (key == "pins") {
            return Pins(value, *block);
        }
        return true;
    }

    // The children of a block, from its "blocks" array.
    bool Children(od::value value, Ndm_View* view, Ndm_Block* block) {
        od::array children;
        if (error_code e = value.get_array().get(children)) return JsonError(e, "\"blocks\" must be an array");
        for (auto item : children) {
            od::value child;
            if (error_code e = std::move(item).get(child)) return JsonError(e, "bad block");
            if (!Tree(child, view, block)) return false;
        }
        return true;
    }

    // Reads a file in pieces: the large arrays and objects (the views, large blocks and their
    // member lists) arrive member by member, and each member goes to the reader that the
    // whole-file reading would give it to, so both readings check the same rules.
    class Pieces : public Ndm_JsonChunks::Visitor {
    public:
        explicit Pieces(Reader& reader) : r_(reader) { stack_.push_back({Ctx::Root}); }

        bool Member(od::raw_json_string key, od::value value) override {
            Level& l = stack_.back();
            switch (l.ctx) {
                case Ctx::Root: return r_.RootMember(key, value);
                case Ctx::Views: return r_.View(value);
                case Ctx::View: return r_.ViewMember(l.view, key, value);
                case Ctx::Networks: return r_.NetworkOf(value, *l.view);
                case Ctx::Block:
                    if (l.block && key == "blocks") return r_.Children(value, l.view, l.block);
                    return r_.BlockMember(l.block, l.view, l.parent, key, value);
                case Ctx::Blocks: return r_.Tree(value, l.view, l.block);
                case Ctx::Signals: return r_.Signal(value, *l.block);
                case Ctx::Pins: return r_.Pin(value, *l.block);
                case Ctx::Skip: return true;
            }
            return true;
        }

        // A large member is read in parts where the whole-file reading would walk into it, and
        // whole (where its reader reports what is wrong with it) anywhere else.
        bool Enter(od::raw_json_string key, bool object, size_t members, Take& take) override {
            const Level l = stack_.back();
            Level next{Ctx::Skip, l.view, l.block, l.parent};
            take = Take::Whole;
            switch (l.ctx) {
                case Ctx::Root:
                    if (!r_.Marked(key)) return false;
                    if (key == "views" && !object) {
                        next.ctx = Ctx::Views;
                    } else if (key == "format" || key == "version" || key == "name" || key == "properties" ||
                               key == "views") {
                        return true;
                    }
                    break;
                case Ctx::Views:
                    if (!object) return true;
                    next = {Ctx::View, nullptr, nullptr, nullptr};
                    break;
                case Ctx::View:
                    if (!l.view || key == "name" || key == "properties") return true;
                    if (key == "top" && object) {
                        if (l.view->GetBlock()) return r_.Shape("a view has two top blocks");
                        next = {Ctx::Block, l.view, nullptr, nullptr};
                    } else if (key == "networks" && !object) {
                        next.ctx = Ctx::Networks;
                    } else if (key == "top" || key == "networks") {
                        return true;
                    }
                    break;
                case Ctx::Block:
                    if (!l.block) return true;
                    if (!object && (key == "signals" || key == "pins" || key == "blocks")) {
                        next = {key == "signals" ? Ctx::Signals : key == "pins" ? Ctx::Pins : Ctx::Blocks, l.view,
                                l.block, nullptr};
                        // Names of signals and child blocks seldom repeat: they get room at once,
                        // and a block has about as many children as signals, which come first.
                        if (next.ctx != Ctx::Pins) r_.design_.ReserveNames(next.ctx == Ctx::Signals ? 2 * members : members);
                    } else if (key == "name" || key == "type" || key == "properties" || key == "signals" ||
                               key == "pins" || key == "blocks") {
                        return true;
                    }
                    break;
                case Ctx::Blocks:
                    if (!object) return true;
                    next = {Ctx::Block, l.view, nullptr, l.block};
                    break;
                case Ctx::Networks:
                case Ctx::Signals:
                case Ctx::Pins: return true;
                case Ctx::Skip: break;
            }
            take = Take::Parts;
            stack_.push_back(next);
            return true;
        }

        bool Leave() override {
            const Level l = stack_.back();
            stack_.pop_back();
            if (l.ctx == Ctx::Block && !l.block) return r_.Shape("a block has no \"name\"");
            if (l.ctx == Ctx::View && !l.view) return r_.Shape("a view has no \"name\"");
            return true;
        }

    private:
        enum class Ctx { Root, Views, View, Networks, Block, Blocks, Signals, Pins, Skip };
        // A large container being read: what it is, and the view and block it belongs to (for
        // a block: the block, null until its name is read, and its parent).
        struct Level {
            Ctx ctx;
            Ndm_View* view = nullptr;
            Ndm_Block* block = nullptr;
            Ndm_Block* parent = nullptr;
        };
        Reader& r_;
        std::vector<Level> stack_;
    };

    // Makes room for the signals (kind 1) or pins (kind 2) an array lists, so that the member
    // lists do not keep the slack of their growth. Counting skips over the array once; child
    // blocks are not counted, since their arrays nest and counting each would cost the square of
    // the depth. A malformed array is left to the reading that follows to report.
    static void Reserve(od::array& array, Ndm_Block& block, int kind) {
        size_t n = 0;
        if (array.count_elements().get(n) != simdjson::SUCCESS || n == 0) return;
        block.Reserve(0, kind == 1 ? n : 0, kind == 2 ? n : 0);
    }

    bool Signals(od::value value, Ndm_Block& block) {
        od::array array;
        if (error_code e = value.get_array().get(array)) return JsonError(e, "\"signals\" must be an array");
        Reserve(array, block, 1);
        for (auto item : array) {
            od::value value;
            if (error_code e = std::move(item).get(value)) return JsonError(e, "bad signal");
            if (!Signal(value, block)) return false;
        }
        return true;
    }

    bool Signal(od::value value, Ndm_Block& block) {
        od::json_type type;
        if (error_code e = value.type().get(type)) return JsonError(e, "bad signal");
        if (type == od::json_type::string) {  // a signal without properties: its name
            const char* name;
            if (!Name(value, name, "signal name", true)) return false;
            signals_.push_back(block.CreateSignal(Ndm_Interned{name}));
            return true;
        }
        od::object object;
        if (error_code e = value.get_object().get(object)) return JsonError(e, "a signal must be a name or an object");
        Ndm_Signal* signal = nullptr;
        for (auto fitem : object) {
            od::field field;
            if (error_code e = std::move(fitem).get(field)) return JsonError(e, "bad signal member");
            od::raw_json_string key = field.key();
            if (key == "name") {
                const char* name;
                if (!Name(field.value(), name, "signal \"name\"", true)) return false;
                if (signal) return Shape("a signal has two names");
                signal = block.CreateSignal(Ndm_Interned{name});
                signals_.push_back(signal);
            } else if (key == "properties") {
                if (!signal) return Shape("a signal must start with its \"name\"");
                if (!Properties(field.value(), *signal)) return false;
            }
        }
        if (!signal) return Shape("a signal has no \"name\"");
        return true;
    }

    bool Pins(od::value value, Ndm_Block& block) {
        od::array array;
        if (error_code e = value.get_array().get(array)) return JsonError(e, "\"pins\" must be an array");
        Reserve(array, block, 2);
        for (auto item : array) {
            od::value value;
            if (error_code e = std::move(item).get(value)) return JsonError(e, "bad pin");
            if (!Pin(value, block)) return false;
        }
        return true;
    }

    bool Pin(od::value value, Ndm_Block& block) {
        od::json_type type;
        if (error_code e = value.type().get(type)) return JsonError(e, "bad pin");
        if (type == od::json_type::array) return ShortPin(value, block);
        od::object object;
        if (error_code e = value.get_object().get(object)) return JsonError(e, "a pin must be an array or an object");
        Ndm_Pin* pin = nullptr;
        const char* name = nullptr;
        Ndm_Dir dir = Ndm_Dir::None;
        auto make = [&] {
            if (!pin) pin = block.CreatePin(Ndm_Interned{name}, dir);
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
                if (!Ndm_DirFromName(text, dir)) return Shape("pin \"dir\" must be \"input\", \"output\" or \"inout\"");
            } else if (key == "signal") {
                uint64_t n;
                if (error_code e = field.value().get_uint64().get(n))
                    return JsonError(e, "pin \"signal\" must be a signal number");
                make();
                Connect(pin, n);
            } else if (key == "properties") {
                make();
                if (!Properties(field.value(), *pin)) return false;
            }
        }
        if (!name) return Shape("a pin has no \"name\"");
        make();
        return true;
    }

    // A pin without properties: [name, direction ("" for none), signal number (left out for
    // none)].
    bool ShortPin(od::value value, Ndm_Block& block) {
        static const char* const kForm = "a pin array holds a name, a direction and a signal number";
        od::array parts;
        if (error_code e = value.get_array().get(parts)) return JsonError(e, kForm);
        const char* name = nullptr;
        Ndm_Dir dir = Ndm_Dir::None;
        uint64_t signal = 0;
        size_t count = 0;
        for (auto item : parts) {
            od::value part;
            if (error_code e = std::move(item).get(part)) return JsonError(e, kForm);
            switch (count++) {
                case 0:
                    if (!Name(part, name, "pin name")) return false;
                    break;
                case 1: {
                    std::string_view text;
                    if (!String(part, text, "pin direction")) return false;
                    if (!text.empty() && !Ndm_DirFromName(text, dir))
                        return Shape("a pin direction must be \"input\", \"output\", \"inout\" or \"\"");
                    break;
                }
                case 2:
                    if (error_code e = part.get_uint64().get(signal))
                        return JsonError(e, "a pin's signal must be a signal number");
                    break;
                default: return Shape(kForm);
            }
        }
        if (count < 2) return Shape(kForm);
        Ndm_Pin* pin = block.CreatePin(Ndm_Interned{name}, dir);
        if (count == 3) Connect(pin, signal);
        return true;
    }

    // A child block is made under a stand-in name and gets its interned one eight blocks later:
    // the slot the name takes in the name set has come into the cache meanwhile. (Nothing looks
    // a block up by its name while the file is read.)
    Ndm_Block* CreateWaiting(Ndm_Block& parent, std::string_view name) {
        if (waiting_.full()) NameOldest();
        auto& w = waiting_.Add(name, design_.PrefetchName(name));
        w.payload = parent.CreateBlock(Ndm_Interned{w.text.c_str()});
        return w.payload;
    }
    void NameOldest() {
        auto& w = waiting_.TakeOldest();
        bool added = false;
        w.payload->SetInternedName(Ndm_Interned{design_.InternRare(w.text, w.hash, added)});
    }
    void NameAll() {
        while (!waiting_.empty()) NameOldest();
    }

    // Connects a pin to signal number n, a few pins later or, for a signal further down the
    // file, at the end. Pins reach their signals in no order, far apart in signals_: the
    // signal's entry is fetched meanwhile.
    void Connect(Ndm_Pin* pin, uint64_t n) {
        if (n >= signals_.size()) {
            pending_.emplace_back(pin, n);
            return;
        }
        __builtin_prefetch(&signals_[n]);
        Connection& slot = ahead_[ahead_next_];
        if (ahead_count_ == kAhead)
            slot.pin->SetSignal(signals_[slot.signal]);
        else
            ++ahead_count_;
        slot = Connection{pin, n};
        ahead_next_ = (ahead_next_ + 1) % kAhead;
    }
    void ConnectAhead() {
        for (size_t i = 0; i < ahead_count_; ++i) ahead_[i].pin->SetSignal(signals_[ahead_[i].signal]);
        ahead_count_ = ahead_next_ = 0;
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

    // The properties of a design object. List properties nest as deeply as the file makes
    // them, so the reader keeps its own stack of open lists: a frame per array of property
    // objects, with the list property it fills (none for the object's own array).
    bool Properties(od::value value, Ndm_PropertyHolder& holder) {
        std::vector<ListFrame>& stack = lists_;
        stack.clear();
        auto open = [&](od::value v, Ndm_Property* list) {
            od::array array;
            ListFrame frame{list, {}, {}};
            if (error_code e = v.get_array().get(array)) return JsonError(e, "\"properties\" must be an array");
            if (error_code e = array.begin().get(frame.item)) return JsonError(e, "a property must be an object");
            if (error_code e = array.end().get(frame.end)) return JsonError(e, "a property must be an object");
            stack.push_back(frame);
            return true;
        };
        if (!open(value, nullptr)) return false;
        std::string& name = prop_name_;
        std::string& type = prop_type_;
        while (!stack.empty()) {
            ListFrame& frame = stack.back();
            if (!(frame.item != frame.end)) {
                stack.pop_back();
                if (!stack.empty()) ++stack.back().item;
                continue;
            }
            od::object object;
            if (error_code e = (*frame.item).get_object().get(object))
                return JsonError(e, "a property must be an object");
            std::string_view text;
            od::value v;
            if (error_code e = object.find_field("name").get(v)) return JsonError(e, "a property needs a \"name\"");
            if (!String(v, text, "property \"name\"")) return false;
            name.assign(text);
            if (error_code e = object.find_field("type").get(v))
                return JsonError(e, "property \"name\" must be followed by \"type\"");
            if (!String(v, text, "property \"type\"")) return false;
            type.assign(text);
            if (error_code e = object.find_field("value").get(v))
                return JsonError(e, "property \"type\" must be followed by \"value\"");
            if (type == "list") {
                Ndm_Property* list = frame.list ? frame.list->CreatePropertyList(name.c_str())
                                                : holder.CreatePropertyList(name.c_str());
                if (!open(v, list)) return false;  // frame is not used after this
                continue;  // the item moves on once the entries are read
            }
            if (!(frame.list ? Value(v, *frame.list, name.c_str(), type) : Value(v, holder, name.c_str(), type)))
                return false;
            ++frame.item;
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
    struct ListFrame {  // an array of property objects being read, and the list it fills
        Ndm_Property* list;
        od::array_iterator item, end;
    };
    std::vector<ListFrame> lists_;
    std::string prop_name_, prop_type_;
    std::vector<std::pair<Ndm_Pin*, uint64_t>> pending_;
    Ndm_WaitingNames<Ndm_Block*> waiting_;  // blocks under stand-in names
    struct Connection {
        Ndm_Pin* pin;
        uint64_t signal;
    };
    static constexpr size_t kAhead = 16;
    Connection ahead_[kAhead];  // pins waiting to be connected, a ring
    size_t ahead_count_ = 0, ahead_next_ = 0;
    bool marked_ = false;                      // the file starts with the marker
    size_t networks_ = 0, opened_ = 0;          // networks and blocks read, for giving pages back
    Ndm_JsonChunks::Reader* pieces_ = nullptr;  // while a large file is read in pieces
};

}  // namespace

std::unique_ptr<Ndm_Design> Ndm_ReadNative(const char* path) {
    if (!path) return nullptr;
    auto design = std::make_unique<Ndm_Design>("");
    Reader reader(path, *design);
    if (!reader.Read()) return nullptr;
    return design;
}
