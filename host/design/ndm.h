// The design database: a design holds views; a view holds the block hierarchy under its top
// block and the networks; blocks hold child blocks, signals and pins, all in stored order.
// Every object is a property holder. Names are interned in the design, so an object carries
// pointers only; objects live in design-owned pools and are never moved.
//
// Name lookups (GetBlockByName, GetSignalByName, GetPinByName and the I-variants ignoring
// ASCII case) answer "the first object in stored order with that name" through per-block
// hash indexes built on first use for blocks with many members; they never scan a large block.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <deque>
#include <iterator>
#include <new>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "host/design/ndm_property.h"

class Ndm_Design;
class Ndm_View;
class Ndm_Block;
class Ndm_Signal;
class Ndm_Pin;
class Ndm_Network;
class Ndm_NamePool;
class Ndm_MemberIndex;
struct Ndm_Objects;

// A name the design has interned already (Ndm_Design::Intern): objects created with it skip
// interning it again, which readers that intern their names once save millions of times.
struct Ndm_Interned {
    const char* name;
};

// Only the database itself can make objects: constructors take this token.
class Ndm_Token {
    Ndm_Token() = default;
    friend class Ndm_Design;
    friend class Ndm_View;
    friend class Ndm_Block;
    friend class Ndm_Network;
};

// The children, signals or pins of a block, in stored order: one pointer, null while the list is
// empty, to the count, the room and the members in one allocation. Most blocks are cells without
// children or signals, which pay 8 bytes for each of those lists rather than a vector's 24.
template <class T>
class Ndm_MemberList {
public:
    Ndm_MemberList() = default;
    ~Ndm_MemberList() { std::free(head_); }
    Ndm_MemberList(const Ndm_MemberList&) = delete;
    Ndm_MemberList& operator=(const Ndm_MemberList&) = delete;

    size_t size() const { return head_ ? head_->size : 0; }
    bool empty() const { return size() == 0; }
    T* const* begin() const { return head_ ? Items() : nullptr; }
    T* const* end() const { return begin() + size(); }
    T* back() const { return Items()[head_->size - 1]; }
    operator std::span<T* const>() const { return {begin(), size()}; }  // NOLINT: a list is a span

    void push_back(T* member) {
        if (size() == Room()) Resize(std::max<size_t>(4, 2 * Room()));
        Items()[head_->size++] = member;
    }
    // Room for n members in all.
    void reserve(size_t n) {
        if (n > Room()) Resize(n);
    }
    void erase(T* const* at) {
        T** items = Items();
        const size_t i = static_cast<size_t>(at - items);
        std::memmove(items + i, items + i + 1, (head_->size - i - 1) * sizeof(T*));
        --head_->size;
    }
    // Empties the list and gives its memory back.
    void clear() {
        std::free(head_);
        head_ = nullptr;
    }

private:
    struct Head {
        uint32_t size, room;
    };
    static_assert(sizeof(Head) % alignof(T*) == 0);
    T** Items() const { return reinterpret_cast<T**>(head_ + 1); }
    size_t Room() const { return head_ ? head_->room : 0; }
    void Resize(size_t room) {
        void* grown = std::realloc(head_, sizeof(Head) + room * sizeof(T*));
        if (!grown) throw std::bad_alloc();
        const bool fresh = !head_;
        head_ = static_cast<Head*>(grown);
        if (fresh) head_->size = 0;
        head_->room = static_cast<uint32_t>(room);
    }

    Head* head_ = nullptr;
};

// Pin and port directions.
enum class Ndm_Dir : uint8_t { None, Input, Output, Inout };
const char* Ndm_DirName(Ndm_Dir dir);  // "", "input", "output", "inout"
// The direction of "input", "output" or "inout"; false for any other word.
bool Ndm_DirFromName(std::string_view name, Ndm_Dir& dir);

class Ndm_Signal : public Ndm_PropertyHolder {
public:
    Ndm_Signal(Ndm_Token, const char* name, uint32_t slot)
        : Ndm_PropertyHolder(Ndm_ObjKind::Signal), slot_(slot), name_(name) {}
    const char* GetName() const { return name_; }
    // Stored-order key among the signals of the block: a later signal has a larger key.
    uint32_t GetOrder() const;
    // Owner block's full name, "/", the name (just the name in the top block).
    std::string GetFullName() const;
    Ndm_Block* GetBlock() const;
    // Network the signal belongs to, or null.
    Ndm_Network* GetNetwork() const { return network_; }
    // Next signal of the same network, in network order.
    Ndm_Signal* GetNextInNetwork() const;

private:
    friend class Ndm_Block;
    friend class Ndm_Network;
    friend class Ndm_Design;

    uint32_t slot_;  // place in its chunk, which names the block; fits in the base's tail padding
    const char* name_;
    Ndm_Network* network_ = nullptr;
    Ndm_Signal* next_in_network_ = nullptr;  // the network's signals make a ring
};

class Ndm_Pin : public Ndm_PropertyHolder {
public:
    Ndm_Pin(Ndm_Token, const char* name, Ndm_Dir dir, uint32_t slot)
        : Ndm_PropertyHolder(Ndm_ObjKind::Pin), dir_(dir), slot_(slot), name_(name) {}
    const char* GetName() const { return name_; }
    // Owner block's full name, ".", the name (just the name on the top block).
    std::string GetFullName() const;
    Ndm_Block* GetBlock() const;
    Ndm_Dir GetDirection() const { return dir_; }
    // Signal outside the block that the pin connects to (in the owner's parent; for a pin of
    // the top block, the port's own signal), or null.
    Ndm_Signal* GetSignal() const { return signal_; }
    void SetSignal(Ndm_Signal* signal) { signal_ = signal; }
    // Network of the connected signal, or null.
    Ndm_Network* GetNetwork() const;

private:
    friend class Ndm_Block;
    friend class Ndm_Design;

    Ndm_Dir dir_;    // these two fit in the base's tail padding
    uint32_t slot_;  // place in its chunk, which names the block
    const char* name_;
    Ndm_Signal* signal_ = nullptr;
};

// The chunk after a chunk of block's members: the design keeps the links of the few chunks
// that have one.
void* Ndm_NextChunk(const void* chunk, const Ndm_Block* block);

// A block's signals and pins live in chunks of their own, one chunk of each kind for a block
// whose counts were reserved: a member finds its block through the head of its chunk, and the
// block keeps no list of pointers. Chunks never move; a full chunk is followed by a larger one.
template <class T>
struct Ndm_Chunk {
    static constexpr uint32_t kFollowed = uint32_t{1} << 31;  // in room: a later chunk follows
    Ndm_Block* block;
    uint32_t size, room;
    T* Items() { return reinterpret_cast<T*>(this + 1); }
    uint32_t Room() const { return room & ~kFollowed; }
    Ndm_Chunk* Next() const {
        return room & kFollowed ? static_cast<Ndm_Chunk*>(Ndm_NextChunk(this, block)) : nullptr;
    }
    // The chunk of a member that sits at place slot in it.
    static const Ndm_Chunk* Of(const T* member, uint32_t slot) {
        return reinterpret_cast<const Ndm_Chunk*>(member - slot) - 1;
    }
};

// The signals or pins of a block in stored order, as a range of pointers.
template <class T>
class Ndm_ChunkRange {
public:
    class iterator : public Ndm_PointerIterator<T> {
    public:
        iterator() = default;
        explicit iterator(Ndm_Chunk<T>* chunk) : chunk_(chunk) { Settle(); }
        T* operator*() const { return chunk_->Items() + at_; }
        iterator& operator++() {
            ++at_;
            Settle();
            return *this;
        }
        iterator operator++(int) {
            iterator before = *this;
            ++*this;
            return before;
        }
        bool operator==(const iterator&) const = default;

    private:
        void Settle() {
            while (chunk_ && at_ == chunk_->size) {
                chunk_ = chunk_->Next();
                at_ = 0;
            }
        }
        Ndm_Chunk<T>* chunk_ = nullptr;
        uint32_t at_ = 0;
    };

    explicit Ndm_ChunkRange(Ndm_Chunk<T>* first) : first_(first) {}
    iterator begin() const { return iterator(first_); }
    iterator end() const { return iterator(); }
    size_t size() const {
        size_t n = 0;
        for (const Ndm_Chunk<T>* c = first_; c; c = c->Next()) n += c->size;
        return n;
    }
    bool empty() const { return begin() == end(); }
    // The member at place i in stored order (i < size()); one step for a block whose count was
    // reserved.
    T* operator[](size_t i) const {
        Ndm_Chunk<T>* c = first_;
        while (i >= c->size) {
            i -= c->size;
            c = c->Next();
        }
        return c->Items() + i;
    }

private:
    Ndm_Chunk<T>* first_;
};

using Ndm_SignalRange = Ndm_ChunkRange<Ndm_Signal>;
using Ndm_PinRange = Ndm_ChunkRange<Ndm_Pin>;

inline Ndm_Block* Ndm_Signal::GetBlock() const { return Ndm_Chunk<Ndm_Signal>::Of(this, slot_)->block; }
inline Ndm_Block* Ndm_Pin::GetBlock() const { return Ndm_Chunk<Ndm_Pin>::Of(this, slot_)->block; }

class Ndm_Block : public Ndm_PropertyHolder {
public:
    Ndm_Block(Ndm_Token, const char* name, Ndm_Block* parent, Ndm_View* view);
    const char* GetName() const { return name_; }
    // Stored-order key among the children of the parent: a later child has a larger key.
    uint32_t GetOrder() const { return order_; }
    // Levels below the top block (0 for the top block), kept with the block.
    uint32_t GetDepth() const { return depth_; }
    // Names from below the top block joined by "/"; empty for the top block.
    std::string GetFullName() const;
    // Appends the full name to out (no allocation when out has room).
    void AppendFullName(std::string& out) const;
    Ndm_Block* GetParent() const { return parent_; }
    Ndm_View* GetView() const { return view_; }
    // Cell type or module name the block was made from (empty for made-up blocks).
    const char* GetTypeName() const { return type_; }
    void SetTypeName(const char* type);
    void SetTypeName(Ndm_Interned type) { type_ = type.name; }
    // Gives a block made under a stand-in name the interned name, for a reader that interns its
    // names a few blocks late. Only before any lookup among the parent's children.
    void SetInternedName(Ndm_Interned name) { name_ = name.name; }

    int GetNumBlocks() const { return static_cast<int>(blocks_.size()); }
    std::span<Ndm_Block* const> GetBlockItr() const { return blocks_; }
    int GetNumSignals() const { return static_cast<int>(GetSignalItr().size()); }
    Ndm_SignalRange GetSignalItr() const { return Ndm_SignalRange(signals_); }
    int GetNumPins() const { return static_cast<int>(GetPinItr().size()); }
    Ndm_PinRange GetPinItr() const { return Ndm_PinRange(pins_); }

    // Appends a child block; flags are reserved (pass 0). Null when name is null.
    Ndm_Block* CreateBlock(const char* name, unsigned int flags = 0);
    Ndm_Block* CreateBlock(Ndm_Interned name);
    // Removes a child block and its whole subtree (signals leave their networks; the
    // objects' properties are released). False when child is not a child of this block.
    bool DeleteBlock(Ndm_Block* child);
    // Appends a signal or a pin.
    Ndm_Signal* CreateSignal(const char* name);
    Ndm_Pin* CreatePin(const char* name, Ndm_Dir dir = Ndm_Dir::None);
    Ndm_Signal* CreateSignal(Ndm_Interned name);
    Ndm_Pin* CreatePin(Ndm_Interned name, Ndm_Dir dir = Ndm_Dir::None);
    // Reserves room for that many more members of each kind (readers that know the counts
    // avoid regrowing the member lists).
    void Reserve(size_t blocks, size_t signals, size_t pins);

    // First member in stored order with exactly this name, or null.
    Ndm_Block* GetBlockByName(const char* name) const;
    Ndm_Signal* GetSignalByName(const char* name) const;
    Ndm_Pin* GetPinByName(const char* name) const;
    // First member in stored order whose name equals name ignoring ASCII case, or null.
    Ndm_Block* GetBlockByIName(const char* name) const;
    Ndm_Signal* GetSignalByIName(const char* name) const;
    Ndm_Pin* GetPinByIName(const char* name) const;

    // Appends every child block whose name is name (exactly, or ignoring ASCII case), in
    // stored order.
    void GetBlocksByName(std::string_view name, bool ignore_case, std::vector<Ndm_Block*>& out) const;
    // Appends every child block (signal) whose name starts with prefix, in stored order.
    void GetBlocksByPrefix(std::string_view prefix, bool ignore_case,
                           std::vector<Ndm_Block*>& out) const;
    void GetSignalsByPrefix(std::string_view prefix, bool ignore_case,
                            std::vector<Ndm_Signal*>& out) const;
    // Length of the longest child block name (0 without children).
    size_t GetMaxBlockNameLength() const;
    // Appends the distinct lengths of the child block names, ascending.
    void GetBlockNameLengths(std::vector<uint32_t>& out) const;

    ~Ndm_Block();

private:
    friend class Ndm_Signal;
    friend class Ndm_View;
    friend class Ndm_Design;
    Ndm_MemberIndex& Index() const;
    template <class T, class List>
    T* Lookup(const List& members, int category, const char* name, bool ignore_case) const;
    template <class T>
    Ndm_Chunk<T>* ChunkWithRoom(Ndm_Chunk<T>*& first, size_t more);
    template <class T, class List>
    void ByPrefix(const List& members, int category, std::string_view prefix,
                  bool ignore_case, std::vector<T*>& out) const;
    void Release();  // drops members and properties of a deleted subtree
    void DropIndex();

    // The name indexes of the few blocks with many members are kept by the design.
    mutable bool indexed_ = false;  // these two fit in the base's tail padding
    uint32_t order_ = 0;
    uint32_t depth_;
    const char* name_;
    const char* type_ = "";
    Ndm_Block* parent_;
    Ndm_View* view_;
    Ndm_MemberList<Ndm_Block> blocks_;
    // In the design's arena.
    Ndm_Chunk<Ndm_Signal>* signals_ = nullptr;
    Ndm_Chunk<Ndm_Pin>* pins_ = nullptr;
};

class Ndm_Network : public Ndm_PropertyHolder {
public:
    Ndm_Network(Ndm_Token, Ndm_View* view) : Ndm_PropertyHolder(Ndm_ObjKind::Network), view_(view) {}
    // Full name of the top signal (the highest in the hierarchy; the first of those in
    // creation order); "" without signals. A full name is as long as the hierarchy is deep, so
    // the network keeps only its top signal: the name is made and interned on the first call
    // (and again after the top signal changed). Walks over every network use GetFullName,
    // which keeps nothing.
    const char* GetName() const;
    // The same name, made anew.
    std::string GetFullName() const;
    Ndm_Signal* GetTopSignal() const { return top_; }
    // Creation-order key among the networks of the view: a later network has a larger key.
    uint32_t GetOrder() const { return order_; }
    // Signals of the network in the order they were added.
    Ndm_Signal* GetFirstSignal() const { return last_ ? last_->next_in_network_ : nullptr; }
    // Counted along the signals: networks are many and most are small.
    int GetNumSignals() const;
    // Adds a signal (not yet in a network); a signal higher in the hierarchy than the
    // current top one becomes the top signal and renames the network.
    void AddSignal(Ndm_Signal* signal);
    Ndm_View* GetView() const { return view_; }

private:
    friend class Ndm_Signal;
    friend class Ndm_View;
    friend class Ndm_Block;
    // Drops the signals whose network was cleared (a deleted subtree's) from the member list
    // and names the network after the highest signal left; false when none is left.
    bool Prune();

    uint32_t order_ = 0;  // network-order key; fits in the base's tail padding
    Ndm_View* view_;
    mutable const char* name_ = nullptr;  // interned full name of top_, made on request
    Ndm_Signal* top_ = nullptr;
    Ndm_Signal* last_ = nullptr;
};

inline Ndm_Signal* Ndm_Signal::GetNextInNetwork() const {
    return network_ && this != network_->last_ ? next_in_network_ : nullptr;
}

class Ndm_View : public Ndm_PropertyHolder {
public:
    Ndm_View(Ndm_Token, const char* name, Ndm_Design* design)
        : Ndm_PropertyHolder(Ndm_ObjKind::View), name_(name), design_(design) {}
    const char* GetName() const { return name_; }
    Ndm_Design* GetDesign() const { return design_; }
    // Top block, or null before CreateTopBlock.
    Ndm_Block* GetBlock() const { return top_; }
    // Creates the top block (once).
    Ndm_Block* CreateTopBlock(const char* name);
    // Networks in creation order.
    std::span<Ndm_Network* const> GetNetworkItr() const { return networks_; }
    int GetNumNetworks() const { return static_cast<int>(networks_.size()); }
    // A new, empty network.
    Ndm_Network* CreateNetwork();
    // Reserves room for that many more networks (readers that know a bound avoid regrowing the
    // list).
    void ReserveNetworks(size_t more) { networks_.reserve(networks_.size() + more); }

private:
    friend class Ndm_Design;
    friend class Ndm_Block;
    friend class Ndm_Network;

    const char* name_;
    Ndm_Design* design_;
    Ndm_Block* top_ = nullptr;
    std::vector<Ndm_Network*> networks_;
};

class Ndm_Design : public Ndm_PropertyHolder {
public:
    explicit Ndm_Design(const char* name = "");
    ~Ndm_Design();
    Ndm_Design(const Ndm_Design&) = delete;
    Ndm_Design& operator=(const Ndm_Design&) = delete;

    const char* GetName() const { return name_; }
    // Renames the design (readers learn the name only after parsing).
    void SetName(std::string_view name) { name_ = Intern(name); }
    // View of that name, or null.
    Ndm_View* GetViewByName(const char* name) const;
    // The view tools work on: EXPANDED, else the first view; null when that view has no top
    // block.
    Ndm_View* GetWorkView() const;
    // Views in creation order.
    std::span<Ndm_View* const> GetViewItr() const { return views_; }
    // Creates a view; returns the existing one when the name is taken.
    Ndm_View* CreateView(const char* name);

    // Interned copy of a name, valid as long as the design.
    const char* Intern(std::string_view name);
    // The same for a name that seldom comes back soon, as instance and net names do not: readers
    // intern millions of those.
    const char* InternRare(std::string_view name);
    // The same for a name whose PrefetchName came first, telling whether it is new to the design.
    const char* InternRare(std::string_view name, uint64_t hash, bool& added);
    // Interns every name of a list (out[i] for names[i]): the bit names of a wide vector.
    void InternAll(std::span<const std::string_view> names, const char** out);
    // Starts bringing what interning name will read into the cache (a reader that knows a
    // name before it needs it); gives the name's hash, which InternRare takes.
    uint64_t PrefetchName(std::string_view name) const;
    // A 32-bit id of an interned name (Ndm_NamePool::IdOf).
    uint32_t TextId(const char* interned);
    // Makes room for that many more names, for readers that know how many are coming.
    void ReserveNames(size_t more);
    // Interned copy when the name is known to the design, else null.
    const char* FindInterned(std::string_view name) const;

    // What the design was read from, for caches of what its names resolve to: the loader sets
    // the identity of the file (device, inode, size, modification time) and the design's name
    // (its top module). Empty for a design
    // made in memory, which no such cache can trust.
    const std::string& GetSourceStamp() const { return source_stamp_; }
    void SetSourceStamp(std::string stamp) { source_stamp_ = std::move(stamp); }

    // Object counts and an estimate of the memory the design holds, for reports.
    struct Stats {
        size_t blocks = 0, signals = 0, pins = 0, networks = 0, name_bytes = 0;
    };
    Stats GetStats() const;

private:
    friend void* Ndm_NextChunk(const void* chunk, const Ndm_Block* block);
    friend class Ndm_Block;
    friend class Ndm_View;
    friend class Ndm_Network;
    friend class Ndm_MemberIndex;
    friend class Ndm_Property;
    friend class Ndm_PropertyHolder;
    Ndm_TextLists& TextLists() { return *text_lists_; }
    Ndm_PropertyCells& PropertyCells() { return *property_cells_; }
    // The object whose last property is last, found in a map of all objects with properties
    // made on the first call; later changes to the objects' last properties keep it up to date.
    Ndm_PropertyHolder* OwnerOfLast(const Ndm_Property* last);
    void NoteLast(Ndm_PropertyHolder* owner, const Ndm_Property* was, const Ndm_Property* now) {
        if (owners_) MoveLast(owner, was, now);
    }
    void MoveLast(Ndm_PropertyHolder* owner, const Ndm_Property* was, const Ndm_Property* now);

    // Declared first, so that they outlive every object whose properties they hold or map.
    std::unique_ptr<Ndm_PropertyCells> property_cells_;
    std::unique_ptr<std::unordered_map<const Ndm_Property*, Ndm_PropertyHolder*>> owners_;
    std::unique_ptr<Ndm_NamePool> names_;
    std::unique_ptr<Ndm_TextLists> text_lists_;
    const char* name_;
    std::string source_stamp_;
    std::deque<Ndm_View> view_pool_;
    std::vector<Ndm_View*> views_;
    // Blocks, networks and the blocks' chunks of signals and pins; declared after the views,
    // which must outlive them.
    std::unique_ptr<Ndm_Objects> objects_;
};
