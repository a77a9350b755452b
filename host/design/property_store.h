// How a design stores its properties (internal to host/design): the cells properties live in,
// the property names, and the string-list values shared between properties.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "host/design/name_pool.h"
#include "host/design/ndm_property.h"

#if defined(__SANITIZE_ADDRESS__)
#define NDM_ASAN 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define NDM_ASAN 1
#endif
#endif
#if NDM_ASAN
#include <sanitizer/asan_interface.h>
#endif

// Cells of 12 bytes for a design's properties, taken from chunks of 5,460 and reused once freed.
// A cell is known by a 32-bit index: the chunk's number, registered with the process so that an
// index alone finds its cell, and the place in the chunk. Index 0 is no cell.
class Ndm_PropertyCells {
public:
    static constexpr size_t kCell = Ndm_PropertyTables::kCell;
    static constexpr int kPlaceBits = Ndm_PropertyTables::kPlaceBits;
    // Indexes take 31 bits, which leaves a link its mark bit.
    static constexpr size_t kMaxChunks = Ndm_PropertyTables::kMaxChunks;

    explicit Ndm_PropertyCells(Ndm_Design* design) : design_(design) {}
    ~Ndm_PropertyCells();
    Ndm_PropertyCells(const Ndm_PropertyCells&) = delete;
    Ndm_PropertyCells& operator=(const Ndm_PropertyCells&) = delete;

    // A free cell's index.
    uint32_t Get() {
        if (free_) {
            const uint32_t cell = free_;
            Unpoison(At(cell));
            std::memcpy(&free_, At(cell), sizeof free_);
            return cell;
        }
        if (!left_) Refill();
        --left_;
        return next_++;
    }
    void Put(uint32_t cell) {
        std::memcpy(At(cell), &free_, sizeof free_);
        free_ = cell;
        Poison(At(cell));
    }
    // The cell at a (non-zero) index, of whichever design.
    static unsigned char* At(uint32_t cell) { return Ndm_PropertyTables::Cell(cell); }
    // A cell holding a pointer, and the pointer a cell holds.
    uint32_t Hold(const void* p) {
        const uint32_t cell = Get();
        std::memcpy(At(cell), &p, sizeof p);
        return cell;
    }
    static void* Held(uint32_t cell) {
        void* p;
        std::memcpy(&p, At(cell), sizeof p);
        return p;
    }

private:
    void Refill();
#if NDM_ASAN
    // Under AddressSanitizer a free cell is poisoned, so that a property used after it was
    // deleted is still reported.
    static void Poison(void* cell) { ASAN_POISON_MEMORY_REGION(cell, kCell); }
    static void Unpoison(void* cell) { ASAN_UNPOISON_MEMORY_REGION(cell, kCell); }
#else
    static void Poison(void*) {}
    static void Unpoison(void*) {}
#endif
    Ndm_Design* design_;            // at the head of each chunk
    std::vector<uint32_t> chunks_;  // numbers of this design's chunks
    uint32_t next_ = 0, left_ = 0, free_ = 0;
};

// Property names, process-wide: a name is kept once and known by a 24-bit id. Names are few (the
// constraint and attribute names) and stay for the life of the process.
class Ndm_PropertyNames {
public:
    static constexpr uint32_t kMaxIds = uint32_t{1} << 24;
    // The id of name, added if new; Ndm_PropertyTables::names gives the name of an id.
    static uint32_t Id(const char* name);

private:
    struct Table {
        Ndm_NamePool pool;
        Ndm_PtrMap ids;  // stored name -> id + 1
    };
    static Table& Tables();
    static std::vector<const char*> names_;
    // The ids of the short names asked for last, keyed by their bytes: callers pass the same
    // few names millions of times.
    struct Recent {
        Ndm_ShortText key;
        uint32_t id = kMaxIds;
    };
    static Recent recent_[64];
};

// The string-list values of a design: one for each distinct short list, reached from the list
// it extends by one text. Lists are never freed before the design; each has a cell pointing to
// it, which properties holding the list point to.
class Ndm_TextLists {
public:
    explicit Ndm_TextLists(Ndm_PropertyCells& cells) : cells_(cells) {}
    Ndm_TextLists(const Ndm_TextLists&) = delete;
    Ndm_TextLists& operator=(const Ndm_TextLists&) = delete;
    // The cell of the list made of list's texts (cell 0: none) followed by text, which the
    // design has interned.
    uint32_t Extend(uint32_t list, const char* text);

private:
    struct Key {
        uint32_t list;
        const char* text;
        bool operator==(const Key&) const = default;
    };
    struct KeyHash {
        size_t operator()(const Key& k) const { return std::hash<const void*>()(k.text) * 31 + k.list; }
    };
    struct Value {
        std::unique_ptr<std::vector<std::string>> texts;
        uint32_t cell = 0;
    };
    Ndm_PropertyCells& cells_;
    std::unordered_map<Key, Value, KeyHash> lists_;
    // The last lists made or found, by their key: a statement gives thousands of objects the
    // same lists, one text at a time.
    struct Recent {
        Key key{};
        uint32_t cell = 0;
    };
    Recent recent_[64];
};
