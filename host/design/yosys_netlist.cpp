// The Yosys netlist reader, second half: the design built from the modules read, with the
// hierarchy expanded, pins connected and networks formed.
#include <algorithm>
#include <cstring>
#include <numeric>

#include "host/design/yosys_reader_impl.h"
#include "host/port/msgman.h"

namespace ndm_yosys {

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
        Ndm_Dir& dir = m.conn_dirs[cell.first_conn + k];
        if (dir != Ndm_Dir::None) continue;
        if (const Port* port = FindPort(box, m.conns[cell.first_conn + k].name)) dir = port->dir;
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

// Depth-first over the instantiations from the top module, with its own stack (a netlist may
// nest tens of thousands of levels); each module is counted (Count) once all it instantiates
// has been.
bool Reader::CheckCycles(uint32_t top) {
    struct Frame {
        uint32_t module;
        size_t next_cell = 0;
    };
    std::vector<Frame> stack;
    if (modules_[top].state == 2) return true;
    modules_[top].state = 1;
    stack.push_back({top});
    while (!stack.empty()) {
        Frame& frame = stack.back();
        Module& m = modules_[frame.module];
        if (frame.next_cell == m.cells.size()) {
            Count(m);
            m.state = 2;
            postorder_.push_back(frame.module);
            stack.pop_back();
            continue;
        }
        const int32_t sub = m.cells[frame.next_cell++].sub;
        if (sub < 0 || modules_[sub].state == 2) continue;
        if (modules_[sub].state == 1) {
            auto first = std::find_if(stack.begin(), stack.end(),
                                      [&](const Frame& f) { return f.module == static_cast<uint32_t>(sub); });
            std::string chain;
            for (auto it = first; it != stack.end(); ++it) {
                chain += modules_[it->module].name;
                chain += " -> ";
            }
            chain += modules_[sub].name;
            return Error(Port_Format("Module '%s' in '%s' instantiates itself: %s.", modules_[sub].name, path_,
                                     chain.c_str()));
        }
        modules_[sub].state = 1;
        stack.push_back({static_cast<uint32_t>(sub)});
    }
    return true;
}

// What one instance of m expands to; the modules it instantiates are counted already.
void Reader::Count(Module& m) {
    Expansion& e = m.below;
    e.bits = m.num_bits;
    e.signals = m.num_signals;
    for (const Cell& cell : m.cells) {
        e.blocks = Expansion::Add(e.blocks, 1);
        for (uint32_t k = 0; k < cell.num_conns; ++k) e.pins = Expansion::Add(e.pins, m.conns[cell.first_conn + k].bits.count);
        if (cell.sub < 0) continue;
        const Expansion& sub = modules_[cell.sub].below;
        e.blocks = Expansion::Add(e.blocks, sub.blocks);
        e.bits = Expansion::Add(e.bits, sub.bits);
        e.signals = Expansion::Add(e.signals, sub.signals);
        e.pins = Expansion::Add(e.pins, sub.pins);
    }
}

// Refuses a netlist whose expansion would pass the instance limit, or the 32-bit counts of bit
// ids and of signals (and so of networks and their members), before anything is made.
// How many instances of each module below the top the expansion makes: the parents' counts
// summed over their cells, parents first (the reverse of the order CheckCycles finished them).
void Reader::CountInstances(uint32_t top) {
    for (Module& m : modules_) m.instances = 0;
    modules_[top].instances = 1;
    for (auto it = postorder_.rbegin(); it != postorder_.rend(); ++it) {
        Module& m = modules_[*it];
        for (const Cell& cell : m.cells)
            if (cell.sub >= 0) modules_[cell.sub].instances = Expansion::Add(modules_[cell.sub].instances, m.instances);
    }
}

bool Reader::CheckSize(uint32_t top) {
    const Module& m = modules_[top];
    const Expansion& e = m.below;
    auto count = [](uint64_t n) {
        return n >= Expansion::kMany ? std::string("more than 4611686018427387904") : std::to_string(n);
    };
    const uint64_t blocks = Expansion::Add(e.blocks, 1);
    if (blocks > max_cells_)
        return Error(Port_Format("Netlist '%s' expands to %s instances below top module '%s', more than the limit of "
                                 "%llu. Raise the limit (LUN_MAX_CELLS, or quillmap --max-cells) if the machine has "
                                 "the memory for that many.",
                                 path_, count(blocks).c_str(), m.name, static_cast<unsigned long long>(max_cells_)));
    constexpr uint64_t kMaxCount = INT32_MAX;
    for (auto [n, what] : {std::pair{e.bits, "bits"}, std::pair{e.signals, "signals"}, std::pair{e.pins, "pins"}})
        if (n > kMaxCount)
            return Error(Port_Format("Netlist '%s' expands to %s %s below top module '%s', more than the %llu one "
                                     "design can hold.",
                                     path_, count(n).c_str(), what, m.name, static_cast<unsigned long long>(kMaxCount)));
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

namespace {

// Appends the name of bit i of a vector: name[index] where bit 0 is the least significant and
// index counts from offset (downwards when upto).
void AppendBitName(std::string& out, const char* name, uint32_t width, int32_t offset, bool upto, uint32_t i) {
    const int64_t index = upto ? int64_t{offset} + width - 1 - i : int64_t{offset} + i;
    out += name;
    out += '[';
    out += std::to_string(index);
    out += ']';
}

}  // namespace

// Name of bit i of a vector: the plain name for a single bit at index 0, else AppendBitName's.
const char* Reader::BitName(const char* name, uint32_t width, int32_t offset, bool upto, uint32_t i) {
    if (width == 1 && offset == 0) return name;
    bit_text_.clear();
    AppendBitName(bit_text_, name, width, offset, upto, i);
    return design_.Intern(bit_text_);
}

// Names of all bits of a vector, in bit order (BitName for each), interned together.
std::span<const char* const> Reader::BitNames(const char* name, uint32_t width, int32_t offset, bool upto) {
    bit_names_.resize(width);
    if (width == 1 && offset == 0) {
        bit_names_[0] = name;
        return bit_names_;
    }
    bit_text_.clear();
    bit_ends_.clear();
    for (uint32_t i = 0; i < width; ++i) {
        AppendBitName(bit_text_, name, width, offset, upto, i);
        bit_ends_.push_back(bit_text_.size());
    }
    bit_views_.resize(width);
    for (size_t i = 0, begin = 0; i < width; begin = bit_ends_[i++])
        bit_views_[i] = std::string_view(bit_text_).substr(begin, bit_ends_[i] - begin);
    design_.InternAll(bit_views_, bit_names_.data());
    return bit_names_;
}

const char* Reader::PinName(const char* name, uint32_t width, int32_t offset, bool upto, uint32_t i) {
    if (width == 1 && offset == 0) return name;
    const size_t first = reinterpret_cast<uintptr_t>(pin_names_of_.Find(name));
    if (first) {
        const PinNames& known = pin_names_[first - 1];
        if (known.width == width && known.offset == offset && known.upto == upto) return known.names[i];
        return BitName(name, width, offset, upto, i);  // the same port name with another range: rare
    }
    const std::span<const char* const> names = BitNames(name, width, offset, upto);
    pin_names_.push_back(PinNames{width, offset, upto, {names.begin(), names.end()}});
    pin_names_of_.InsertIfAbsent(name, reinterpret_cast<void*>(static_cast<uintptr_t>(pin_names_.size())));
    return pin_names_.back().names[i];
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

// Expands module below block: the instances in preorder (each block's signals, then its
// cells in stored order, an expanded cell's subtree before the next cell), with its own stack
// (a netlist may nest tens of thousands of levels). Each instance gets its bit ids from Alloc
// when its cell is met, and the cell's port bits are joined to the parent's bits right away.
bool Reader::Expand(Ndm_Block* block, uint32_t module) {
    struct Frame {
        Ndm_Block* block;
        uint32_t module;
        uint32_t base;
        size_t next_cell = 0;
    };
    std::vector<Frame> stack;
    auto enter = [&](Ndm_Block* b, uint32_t mod, uint32_t base) {
        const Module& m = modules_[mod];
        instances_.push_back({b, mod, base});
        b->Reserve(m.cells.size(), m.num_signals, 0);
        for (const Net& net : m.nets)
            for (const char* name : BitNames(net.name, net.bits.count, net.offset, net.upto))
                b->CreateSignal(Ndm_Interned{name});
        stack.push_back({b, mod, base});
    };
    enter(block, module, Alloc(modules_[module].num_bits));
    while (!stack.empty()) {
        Frame& frame = stack.back();
        Module& m = modules_[frame.module];
        if (frame.next_cell == m.cells.size()) {
            // The module's last instance is made: its cells and connections are not needed
            // again (the networks need its nets and bits).
            if (--m.instances == 0) {
                m.cells.clear();
                m.conns.clear();
                m.conn_dirs.clear();
            }
            stack.pop_back();
            continue;
        }
        // A module made once lets its cells and connections go as they are passed (a flat
        // netlist's top module holds them all).
        if (m.instances == 1 && (frame.next_cell & (Blocks<Cell>::kBlock - 1)) == 0 && frame.next_cell) {
            const Cell& next = m.cells[frame.next_cell];
            m.conns.DropBefore(next.first_conn);
            m.conn_dirs.DropBefore(next.first_conn);
            m.cells.DropBefore(frame.next_cell);
        }
        const Cell& cell = m.cells[frame.next_cell++];
        if (frame.next_cell < m.cells.size()) FetchSignalsOf(m, m.cells[frame.next_cell]);
        Ndm_Block* child = frame.block->CreateBlock(Ndm_Interned{cell.name});
        if (!ExpandCell(child, m, cell)) return false;
        if (cell.sub < 0) continue;
        const uint32_t child_base = Alloc(modules_[cell.sub].num_bits);
        const Module& sub = modules_[cell.sub];
        for (uint32_t k = 0; k < cell.num_conns; ++k) {
            const Conn& conn = m.conns[cell.first_conn + k];
            const Port* port = FindPort(modules_[cell.sub], conn.name);
            uint32_t width = std::min(conn.bits.count, port->bits.count);
            for (uint32_t i = 0; i < width; ++i) {
                int32_t outer = m.bits[conn.bits.first + i];
                int32_t inner = sub.bits[port->bits.first + i];
                if (outer >= 0 && inner >= 0)
                    Union(frame.base + static_cast<uint32_t>(outer), child_base + static_cast<uint32_t>(inner));
            }
        }
        enter(child, static_cast<uint32_t>(cell.sub), child_base);  // frame is not used after this
    }
    return true;
}

// Starts bringing into the cache where the signals of a cell's bits are found: the next cell's,
// while this one is made (a cell's bits are anywhere in the module).
void Reader::FetchSignalsOf(const Module& m, const Cell& cell) {
    for (uint32_t k = 0; k < cell.num_conns; ++k) {
        const Conn& conn = m.conns[cell.first_conn + k];
        for (uint32_t i = 0; i < conn.bits.count; ++i)
            if (const int32_t bit = m.bits[conn.bits.first + i]; bit >= 0) __builtin_prefetch(&m.bit_signal[bit]);
    }
}

// The block of one cell of m: its type and its pins on the signals of the parent block.
bool Reader::ExpandCell(Ndm_Block* child, Module& m, const Cell& cell) {
    if (cell.type)
        child->SetTypeName(Ndm_Interned{cell.type});
    else
        child->SetTypeName("");
    const Ndm_SignalRange signals = child->GetParent()->GetSignalItr();
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
        Ndm_Dir dir = port ? port->dir : m.conn_dirs[cell.first_conn + k];
        for (uint32_t i = 0; i < conn.bits.count; ++i) {
            const char* name = port ? PinName(conn.name, conn.bits.count, port->offset, port->upto, i)
                                    : PinName(conn.name, conn.bits.count, 0, false, i);
            Ndm_Pin* pin = child->CreatePin(Ndm_Interned{name}, dir);
            int32_t bit = m.bits[conn.bits.first + i];
            if (bit >= 0 && m.bit_signal[bit] >= 0) pin->SetSignal(signals[m.bit_signal[bit]]);
        }
    }
    return true;
}

// Pins of the top block: one per port bit, on the port's own netname when it has one.
void Reader::TopPins(Ndm_Block* block, uint32_t module) {
    Module& m = modules_[module];
    const Ndm_SignalRange signals = block->GetSignalItr();
    // The netname of each port's own name, if any: the ports are looked up by the nets' names
    // (a netlist has a few ports and may have millions of nets).
    constexpr size_t kNone = SIZE_MAX;
    std::vector<size_t> port_net(m.ports.size(), kNone);
    if (!m.ports.empty())
        for (size_t n = 0; n < m.nets.size(); ++n)
            if (const Port* port = FindPort(m, m.nets[n].name)) {
                size_t& net = port_net[static_cast<size_t>(port - m.ports.data())];
                if (net == kNone) net = n;
            }
    size_t num_pins = 0;
    for (const Port& port : m.ports) num_pins += port.bits.count;
    block->Reserve(0, 0, num_pins);
    for (size_t p = 0; p < m.ports.size(); ++p) {
        const Port& port = m.ports[p];
        const size_t n = port_net[p];
        const bool same = n != kNone && m.nets[n].bits.count == port.bits.count;
        const std::span<const char* const> names = BitNames(port.name, port.bits.count, port.offset, port.upto);
        for (uint32_t i = 0; i < port.bits.count; ++i) {
            Ndm_Pin* pin = block->CreatePin(Ndm_Interned{names[i]}, port.dir);
            int32_t bit = m.bits[port.bits.first + i];
            if (same)
                pin->SetSignal(signals[m.net_first_signal[n] + i]);
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
    size_t signals = 0;  // a network has one at least
    for (const Instance& inst : instances_) signals += modules_[inst.module].num_signals;
    view->ReserveNetworks(signals);
    for (const Instance& inst : instances_) {
        Module& m = modules_[inst.module];
        const Ndm_SignalRange signals = inst.block->GetSignalItr();
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
    if (!ResolveTypes() || !ChooseTop(top_module, top) || !CheckCycles(top) || !CheckSize(top)) return false;
    // The JSON input and the parser's buffers are no longer needed.
    doc_ = od::document();
    parser_ = od::parser();
    buf_.Release();
    for (SeenNames& seen : seen_) seen.Release();
    seen_conns_ = Ndm_PtrMap();

    const Module& m = modules_[top];
    design_.SetName(m.name);
    Ndm_View* view = design_.CreateView("EXPANDED");
    Ndm_Block* block = view->CreateTopBlock(m.name);
    block->SetTypeName(m.name);
    PadBoundary(modules_[top]);
    CountInstances(top);
    if (!Expand(block, top)) return false;
    TopPins(block, top);
    // Pins are made: the networks need each module's signals in the order they join, not its
    // bits or netnames, which are let go first (a flat netlist's are tens of megabytes).
    for (const Instance& inst : instances_) {
        Module& m = modules_[inst.module];
        if (m.signal_order.size() != m.num_signals) SignalOrder(m);
    }
    for (Module& m : modules_) {
        std::vector<int32_t>().swap(m.bits);
        std::vector<Net>().swap(m.nets);
        std::vector<uint32_t>().swap(m.net_first_signal);
    }
    Networks(view);
    return true;
}

}  // namespace ndm_yosys
