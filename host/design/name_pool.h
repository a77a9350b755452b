// Interned names of a design: each distinct text is stored once in an arena and found again
// through an open-addressing hash set.
#pragma once

#include <cstdint>
#include <cstring>
#include <memory>
#include <span>
#include <string_view>
#include <vector>

// The bytes of a text of up to 16 bytes, zero-padded, as a key for small caches of texts that
// come back millions of times (cell types, port and property names): no hashing of the text.
struct Ndm_ShortText {
    static constexpr size_t kMaxBytes = 16;
    uint64_t head = 0, tail = 0;
    size_t size = 0;
    // The key of text; false when text is too long to have one.
    bool Of(std::string_view text) {
        size = text.size();
        if (size > kMaxBytes) return false;
        // Fixed-size loads that may overlap, never past the text: no call to copy a few bytes.
        const char* p = text.data();
        if (size > 8) {
            head = Load<uint64_t>(p);
            tail = Load<uint64_t>(p + size - 8) >> (8 * (16 - size));
        } else if (size >= 4) {
            head = Load<uint32_t>(p) | uint64_t{Load<uint32_t>(p + size - 4)} << (8 * (size - 4));
            tail = 0;
        } else {
            const auto byte = [p](size_t i) { return uint64_t{static_cast<unsigned char>(p[i])} << (8 * i); };
            head = size ? byte(0) | byte(size / 2) | byte(size - 1) : 0;
            tail = 0;
        }
        return true;
    }
    // A place among 2^bits cache entries.
    size_t Slot(int bits) const {
        return ((head * 0x9e3779b97f4a7c15ull) ^ (tail * 0x94d049bb133111ebull) ^ size) >> (64 - bits);
    }
    bool operator==(const Ndm_ShortText&) const = default;

private:
    template <class T>
    static T Load(const char* p) {
        T v;
        std::memcpy(&v, p, sizeof v);
        return v;
    }
};

// Allocator of large hash tables: a table of megabytes is reached at random, one cache miss and
// one page-table walk per access; in huge pages the walks mostly go away.
template <class T>
struct Ndm_TableAllocator {
    using value_type = T;
    Ndm_TableAllocator() = default;
    template <class U>
    Ndm_TableAllocator(const Ndm_TableAllocator<U>&) {}  // NOLINT
    T* allocate(size_t n);
    void deallocate(T* p, size_t n);
    bool operator==(const Ndm_TableAllocator&) const = default;
};

class Ndm_NamePool {
public:
    Ndm_NamePool();
    ~Ndm_NamePool();
    Ndm_NamePool(const Ndm_NamePool&) = delete;
    Ndm_NamePool& operator=(const Ndm_NamePool&) = delete;
    // Stored copy of text (terminated), the same pointer for equal texts.
    const char* Intern(std::string_view text);
    // The same for a text that seldom comes back soon (an instance or a net name): it skips the
    // short texts' table, which it would only churn.
    const char* InternRare(std::string_view text) { return Lookup(text); }
    // The same for a text of a known hash, telling whether the text is new to the pool.
    const char* InternRare(std::string_view text, uint64_t hash, bool& added) { return Lookup(text, hash, &added); }
    // Interns every text of a list (out[i] for texts[i]), fetching slots a few texts ahead: the
    // bit names of a wide vector, which go to places far apart.
    void InternAll(std::span<const std::string_view> texts, const char** out);
    // Stored copy when the text was interned before, else null.
    const char* Find(std::string_view text) const;
    size_t bytes() const { return bytes_; }
    // Makes room for that many more texts, so that the set grows at most once for them.
    void Reserve(size_t more);
    // A block of size bytes that the pool keeps with its texts, for texts a caller lays out
    // itself (they are not interned).
    char* Keep(size_t size);

    static uint64_t Hash(std::string_view text);
    // Starts loading the slot of text into the cache, for a caller that interns it soon; gives
    // the text's hash, which InternRare takes.
    uint64_t Prefetch(std::string_view text) const;

    // A 32-bit id of a text this pool interned (the same id for the same text), for values that
    // keep their text in four bytes; Text(id) gives it back, and 0 stands for the empty text.
    uint32_t IdOf(const char* stored);
    static const char* Text(uint32_t id) { return id ? TextBase(id >> kOffsetBits) + (id & kOffsetMask) : ""; }

private:
    // A slot is 8 bytes: the stored text's address in the low 48 bits and the top 16 bits of
    // its hash above them (0: empty). The full hash is not kept: growing the set hashes the
    // texts again, reading the chunks front to back.
    static constexpr int kAddressBits = 48;
    // An id is the number of the chunk (registered with the process on the first id asked of
    // it) and the text's place in it.
    static constexpr int kOffsetBits = 20;
    static constexpr uint32_t kOffsetMask = (uint32_t{1} << kOffsetBits) - 1;
    static const char* TextBase(uint32_t chunk_id);
    const char* Store(std::string_view text);
    void Grow() { Rehash(slots_.size() * 2); }
    void Rehash(size_t slots);
    void Insert(const char* stored, uint64_t hash);
    // A stored text is preceded by its length: one byte below 255, else 255, eight bytes of
    // length and 255 again; it is followed by a NUL.
    static size_t StoredLength(const char* stored);

    // Short texts (cell types, port and property names) come back millions of times: the last
    // one stored at each of a few hundred places, keyed by its bytes, is found without hashing.
    struct Short {
        Ndm_ShortText key;
        const char* stored = nullptr;
    };
    Short short_[256];
    // Intern, without the short texts.
    const char* Lookup(std::string_view text, bool* added = nullptr) { return Lookup(text, Hash(text), added); }
    const char* Lookup(std::string_view text, uint64_t hash, bool* added);
    std::vector<uint64_t, Ndm_TableAllocator<uint64_t>> slots_;
    size_t used_ = 0;
    struct Chunk {
        std::unique_ptr<char[]> bytes;
        size_t used;
        uint32_t id = 0;  // registered number, or 0
    };
    std::vector<Chunk> chunks_;  // stored texts, in the order they came
    std::vector<uint32_t> by_address_;  // places in chunks_, by the chunks' addresses
    size_t last_id_chunk_ = 0;          // the chunk the last id came from
    size_t open_ = 0;            // the chunk texts are added to, when chunks_ is not empty
    std::vector<std::unique_ptr<char[]>> kept_;
    size_t bytes_ = 0;
};

// Map from an interned name to the first object (in stored order) carrying it; keys are
// compared by pointer. Open addressing, 16 bytes a slot.
class Ndm_PtrMap {
public:
    // Inserts unless the key is there; returns the value now stored.
    void* InsertIfAbsent(const void* key, void* value);
    void* Find(const void* key) const;
    // Makes room for that many keys in all.
    void Reserve(size_t keys);
    // Starts loading the slot of key into the cache, for a caller that will look it up soon.
    void Prefetch(const void* key) const {
        if (!slots_.empty()) __builtin_prefetch(&slots_[HashPtr(key) & (slots_.size() - 1)]);
    }
    void Clear() {
        slots_.clear();
        used_ = 0;
    }

private:
    struct Slot {
        const void* key = nullptr;
        void* value = nullptr;
    };
    static size_t HashPtr(const void* key);
    void Grow() { Rehash(slots_.empty() ? 16 : slots_.size() * 2); }
    void Rehash(size_t slots);
    std::vector<Slot, Ndm_TableAllocator<Slot>> slots_;
    size_t used_ = 0;
};
