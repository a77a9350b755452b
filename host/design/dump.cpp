#include "host/design/dump.h"
#include "host/port/json_text.h"

#include <algorithm>
#include <cstdio>
#include <type_traits>
#include <span>
#include <string>
#include <utility>
#include <vector>

namespace {

class Dumper {
public:
    explicit Dumper(std::ostream& out) : out_(out) { buf_.reserve(kFlush + 4096); }
    ~Dumper() { Flush(); }

    void Design(const Ndm_Design& design) {
        Line(0, "design");
        Quoted(design.GetName());
        End();
        Properties(design, 1);
        for (const Ndm_View* view : design.GetViewItr()) View(*view);
    }

private:
    static constexpr size_t kFlush = 1 << 16;

    // Beyond this many levels, lines stop moving right and names show only their last levels,
    // so that every line is bounded whatever the depth and the dump grows with the design.
    static constexpr uint32_t kLevels = 32;

    void View(const Ndm_View& view) {
        Line(0, "view");
        Quoted(view.GetName());
        End();
        Properties(view, 1);
        if (const Ndm_Block* top = view.GetBlock()) Tree(*top);
        for (const Ndm_Network* net : view.GetNetworkItr()) {
            Line(1, "network");
            // not net->GetName(), which would keep every name
            if (const Ndm_Signal* top = net->GetTopSignal()) {
                FullName(*top);
            } else {
                Quoted("");
            }
            buf_ += " signals ";
            buf_ += std::to_string(net->GetNumSignals());
            End();
            Properties(*net, 2);
            for (const Ndm_Signal* s = net->GetFirstSignal(); s; s = s->GetNextInNetwork()) {
                Line(2, "signal");
                FullName(*s);
                End();
            }
        }
    }

    // Blocks in preorder with their own stack: hierarchies can be very deep.
    void Tree(const Ndm_Block& root) {
        std::vector<std::pair<const Ndm_Block*, size_t>> stack;  // block, next child
        BlockLines(root, 1);
        stack.emplace_back(&root, 0);
        while (!stack.empty()) {
            auto& [block, next] = stack.back();
            auto children = block->GetBlockItr();
            if (next == children.size()) {
                stack.pop_back();
                continue;
            }
            const Ndm_Block* child = children[next++];
            BlockLines(*child, static_cast<int>(stack.size()) + 1);
            stack.emplace_back(child, 0);  // block and next are not used after this
        }
    }

    // A block's own line, its properties, signals and pins.
    void BlockLines(const Ndm_Block& block, int depth) {
        Line(depth, "block");
        if (block.GetParent()) {
            FullName(block);
        } else {
            Quoted(block.GetName());  // the top block's full name is empty
        }
        buf_ += " type ";
        Quoted(block.GetTypeName());
        End();
        Properties(block, depth + 1);
        for (const Ndm_Signal* signal : block.GetSignalItr()) {
            Line(depth + 1, "signal");
            FullName(*signal);
            End();
            Properties(*signal, depth + 2);
        }
        for (const Ndm_Pin* pin : block.GetPinItr()) {
            Line(depth + 1, "pin");
            FullName(*pin);
            buf_ += ' ';
            buf_ += pin->GetDirection() == Ndm_Dir::None ? "none" : Ndm_DirName(pin->GetDirection());
            if (const Ndm_Signal* signal = pin->GetSignal()) {
                buf_ += " -> ";
                FullName(*signal);
            }
            End();
            Properties(*pin, depth + 2);
        }
    }

    // Properties, list entries one level deeper below their list, with their own stack.
    void Properties(const Ndm_PropertyHolder& holder, int depth) {
        if (!holder.GetNumProperties()) return;
        const Ndm_PropertyRange props = holder.GetPropertyItr();
        top_props_.assign(props.begin(), props.end());
        std::vector<std::pair<Ndm_EntryRange, size_t>>& stack = lists_;
        stack.assign(1, {Ndm_EntryRange(top_props_), 0});
        while (!stack.empty()) {
            auto& [list, next] = stack.back();
            if (next == list.size()) {
                stack.pop_back();
                continue;
            }
            const Ndm_Property* p = list[next++];
            Property(*p, depth + static_cast<int>(stack.size()) - 1);
            if (p->GetNumEntries()) stack.emplace_back(p->GetListItr(), 0);  // list and next are not used after this
        }
    }

    void Property(const Ndm_Property& p, int depth) {
        Line(depth, "%");
        Quoted(p.GetName());
        buf_ += ' ';
        const char* type = Ndm_PropTypeName(p.GetType());
        buf_ += type ? type : "unknown";
        buf_ += ' ';
        switch (p.GetType()) {
            case NDM_PROP_BOOL: buf_ += p.GetBool() ? "true" : "false"; break;
            case NDM_PROP_INT32: buf_ += std::to_string(p.GetInt32()); break;
            case NDM_PROP_FLOAT64: {
                char num[32];
                std::snprintf(num, sizeof num, "%.17g", p.GetFloat64());
                buf_ += num;
                break;
            }
            case NDM_PROP_STRING: Quoted(p.GetValueString()); break;
            case NDM_PROP_STRING_LIST: {
                buf_ += '[';
                bool first = true;
                for (const std::string& s : p.GetStrings()) {
                    if (!first) buf_ += ", ";
                    first = false;
                    Quoted(s.c_str(), s.size());
                }
                buf_ += ']';
                break;
            }
            case NDM_PROP_LIST: buf_ += std::to_string(p.GetNumEntries()); break;
            default: break;
        }
        End();
    }

    void Line(int depth, const char* word) {
        buf_.append(static_cast<size_t>(std::min(depth, static_cast<int>(kLevels))) * 2, ' ');
        buf_ += word;
        buf_ += ' ';
    }

    void End() {
        buf_ += '\n';
        if (buf_.size() >= kFlush) Flush();
    }

    void Flush() {
        out_.write(buf_.data(), static_cast<std::streamsize>(buf_.size()));
        buf_.clear();
    }

    // The full name, or ".../" and its last kLevels levels for an object deeper than that.
    void FullName(const Ndm_Block& block) {
        name_.clear();
        BlockName(block);
        Quoted(name_.c_str(), name_.size());
    }

    template <class T>  // a signal or a pin
    void FullName(const T& object) {
        name_.clear();
        BlockName(*object.GetBlock());
        if (!name_.empty()) name_ += std::is_same_v<T, Ndm_Pin> ? '.' : '/';
        name_ += object.GetName();
        Quoted(name_.c_str(), name_.size());
    }

    void BlockName(const Ndm_Block& block) {
        if (block.GetDepth() <= kLevels) {
            block.AppendFullName(name_);
            return;
        }
        const Ndm_Block* chain[kLevels];
        const Ndm_Block* b = &block;
        for (uint32_t i = 0; i < kLevels; ++i, b = b->GetParent()) chain[i] = b;
        name_ += ".../";
        for (uint32_t i = kLevels; i-- > 0;) {
            name_ += chain[i]->GetName();
            if (i) name_ += '/';
        }
    }

    void Quoted(const char* text) { Quoted(text ? text : "", text ? std::char_traits<char>::length(text) : 0); }

    void Quoted(const char* text, size_t size) { Port_AppendJsonString(buf_, std::string_view(text, size)); }

    std::ostream& out_;
    std::string buf_;
    std::string name_;
    std::vector<std::pair<Ndm_EntryRange, size_t>> lists_;  // open property lists
    std::vector<Ndm_Property*> top_props_;  // the properties of the object being printed
};

}  // namespace

void Ndm_Dump(const Ndm_Design& design, std::ostream& out) {
    Dumper dumper(out);
    dumper.Design(design);
}
