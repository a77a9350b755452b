// How a design stores its properties (internal to host/design): the cells properties live in
// and the string-list values shared between them.
#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <unordered_map>
#include <vector>

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

// Cells of 24 bytes for a design's properties, taken from large chunks and reused once freed:
// a property costs its own size, with no allocator overhead, and making one is a pointer pop.
class Ndm_PropertyCells {
public:
    static constexpr size_t kCell = 24;
    void* Get() {
        if (free_) {
            void* cell = free_;
            Unpoison(cell);
            free_ = *static_cast<void**>(cell);
            return cell;
        }
        if (!left_) Refill();
        --left_;
        return cursor_++;
    }
    void Put(void* cell) {
        *static_cast<void**>(cell) = free_;
        free_ = cell;
        Poison(cell);
    }

private:
    struct alignas(8) Cell {
        unsigned char bytes[kCell];
    };
    void Refill();
    // Under AddressSanitizer a free cell is poisoned, so that a property used after it was
    // deleted is still reported.
#if NDM_ASAN
    static void Poison(void* cell) { ASAN_POISON_MEMORY_REGION(cell, kCell); }
    static void Unpoison(void* cell) { ASAN_UNPOISON_MEMORY_REGION(cell, kCell); }
#else
    static void Poison(void*) {}
    static void Unpoison(void*) {}
#endif
    std::vector<std::unique_ptr<Cell[]>> chunks_;
    Cell* cursor_ = nullptr;
    size_t left_ = 0;
    void* free_ = nullptr;
};

// The string-list values of a design: one for each distinct short list, reached from the list
// it extends by one text. Lists are never freed before the design.
class Ndm_TextLists {
public:
    // The list made of list's texts (null: none) followed by text, which the design has interned.
    const std::vector<std::string>* Extend(const std::vector<std::string>* list, const char* text);

private:
    struct Key {
        const void* list;
        const char* text;
        bool operator==(const Key&) const = default;
    };
    struct KeyHash {
        size_t operator()(const Key& k) const {
            return std::hash<const void*>()(k.list) * 31 + std::hash<const void*>()(k.text);
        }
    };
    std::unordered_map<Key, std::unique_ptr<std::vector<std::string>>, KeyHash> lists_;
    // The last lists made or found, by their key: a statement gives thousands of objects the
    // same lists, one text at a time.
    struct Recent {
        Key key{};
        const std::vector<std::string>* list = nullptr;
    };
    Recent recent_[64];
};
