#include "host/design/ndm.h"

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <stdexcept>
#include <unordered_map>

#include "host/design/name_pool.h"
#include "host/design/object_pool.h"
#include "host/design/property_store.h"

namespace {

// Blocks with at most this many members of a kind are searched directly; a scan of a few
// pointers is cheaper than hashing the query.
constexpr size_t kSmall = 8;

enum Category { kBlocks = 0, kSignals = 1, kPins = 2 };

std::string FoldName(const char* name) {
    std::string folded(name ? name : "");
    for (char& c : folded)
        if (c >= 'A' && c <= 'Z') c = static_cast<char>(c + 32);
    return folded;
}

template <class T, class List>
T* ScanExact(const List& members, const char* name) {
    for (auto* m : members)
        if (std::strcmp(m->GetName(), name) == 0) return m;
    return nullptr;
}

template <class T, class List>
T* ScanFolded(const List& members, const std::string& folded) {
    for (auto* m : members) {
        const char* a = m->GetName();
        size_t i = 0;
        for (; a[i] && i < folded.size(); ++i) {
            char c = a[i];
            if (c >= 'A' && c <= 'Z') c = static_cast<char>(c + 32);
            if (c != folded[i]) break;
        }
        if (a[i] == '\0' && i == folded.size()) return m;
    }
    return nullptr;
}

// Three-way comparison of a name with a text, byte-wise, optionally folding ASCII case.
int CompareName(const char* name, std::string_view text, bool fold) {
    size_t i = 0;
    for (; name[i] && i < text.size(); ++i) {
        unsigned char a = static_cast<unsigned char>(name[i]);
        unsigned char b = static_cast<unsigned char>(text[i]);
        if (fold) {
            if (a >= 'A' && a <= 'Z') a = static_cast<unsigned char>(a + 32);
            if (b >= 'A' && b <= 'Z') b = static_cast<unsigned char>(b + 32);
        }
        if (a != b) return a < b ? -1 : 1;
    }
    if (i == text.size()) return name[i] ? 1 : 0;
    return -1;
}

// Whether name starts with prefix (optionally folding ASCII case).
bool HasPrefix(const char* name, std::string_view prefix, bool fold) {
    for (size_t i = 0; i < prefix.size(); ++i) {
        unsigned char a = static_cast<unsigned char>(name[i]);
        unsigned char b = static_cast<unsigned char>(prefix[i]);
        if (a == 0) return false;
        if (fold) {
            if (a >= 'A' && a <= 'Z') a = static_cast<unsigned char>(a + 32);
            if (b >= 'A' && b <= 'Z') b = static_cast<unsigned char>(b + 32);
        }
        if (a != b) return false;
    }
    return true;
}

}  // namespace

// Per-block hash indexes of members by exact and by case-folded interned name. Name-sorted
// member lists (exact and folded; stored order among equal names) answer prefix queries and
// "every member of that name" when names repeat; they are made on the first such query.
class Ndm_MemberIndex {
public:
    Ndm_PtrMap exact[3];
    Ndm_PtrMap folded[3];
    bool built[3] = {false, false, false};
    bool dup_exact[3] = {false, false, false};   // some name occurs twice
    bool dup_folded[3] = {false, false, false};  // some name occurs twice ignoring case
    bool folded_built[3] = {false, false, false};  // the folded map is made on first need
    uint32_t max_len[3] = {0, 0, 0};             // longest member name
    std::vector<uint32_t> block_lengths;         // distinct child block name lengths, ascending
    std::unique_ptr<std::vector<void*>> sorted[3][2];  // [category][fold]

    static const char* NameOf(int category, const void* member) {
        switch (category) {
            case kBlocks: return static_cast<const Ndm_Block*>(member)->GetName();
            case kSignals: return static_cast<const Ndm_Signal*>(member)->GetName();
            default: return static_cast<const Ndm_Pin*>(member)->GetName();
        }
    }

    void Add(Ndm_Design* design, int category, const char* name, void* member) {
        if (exact[category].InsertIfAbsent(name, member) != member) dup_exact[category] = true;
        if (folded_built[category]) AddFolded(design, category, name, member);
        size_t len = std::strlen(name);
        if (len > max_len[category]) max_len[category] = static_cast<uint32_t>(len);
        if (category == kBlocks) {
            auto at = std::lower_bound(block_lengths.begin(), block_lengths.end(), len);
            if (at == block_lengths.end() || *at != len)
                block_lengths.insert(at, static_cast<uint32_t>(len));
        }
        // A new member is last in stored order: it goes after the equal names.
        for (int fold = 0; fold < 2; ++fold) {
            std::vector<void*>* list = sorted[category][fold].get();
            if (!list) continue;
            auto at = std::upper_bound(list->begin(), list->end(), name,
                                       [&](const char* key, const void* m) {
                                           return CompareName(key, NameOf(category, m), fold) < 0;
                                       });
            list->insert(at, member);
        }
    }
    // A member made after the index: in it once the index of its kind is built.
    void Added(Ndm_Design* design, int category, const char* name, void* member) {
        if (built[category]) Add(design, category, name, member);
    }
    void AddFolded(Ndm_Design* design, int category, const char* name, void* member) {
        if (folded[category].InsertIfAbsent(design->Intern(FoldName(name)), member) != member)
            dup_folded[category] = true;
    }
    // The case-folded map costs an interned folded copy of every name, so it is built only
    // for the first lookup that ignores case.
    template <class List>
    void EnsureFolded(Ndm_Design* design, int category, const List& members) {
        if (folded_built[category]) return;
        for (auto* m : members) AddFolded(design, category, m->GetName(), m);
        folded_built[category] = true;
    }
    template <class List>
    void Build(Ndm_Design* design, int category, const List& members) {
        Drop(category);
        for (auto* m : members) Add(design, category, m->GetName(), m);
        built[category] = true;
    }
    template <class List>
    std::vector<void*>& Sorted(int category, bool fold, const List& members) {
        std::unique_ptr<std::vector<void*>>& list = sorted[category][fold ? 1 : 0];
        if (!list) {
            list = std::make_unique<std::vector<void*>>(members.begin(), members.end());
            std::stable_sort(list->begin(), list->end(), [&](const void* a, const void* b) {
                return CompareName(NameOf(category, a), NameOf(category, b), fold) < 0;
            });
        }
        return *list;
    }
    void Drop(int category) {
        exact[category].Clear();
        folded[category].Clear();
        built[category] = false;
        folded_built[category] = false;
        dup_exact[category] = dup_folded[category] = false;
        max_len[category] = 0;
        if (category == kBlocks) block_lengths.clear();
        sorted[category][0].reset();
        sorted[category][1].reset();
    }
};

// The design's blocks and networks, and the arena of the blocks' chunks of signals and pins.
// Members go in reverse order: networks, then blocks, each of which takes its signals and pins
// along (following the links between their chunks).
struct Ndm_Objects {
    Ndm_Arena arena;
    std::unordered_map<const void*, void*> chunk_links;  // a full chunk -> the one after it
    // The list of chunks grown last (by its first chunk): its last chunk and the members before
    // it, so that growing it again does not walk it. (Members never leave a chunk.)
    struct Tail {
        const void* first = nullptr;
        void* last = nullptr;
        size_t before = 0;
    } tail;
    Ndm_Pool<Ndm_Block> blocks;
    Ndm_Pool<Ndm_Network> networks;
    std::unordered_map<const Ndm_Block*, std::unique_ptr<Ndm_MemberIndex>> indexes;
};

void* Ndm_NextChunk(const void* chunk, const Ndm_Block* block) {
    return block->GetView()->GetDesign()->objects_->chunk_links.at(chunk);
}

const char* Ndm_DirName(Ndm_Dir dir) {
    switch (dir) {
        case Ndm_Dir::Input: return "input";
        case Ndm_Dir::Output: return "output";
        case Ndm_Dir::Inout: return "inout";
        default: return "";
    }
}

bool Ndm_DirFromName(std::string_view name, Ndm_Dir& dir) {
    for (Ndm_Dir d : {Ndm_Dir::Input, Ndm_Dir::Output, Ndm_Dir::Inout}) {
        if (name == Ndm_DirName(d)) {
            dir = d;
            return true;
        }
    }
    return false;
}

// ---- names ----

void Ndm_Block::AppendFullName(std::string& out) const {
    if (!parent_) return;  // the top block has no full name
    const Ndm_Block* chain[256];
    size_t n = 0;
    std::vector<const Ndm_Block*> deep;
    for (const Ndm_Block* b = this; b->parent_; b = b->parent_) {
        if (n < 256)
            chain[n++] = b;
        else
            deep.push_back(b);
    }
    for (size_t i = deep.size(); i-- > 0;) {
        out += deep[i]->name_;
        out += '/';
    }
    for (size_t i = n; i-- > 0;) {
        out += chain[i]->name_;
        if (i) out += '/';
    }
}

std::string Ndm_Block::GetFullName() const {
    std::string out;
    AppendFullName(out);
    return out;
}

std::string Ndm_Signal::GetFullName() const {
    std::string out;
    GetBlock()->AppendFullName(out);
    if (!out.empty()) out += '/';
    out += name_;
    return out;
}

std::string Ndm_Pin::GetFullName() const {
    std::string out;
    GetBlock()->AppendFullName(out);
    if (!out.empty()) out += '.';
    out += name_;
    return out;
}

Ndm_Network* Ndm_Pin::GetNetwork() const { return signal_ ? signal_->GetNetwork() : nullptr; }

// ---- blocks ----

Ndm_Block::Ndm_Block(Ndm_Token, const char* name, Ndm_Block* parent, Ndm_View* view)
    : Ndm_PropertyHolder(Ndm_ObjKind::Block),
      depth_(parent ? parent->depth_ + 1 : 0),
      name_(name),
      parent_(parent),
      view_(view) {}

namespace {
template <class T>
void DestroyChunks(Ndm_Chunk<T>* first) {
    for (Ndm_Chunk<T>* c = first; c; c = c->Next())
        for (uint32_t i = 0; i < c->size; ++i) c->Items()[i].~T();
}
}  // namespace

// Signals and pins go first: they find the design through their block.
Ndm_Block::~Ndm_Block() {
    DestroyChunks(signals_);
    DestroyChunks(pins_);
}

uint32_t Ndm_Signal::GetOrder() const {
    const Ndm_Chunk<Ndm_Signal>* mine = Ndm_Chunk<Ndm_Signal>::Of(this, slot_);
    uint32_t order = slot_;
    for (const Ndm_Chunk<Ndm_Signal>* c = mine->block->signals_; c && c != mine; c = c->Next()) order += c->size;
    return order;
}

void Ndm_Block::SetTypeName(const char* type) {
    type_ = view_->GetDesign()->Intern(type ? type : "");
}

Ndm_MemberIndex& Ndm_Block::Index() const {
    std::unique_ptr<Ndm_MemberIndex>& index = view_->GetDesign()->objects_->indexes[this];
    if (!index) index = std::make_unique<Ndm_MemberIndex>();
    indexed_ = true;
    return *index;
}

void Ndm_Block::DropIndex() {
    if (!indexed_) return;
    view_->GetDesign()->objects_->indexes.erase(this);
    indexed_ = false;
}

Ndm_Block* Ndm_Block::CreateBlock(const char* name, unsigned int /*flags*/) {
    if (!name) return nullptr;
    return CreateBlock(Ndm_Interned{view_->GetDesign()->Intern(name)});
}

Ndm_Block* Ndm_Block::CreateBlock(Ndm_Interned name) {
    Ndm_Design* design = view_->GetDesign();
    const char* stored = name.name;
    Ndm_Block* block = design->objects_->blocks.Make(Ndm_Token(), stored, this, view_);
    block->order_ = blocks_.empty() ? 0 : blocks_.back()->order_ + 1;
    blocks_.push_back(block);
    if (indexed_) Index().Added(design, kBlocks, stored, block);
    return block;
}

Ndm_Signal* Ndm_Block::CreateSignal(const char* name) {
    if (!name) return nullptr;
    return CreateSignal(Ndm_Interned{view_->GetDesign()->Intern(name)});
}

Ndm_Signal* Ndm_Block::CreateSignal(Ndm_Interned name) {
    Ndm_Design* design = view_->GetDesign();
    const char* stored = name.name;
    Ndm_Chunk<Ndm_Signal>* chunk = ChunkWithRoom(signals_, 1);
    Ndm_Signal* signal = new (chunk->Items() + chunk->size) Ndm_Signal(Ndm_Token(), stored, chunk->size);
    ++chunk->size;
    if (indexed_) Index().Added(design, kSignals, stored, signal);
    return signal;
}

Ndm_Pin* Ndm_Block::CreatePin(const char* name, Ndm_Dir dir) {
    if (!name) return nullptr;
    return CreatePin(Ndm_Interned{view_->GetDesign()->Intern(name)}, dir);
}

Ndm_Pin* Ndm_Block::CreatePin(Ndm_Interned name, Ndm_Dir dir) {
    Ndm_Design* design = view_->GetDesign();
    const char* stored = name.name;
    Ndm_Chunk<Ndm_Pin>* chunk = ChunkWithRoom(pins_, 1);
    Ndm_Pin* pin = new (chunk->Items() + chunk->size) Ndm_Pin(Ndm_Token(), stored, dir, chunk->size);
    ++chunk->size;
    if (indexed_) Index().Added(design, kPins, stored, pin);
    return pin;
}

// The last chunk of a list when it has room for that many more members, else a new one after
// it: as large as asked for, and at least as large as the members so far, so that a block grown
// one member at a time has few chunks.
template <class T>
Ndm_Chunk<T>* Ndm_Block::ChunkWithRoom(Ndm_Chunk<T>*& first, size_t more) {
    Ndm_Objects& objects = *view_->GetDesign()->objects_;
    Ndm_Objects::Tail& tail = objects.tail;
    Ndm_Chunk<T>* last = first;
    size_t before = 0;  // members in the chunks before last
    if (first && tail.first == first) {
        last = static_cast<Ndm_Chunk<T>*>(tail.last);
        before = tail.before;
    }
    for (; last && (last->room & Ndm_Chunk<T>::kFollowed); last = last->Next()) before += last->size;
    if (last && last->Room() - last->size >= more) {
        tail = {first, last, before};
        return last;
    }
    const size_t count = before + (last ? last->size : 0);
    const size_t room = std::max<size_t>({more, count, 4});
    if (count + room > INT32_MAX) throw std::length_error("too many members in one block");
    void* at = objects.arena.Allocate(sizeof(Ndm_Chunk<T>) + room * sizeof(T));
    auto* chunk = new (at) Ndm_Chunk<T>{this, 0, static_cast<uint32_t>(room)};
    if (last) {
        objects.chunk_links[last] = chunk;
        last->room |= Ndm_Chunk<T>::kFollowed;
    } else {
        first = chunk;
    }
    tail = {first, chunk, count};
    return chunk;
}

void Ndm_Block::Reserve(size_t blocks, size_t signals, size_t pins) {
    if (blocks) blocks_.reserve(blocks_.size() + blocks);
    if (signals) ChunkWithRoom(signals_, signals);
    if (pins) ChunkWithRoom(pins_, pins);
}

// The subtree is taken apart with a work list (hierarchies can be very deep). Its signals leave
// their networks in one pass over each network touched, and emptied networks leave the view
// in one pass, so deleting a large subtree stays linear.
void Ndm_Block::Release() {
    std::vector<Ndm_Network*> touched;
    Ndm_PtrMap seen;  // touched networks
    std::vector<Ndm_Block*> work{this};
    while (!work.empty()) {
        Ndm_Block* b = work.back();
        work.pop_back();
        work.insert(work.end(), b->blocks_.begin(), b->blocks_.end());
        for (Ndm_Signal* signal : b->GetSignalItr()) {
            if (Ndm_Network* net = signal->network_) {
                if (!seen.Find(net)) {
                    seen.InsertIfAbsent(net, net);
                    touched.push_back(net);
                }
                signal->network_ = nullptr;
            }
            signal->DeleteAllProperties();
        }
        for (Ndm_Pin* pin : b->GetPinItr()) pin->DeleteAllProperties();
        b->blocks_.clear();
        b->signals_ = nullptr;  // the chunks stay in the arena
        b->pins_ = nullptr;
        b->DropIndex();
        b->DeleteAllProperties();
        b->parent_ = nullptr;
    }
    Ndm_PtrMap emptied;
    bool any = false;
    for (Ndm_Network* net : touched) {
        if (net->Prune()) continue;
        emptied.InsertIfAbsent(net, net);
        any = true;
    }
    if (any) std::erase_if(view_->networks_, [&](const Ndm_Network* net) { return emptied.Find(net) != nullptr; });
}

bool Ndm_Block::DeleteBlock(Ndm_Block* child) {
    auto it = std::find(blocks_.begin(), blocks_.end(), child);
    if (it == blocks_.end()) return false;
    blocks_.erase(it);
    if (indexed_) Index().Drop(kBlocks);
    // Pins elsewhere that pointed at signals of the subtree keep their pointers; the objects
    // stay allocated in the pools until the design goes, so nothing dangles.
    child->Release();
    return true;
}


template <class T, class List>
T* Ndm_Block::Lookup(const List& members, int category, const char* name, bool ignore_case) const {
    if (!name) return nullptr;
    if (!ignore_case && members.size() <= kSmall) return ScanExact<T>(members, name);
    std::string folded;
    if (ignore_case) {
        folded = FoldName(name);
        if (members.size() <= kSmall) return ScanFolded<T>(members, folded);
    }
    Ndm_Design* design = view_->GetDesign();
    Ndm_MemberIndex& idx = Index();
    if (!idx.built[category]) idx.Build(design, category, members);
    if (ignore_case) idx.EnsureFolded(design, category, members);
    const char* key = design->FindInterned(ignore_case ? std::string_view(folded) : name);
    if (!key) return nullptr;
    return static_cast<T*>((ignore_case ? idx.folded : idx.exact)[category].Find(key));
}

Ndm_Block* Ndm_Block::GetBlockByName(const char* name) const {
    return Lookup<Ndm_Block>(blocks_, kBlocks, name, false);
}
Ndm_Signal* Ndm_Block::GetSignalByName(const char* name) const {
    return Lookup<Ndm_Signal>(GetSignalItr(), kSignals, name, false);
}
Ndm_Pin* Ndm_Block::GetPinByName(const char* name) const { return Lookup<Ndm_Pin>(GetPinItr(), kPins, name, false); }
Ndm_Block* Ndm_Block::GetBlockByIName(const char* name) const {
    return Lookup<Ndm_Block>(blocks_, kBlocks, name, true);
}
Ndm_Signal* Ndm_Block::GetSignalByIName(const char* name) const {
    return Lookup<Ndm_Signal>(GetSignalItr(), kSignals, name, true);
}
Ndm_Pin* Ndm_Block::GetPinByIName(const char* name) const { return Lookup<Ndm_Pin>(GetPinItr(), kPins, name, true); }

void Ndm_Block::GetBlocksByName(std::string_view name, bool ignore_case,
                                std::vector<Ndm_Block*>& out) const {
    if (blocks_.size() <= kSmall) {
        for (Ndm_Block* b : blocks_)
            if (CompareName(b->name_, name, ignore_case) == 0) out.push_back(b);
        return;
    }
    Ndm_Design* design = view_->GetDesign();
    Ndm_MemberIndex& idx = Index();
    if (!idx.built[kBlocks]) idx.Build(design, kBlocks, blocks_);
    if (!std::binary_search(idx.block_lengths.begin(), idx.block_lengths.end(), name.size())) return;
    if (ignore_case) idx.EnsureFolded(design, kBlocks, blocks_);
    std::string folded;
    if (ignore_case) {
        folded.assign(name);
        for (char& c : folded)
            if (c >= 'A' && c <= 'Z') c = static_cast<char>(c + 32);
    }
    const char* key = design->FindInterned(ignore_case ? std::string_view(folded) : name);
    if (!key) return;
    void* first = (ignore_case ? idx.folded : idx.exact)[kBlocks].Find(key);
    if (!first) return;
    if (!(ignore_case ? idx.dup_folded : idx.dup_exact)[kBlocks]) {
        out.push_back(static_cast<Ndm_Block*>(first));
        return;
    }
    std::vector<void*>& list = idx.Sorted(kBlocks, ignore_case, blocks_);
    auto at = std::lower_bound(list.begin(), list.end(), name, [&](const void* m, std::string_view key) {
        return CompareName(static_cast<const Ndm_Block*>(m)->name_, key, ignore_case) < 0;
    });
    for (; at != list.end() && CompareName(static_cast<Ndm_Block*>(*at)->name_, name, ignore_case) == 0; ++at)
        out.push_back(static_cast<Ndm_Block*>(*at));
}

template <class T, class List>
void Ndm_Block::ByPrefix(const List& members, int category, std::string_view prefix,
                         bool ignore_case, std::vector<T*>& out) const {
    if (prefix.empty()) {
        out.insert(out.end(), members.begin(), members.end());
        return;
    }
    if (members.size() <= kSmall) {
        for (T* m : members)
            if (HasPrefix(m->GetName(), prefix, ignore_case)) out.push_back(m);
        return;
    }
    Ndm_Design* design = view_->GetDesign();
    Ndm_MemberIndex& idx = Index();
    if (!idx.built[category]) idx.Build(design, category, members);
    if (prefix.size() > idx.max_len[category]) return;
    std::vector<void*>& list = idx.Sorted(category, ignore_case, members);
    auto at = std::lower_bound(list.begin(), list.end(), prefix, [&](const void* m, std::string_view key) {
        return CompareName(static_cast<const T*>(m)->GetName(), key, ignore_case) < 0;
    });
    auto last = at;
    while (last != list.end() && HasPrefix(static_cast<T*>(*last)->GetName(), prefix, ignore_case)) ++last;
    // When many members match, going through them in stored order beats sorting the matches.
    if (static_cast<size_t>(last - at) > members.size() / 4) {
        for (T* m : members)
            if (HasPrefix(m->GetName(), prefix, ignore_case)) out.push_back(m);
        return;
    }
    size_t start = out.size();
    for (; at != last; ++at) out.push_back(static_cast<T*>(*at));
    std::sort(out.begin() + static_cast<std::ptrdiff_t>(start), out.end(),
              [](const T* a, const T* b) { return a->GetOrder() < b->GetOrder(); });
}

void Ndm_Block::GetBlocksByPrefix(std::string_view prefix, bool ignore_case,
                                  std::vector<Ndm_Block*>& out) const {
    ByPrefix<Ndm_Block>(blocks_, kBlocks, prefix, ignore_case, out);
}

void Ndm_Block::GetSignalsByPrefix(std::string_view prefix, bool ignore_case,
                                   std::vector<Ndm_Signal*>& out) const {
    ByPrefix<Ndm_Signal>(GetSignalItr(), kSignals, prefix, ignore_case, out);
}

void Ndm_Block::GetBlockNameLengths(std::vector<uint32_t>& out) const {
    if (blocks_.size() <= kSmall) {
        const size_t start = out.size();
        for (const Ndm_Block* b : blocks_) out.push_back(static_cast<uint32_t>(std::strlen(b->name_)));
        std::sort(out.begin() + static_cast<std::ptrdiff_t>(start), out.end());
        out.erase(std::unique(out.begin() + static_cast<std::ptrdiff_t>(start), out.end()), out.end());
        return;
    }
    Ndm_MemberIndex& idx = Index();
    if (!idx.built[kBlocks]) idx.Build(view_->GetDesign(), kBlocks, blocks_);
    out.insert(out.end(), idx.block_lengths.begin(), idx.block_lengths.end());
}

size_t Ndm_Block::GetMaxBlockNameLength() const {
    if (blocks_.size() <= kSmall) {
        size_t len = 0;
        for (const Ndm_Block* b : blocks_) len = std::max(len, std::strlen(b->name_));
        return len;
    }
    Ndm_MemberIndex& idx = Index();
    if (!idx.built[kBlocks]) idx.Build(view_->GetDesign(), kBlocks, blocks_);
    return idx.max_len[kBlocks];
}

// ---- networks ----

const char* Ndm_Network::GetName() const {
    if (!top_) return "";
    if (!name_) name_ = view_->GetDesign()->Intern(top_->GetFullName());
    return name_;
}

int Ndm_Network::GetNumSignals() const {
    int n = 0;
    for (const Ndm_Signal* s = GetFirstSignal(); s; s = s->GetNextInNetwork()) ++n;
    return n;
}

std::string Ndm_Network::GetFullName() const { return top_ ? top_->GetFullName() : std::string(); }

void Ndm_Network::AddSignal(Ndm_Signal* signal) {
    if (!signal || signal->network_) return;
    signal->network_ = this;
    if (last_) {
        signal->next_in_network_ = last_->next_in_network_;
        last_->next_in_network_ = signal;
    } else {
        signal->next_in_network_ = signal;
    }
    last_ = signal;
    if (!top_ || signal->GetBlock()->GetDepth() < top_->GetBlock()->GetDepth()) {
        top_ = signal;
        name_ = nullptr;
    }
}

bool Ndm_Network::Prune() {
    Ndm_Signal* first = nullptr;
    Ndm_Signal* prev = nullptr;
    for (Ndm_Signal* s = GetFirstSignal(); s;) {
        Ndm_Signal* next = s == last_ ? nullptr : s->next_in_network_;
        if (s->network_ == this) {
            (prev ? prev->next_in_network_ : first) = s;
            prev = s;
        } else {
            s->next_in_network_ = nullptr;
        }
        s = next;
    }
    if (prev) prev->next_in_network_ = first;
    last_ = prev;
    if (top_ && top_->network_ == this) return true;
    top_ = nullptr;
    name_ = nullptr;
    for (Ndm_Signal* s = GetFirstSignal(); s; s = s->GetNextInNetwork())
        if (!top_ || s->GetBlock()->GetDepth() < top_->GetBlock()->GetDepth()) top_ = s;
    return top_ != nullptr;
}

// ---- views and design ----

Ndm_Block* Ndm_View::CreateTopBlock(const char* name) {
    if (top_ || !name) return top_;
    top_ = design_->objects_->blocks.Make(Ndm_Token(), design_->Intern(name), nullptr, this);
    return top_;
}

Ndm_Network* Ndm_View::CreateNetwork() {
    Ndm_Network* net = design_->objects_->networks.Make(Ndm_Token(), this);
    net->order_ = networks_.empty() ? 0 : networks_.back()->order_ + 1;
    networks_.push_back(net);
    return net;
}

Ndm_Design::Ndm_Design(const char* name)
    : Ndm_PropertyHolder(Ndm_ObjKind::Design),
      property_cells_(std::make_unique<Ndm_PropertyCells>(this)),
      names_(std::make_unique<Ndm_NamePool>()),
      text_lists_(std::make_unique<Ndm_TextLists>(*property_cells_)),
      objects_(std::make_unique<Ndm_Objects>()) {
    name_ = names_->Intern(name ? name : "");
}

// The design's own properties go first: they live in cells that its members hold.
Ndm_Design::~Ndm_Design() { DeleteAllProperties(); }

const char* Ndm_Design::Intern(std::string_view name) { return names_->Intern(name); }
const char* Ndm_Design::InternRare(std::string_view name) { return names_->InternRare(name); }
const char* Ndm_Design::InternRare(std::string_view name, uint64_t hash, bool& added) {
    return names_->InternRare(name, hash, added);
}
void Ndm_Design::InternAll(std::span<const std::string_view> names, const char** out) {
    names_->InternAll(names, out);
}
uint64_t Ndm_Design::PrefetchName(std::string_view name) const { return names_->Prefetch(name); }
uint32_t Ndm_Design::TextId(const char* interned) { return names_->IdOf(interned); }

Ndm_PropertyHolder* Ndm_Design::OwnerOfLast(const Ndm_Property* last) {
    if (!owners_) {
        owners_ = std::make_unique<std::unordered_map<const Ndm_Property*, Ndm_PropertyHolder*>>();
        auto note = [this](Ndm_PropertyHolder* holder) {
            if (const Ndm_Property* p = holder->Last()) owners_->emplace(p, holder);
        };
        note(this);
        for (Ndm_View& view : view_pool_) note(&view);
        objects_->blocks.ForEach([&](Ndm_Block* block) {
            note(block);
            for (Ndm_Signal* signal : block->GetSignalItr()) note(signal);
            for (Ndm_Pin* pin : block->GetPinItr()) note(pin);
        });
        objects_->networks.ForEach(note);
    }
    auto it = owners_->find(last);
    return it == owners_->end() ? nullptr : it->second;
}

void Ndm_Design::MoveLast(Ndm_PropertyHolder* owner, const Ndm_Property* was, const Ndm_Property* now) {
    if (was) owners_->erase(was);
    if (now) (*owners_)[now] = owner;
}

void Ndm_Design::ReserveNames(size_t more) { names_->Reserve(more); }

const char* Ndm_Design::FindInterned(std::string_view name) const { return names_->Find(name); }

Ndm_View* Ndm_Design::GetViewByName(const char* name) const {
    if (!name) return nullptr;
    for (Ndm_View* v : views_)
        if (std::strcmp(v->GetName(), name) == 0) return v;
    return nullptr;
}

Ndm_View* Ndm_Design::GetWorkView() const {
    Ndm_View* view = GetViewByName("EXPANDED");
    if (!view && !views_.empty()) view = views_.front();
    return view && view->GetBlock() ? view : nullptr;
}

Ndm_View* Ndm_Design::CreateView(const char* name) {
    if (!name) return nullptr;
    if (Ndm_View* v = GetViewByName(name)) return v;
    Ndm_View* v = &view_pool_.emplace_back(Ndm_Token(), Intern(name), this);
    views_.push_back(v);
    return v;
}

Ndm_Design::Stats Ndm_Design::GetStats() const {
    Stats s;
    for (const Ndm_View* v : views_) {
        s.networks += v->networks_.size();
        if (!v->top_) continue;
        std::vector<const Ndm_Block*> stack{v->top_};
        while (!stack.empty()) {
            const Ndm_Block* b = stack.back();
            stack.pop_back();
            ++s.blocks;
            s.signals += b->GetSignalItr().size();
            s.pins += b->GetPinItr().size();
            for (const Ndm_Block* c : b->blocks_) stack.push_back(c);
        }
    }
    s.name_bytes = names_->bytes();
    return s;
}
