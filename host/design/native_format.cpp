// The native design file, writing side: the design in file order, with its own stacks for the
// block tree and nested property lists; and the test for the file's marker.
#include "host/design/native_format.h"

#include <simdjson.h>

#include <cmath>
#include <cstdio>
#include <cstring>
#include <span>
#include <string>
#include <utility>
#include <vector>

#include "host/design/json_input.h"
#include "host/design/name_pool.h"
#include "host/port/file.h"
#include "host/port/json_text.h"
#include "host/port/msgman.h"

namespace {

using Ndm_JsonInput::Msg;

class Writer {
public:
    Writer(const Ndm_Design& design, const char* path) : design_(design), path_(path), file_(path) {
        buf_.reserve(kFlush + 4096);
    }

    bool Write() {
        if (!file_.error().empty()) return Fail(file_.error());
        Number();
        buf_ += "{\"format\":\"lun-design\",\"version\":2,\"name\":";
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
            Tree(*view.GetBlock());
        }
        buf_ += ",\"networks\":[";
        bool first = true;
        for (const Ndm_Network* net : view.GetNetworkItr()) {
            buf_ += first ? "\n" : ",\n";
            first = false;
            // A network is named after its top signal, found again on reading; its full name
            // would make the file grow with the square of the hierarchy's depth.
            buf_ += '{';
            if (net->GetNumProperties()) {
                buf_ += "\"properties\":";
                PropertyList(net->GetPropertyItr());
                buf_ += ',';
            }
            buf_ += "\"signals\":[";
            for (const Ndm_Signal* s = net->GetFirstSignal(); s; s = s->GetNextInNetwork()) {
                if (s != net->GetFirstSignal()) buf_ += ',';
                Uint(Ordinal(s) - 1);
            }
            buf_ += "]}";
            Check();
        }
        buf_ += "]}";
    }

    // The tree below and including root, blocks in preorder, with its own stack (hierarchies
    // can be very deep).
    void Tree(const Ndm_Block& root) {
        struct Frame {
            const Ndm_Block* block;
            size_t next = 0;
        };
        std::vector<Frame> stack;
        auto open = [&](const Ndm_Block& block) {
            BlockHead(block);
            if (block.GetNumBlocks()) {
                buf_ += ",\"blocks\":[";
                stack.push_back({&block});
            } else {
                buf_ += '}';
                Check();
            }
        };
        open(root);
        while (!stack.empty()) {
            Frame& frame = stack.back();
            auto children = frame.block->GetBlockItr();
            if (frame.next == children.size()) {
                buf_ += "]}";
                Check();
                stack.pop_back();
                continue;
            }
            buf_ += frame.next ? ",\n" : "\n";
            open(*children[frame.next++]);  // frame is not used after this
        }
    }

    // A block's members up to its children.
    void BlockHead(const Ndm_Block& block) {
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
                if (!first) buf_ += ',';
                first = false;
                if (!s->GetNumProperties()) {  // the short form: the name alone
                    Str(s->GetName());
                    Check();
                    continue;
                }
                buf_ += "\n{\"name\":";
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
                if (!first) buf_ += ',';
                first = false;
                // A pin may still point at a signal of a deleted block; that link is dropped.
                const uint64_t n = p->GetSignal() ? Ordinal(p->GetSignal()) : 0;
                if (!p->GetNumProperties()) {  // the short form: [name, direction, signal]
                    buf_ += '[';
                    Str(p->GetName());
                    buf_ += ",\"";
                    buf_ += Ndm_DirName(p->GetDirection());  // "" for none
                    buf_ += '"';
                    if (n) {
                        buf_ += ',';
                        Uint(n - 1);
                    }
                    buf_ += ']';
                    Check();
                    continue;
                }
                buf_ += "\n{\"name\":";
                Str(p->GetName());
                if (p->GetDirection() != Ndm_Dir::None) {
                    buf_ += ",\"dir\":\"";
                    buf_ += Ndm_DirName(p->GetDirection());
                    buf_ += '"';
                }
                if (n) {
                    buf_ += ",\"signal\":";
                    Uint(n - 1);
                }
                Properties(*p);
                buf_ += '}';
                Check();
            }
            buf_ += ']';
        }
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

    // Lists may nest as deeply as a file made them: the writer keeps its own stack.
    void PropertyList(Ndm_PropertyRange props) {
        top_props_.assign(props.begin(), props.end());
        std::vector<std::pair<Ndm_EntryRange, size_t>>& stack = lists_;
        stack.assign(1, {Ndm_EntryRange(top_props_), 0});
        buf_ += '[';
        while (!stack.empty()) {
            auto& [list, next] = stack.back();
            if (next == list.size()) {
                stack.pop_back();
                buf_ += stack.empty() ? "]" : "]}";
                continue;
            }
            const Ndm_Property* p = list[next++];
            if (next > 1) buf_ += ',';
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
                case NDM_PROP_LIST:
                    buf_ += '[';
                    stack.emplace_back(p->GetListItr(), 0);  // list and next are not used after this
                    continue;
                default: buf_ += p->GetBool() ? "true" : "false"; break;
            }
            buf_ += '}';
            Check();
        }
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
    std::vector<std::pair<Ndm_EntryRange, size_t>> lists_;  // open property lists
    std::vector<Ndm_Property*> top_props_;  // the properties of the object being written
    bool ok_ = true;
    std::string why_;
};

}  // namespace

bool Ndm_WriteNative(const Ndm_Design& design, const char* path) {
    if (!path) return false;
    Writer writer(design, path);
    return writer.Write();
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
