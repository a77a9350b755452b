#include "host/design/name_pool.h"

#include <algorithm>
#include <bit>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <new>
#include <stdexcept>

#include <sys/mman.h>

#include "host/design/object_pool.h"

namespace {
constexpr size_t kChunk = 1 << 20;
constexpr size_t kHugePage = size_t{2} << 20;
}  // namespace

template <class T>
T* Ndm_TableAllocator<T>::allocate(size_t n) {
    const size_t bytes = n * sizeof(T);
    if (bytes < 2 * kHugePage) return static_cast<T*>(::operator new(bytes));
    const size_t rounded = (bytes + kHugePage - 1) & ~(kHugePage - 1);
    void* p = std::aligned_alloc(kHugePage, rounded);
    if (!p) throw std::bad_alloc();
    ::madvise(p, rounded, MADV_HUGEPAGE);
    return static_cast<T*>(p);
}

template <class T>
void Ndm_TableAllocator<T>::deallocate(T* p, size_t n) {
    if (n * sizeof(T) < 2 * kHugePage)
        ::operator delete(p);
    else
        std::free(p);
}

template struct Ndm_TableAllocator<uint64_t>;
template struct Ndm_TableAllocator<Ndm_PtrMap::Slot>;

uint64_t Ndm_NamePool::Hash(std::string_view text) {
    // Eight bytes a step (names are short, file contents long), then a final mix so that low
    // bits spread well.
    auto step = [](uint64_t h, uint64_t word) {
        h ^= word * 0xbf58476d1ce4e5b9ull;
        h = (h << 27) | (h >> 37);
        return h * 0x94d049bb133111ebull;
    };
    uint64_t h = 0x9e3779b97f4a7c15ull ^ (text.size() * 0xff51afd7ed558ccdull);
    const char* p = text.data();
    size_t n = text.size();
    for (; n >= 8; p += 8, n -= 8) {
        uint64_t word;
        std::memcpy(&word, p, 8);
        h = step(h, word);
    }
    if (n) {
        uint64_t word = 0;
        std::memcpy(&word, p, n);
        h = step(h, word);
    }
    h ^= h >> 31;
    h *= 0xbf58476d1ce4e5b9ull;
    h ^= h >> 29;
    return h;
}

namespace {
// The chunks that gave out text ids, process-wide, so that an id alone finds its text. Numbers
// of released chunks are reused; 0 is not a chunk.
constexpr size_t kMaxTextChunks = size_t{1} << 12;
const char* g_text_chunks[kMaxTextChunks];
Ndm_Numbers& TextChunkNumbers() {
    static Ndm_Numbers numbers(kMaxTextChunks);
    return numbers;
}
}  // namespace

const char* Ndm_NamePool::TextBase(uint32_t chunk_id) { return g_text_chunks[chunk_id]; }

Ndm_NamePool::Ndm_NamePool() : slots_(1024) {}
Ndm_NamePool::~Ndm_NamePool() {
    for (const Chunk& chunk : chunks_) {
        if (!chunk.id) continue;
        g_text_chunks[chunk.id] = nullptr;
        TextChunkNumbers().Give(chunk.id);
    }
}

uint32_t Ndm_NamePool::IdOf(const char* stored) {
    if (!stored || !*stored) return 0;
    const auto at = reinterpret_cast<uintptr_t>(stored);
    auto holds = [&](size_t c) {
        const auto base = reinterpret_cast<uintptr_t>(chunks_[c].bytes.get());
        return at >= base && at < base + chunks_[c].used;
    };
    size_t c = last_id_chunk_;
    if (c >= chunks_.size() || !holds(c)) {
        auto it = std::upper_bound(by_address_.begin(), by_address_.end(), at, [&](uintptr_t a, uint32_t i) {
            return a < reinterpret_cast<uintptr_t>(chunks_[i].bytes.get());
        });
        // Only texts this pool stored have ids.
        if (it == by_address_.begin() || !holds(*(it - 1))) throw std::invalid_argument("text not interned here");
        c = *(it - 1);
        last_id_chunk_ = c;
    }
    Chunk& chunk = chunks_[c];
    if (!chunk.id) {
        chunk.id = TextChunkNumbers().Take();
        g_text_chunks[chunk.id] = chunk.bytes.get();
    }
    return chunk.id << kOffsetBits | static_cast<uint32_t>(at - reinterpret_cast<uintptr_t>(chunk.bytes.get()));
}

namespace {
constexpr uint64_t kAddressMask = (uint64_t{1} << 48) - 1;
constexpr unsigned char kLong = 255;
const char* AddressOf(uint64_t slot) { return reinterpret_cast<const char*>(static_cast<uintptr_t>(slot & kAddressMask)); }
uint64_t TagOf(uint64_t hash) { return hash >> 48 << 48; }
}  // namespace

size_t Ndm_NamePool::StoredLength(const char* stored) {
    const auto mark = static_cast<unsigned char>(stored[-1]);
    if (mark != kLong) return mark;
    uint64_t size;
    std::memcpy(&size, stored - 9, 8);
    return static_cast<size_t>(size);
}

const char* Ndm_NamePool::Find(std::string_view text) const {
    const uint64_t h = Hash(text), tag = TagOf(h);
    const size_t mask = slots_.size() - 1;
    for (size_t i = h & mask;; i = (i + 1) & mask) {
        const uint64_t slot = slots_[i];
        if (!slot) return nullptr;
        if ((slot & ~kAddressMask) != tag) continue;
        const char* s = AddressOf(slot);
        if (StoredLength(s) == text.size() && (text.empty() || std::memcmp(s, text.data(), text.size()) == 0))
            return s;
    }
}

const char* Ndm_NamePool::Intern(std::string_view text) {
    Ndm_ShortText key;
    if (!key.Of(text)) return Lookup(text);
    Short& entry = short_[key.Slot(8)];
    if (entry.stored && entry.key == key) return entry.stored;
    const char* stored = Lookup(text);
    entry = Short{key, stored};
    return stored;
}

uint64_t Ndm_NamePool::Prefetch(std::string_view text) const {
    const uint64_t hash = Hash(text);
    if (!slots_.empty()) __builtin_prefetch(&slots_[hash & (slots_.size() - 1)]);
    return hash;
}

void Ndm_NamePool::InternAll(std::span<const std::string_view> texts, const char** out) {
    constexpr size_t kAhead = 16;
    uint64_t hashes[kAhead];
    const size_t n = texts.size();
    auto fetch = [&](size_t i) { hashes[i % kAhead] = Prefetch(texts[i]); };
    for (size_t i = 0; i < n && i < kAhead; ++i) fetch(i);
    for (size_t i = 0; i < n; ++i) {
        const uint64_t h = hashes[i % kAhead];
        if (i + kAhead < n) fetch(i + kAhead);
        out[i] = Lookup(texts[i], h, nullptr);
    }
}

const char* Ndm_NamePool::Lookup(std::string_view text, uint64_t h, bool* added) {
    const uint64_t tag = TagOf(h);
    const size_t mask = slots_.size() - 1;
    size_t i = h & mask;
    for (;; i = (i + 1) & mask) {
        const uint64_t slot = slots_[i];
        if (!slot) break;
        if ((slot & ~kAddressMask) != tag) continue;
        const char* s = AddressOf(slot);
        if (StoredLength(s) == text.size() && (text.empty() || std::memcmp(s, text.data(), text.size()) == 0)) {
            if (added) *added = false;
            return s;
        }
    }
    if (added) *added = true;
    const char* stored = Store(text);
    slots_[i] = tag | reinterpret_cast<uintptr_t>(stored);
    if (++used_ * 2 > slots_.size()) Grow();
    return stored;
}

char* Ndm_NamePool::Keep(size_t size) {
    kept_.emplace_back(new char[size ? size : 1]);
    bytes_ += size;
    return kept_.back().get();
}

const char* Ndm_NamePool::Store(std::string_view text) {
    const bool long_text = text.size() >= kLong;
    const size_t head = long_text ? 10 : 1, need = head + text.size() + 1;
    Chunk* chunk = chunks_.empty() ? nullptr : &chunks_[open_];
    if (!chunk || need > kChunk - chunk->used) {
        const bool alone = need > kChunk / 4;  // a text of its own chunk leaves the open one open
        const size_t size = alone ? need : kChunk;
        std::unique_ptr<char[]> bytes(new char[size]);
        // Addresses are kept in 48 bits, as every 64-bit system gives them to programs.
        if ((reinterpret_cast<uintptr_t>(bytes.get()) + size) >> kAddressBits) throw std::bad_alloc();
        const char* base = bytes.get();
        chunks_.push_back(Chunk{std::move(bytes), 0});
        auto place = std::upper_bound(by_address_.begin(), by_address_.end(), base,
                                      [&](const char* a, uint32_t i) { return a < chunks_[i].bytes.get(); });
        by_address_.insert(place, static_cast<uint32_t>(chunks_.size() - 1));
        if (!alone || chunks_.size() == 1) open_ = chunks_.size() - 1;
        chunk = &chunks_.back();
    }
    char* out = chunk->bytes.get() + chunk->used;
    if (long_text) {
        const uint64_t size = text.size();
        out[0] = static_cast<char>(kLong);
        std::memcpy(out + 1, &size, 8);
    }
    out[head - 1] = static_cast<char>(long_text ? kLong : text.size());
    out += head;
    if (!text.empty()) std::memcpy(out, text.data(), text.size());
    out[text.size()] = '\0';
    chunk->used += need;
    bytes_ += need;
    return out;
}

void Ndm_NamePool::Insert(const char* stored, uint64_t hash) {
    const size_t mask = slots_.size() - 1;
    size_t i = hash & mask;
    while (slots_[i]) i = (i + 1) & mask;
    slots_[i] = TagOf(hash) | reinterpret_cast<uintptr_t>(stored);
}

namespace {
// Slots for that many entries at most half full: a power of two.
size_t SlotsFor(size_t entries) { return std::bit_ceil(std::max<size_t>(16, entries * 2)); }
}  // namespace

void Ndm_NamePool::Reserve(size_t more) {
    const size_t slots = SlotsFor(used_ + more);
    if (slots > slots_.size()) Rehash(slots);
}

void Ndm_NamePool::Rehash(size_t slots) {
    decltype(slots_)(slots).swap(slots_);
    for (const Chunk& chunk : chunks_) {
        const char* at = chunk.bytes.get();
        const char* const end = at + chunk.used;
        while (at < end) {
            const char* text = at + (static_cast<unsigned char>(*at) == kLong ? 10 : 1);
            const size_t size = StoredLength(text);
            Insert(text, Hash({text, size}));
            at = text + size + 1;
        }
    }
}

size_t Ndm_PtrMap::HashPtr(const void* key) {
    uint64_t h = reinterpret_cast<uintptr_t>(key);
    h ^= h >> 33;
    h *= 0xff51afd7ed558ccdull;
    h ^= h >> 33;
    return static_cast<size_t>(h);
}

void* Ndm_PtrMap::Find(const void* key) const {
    if (slots_.empty()) return nullptr;
    size_t mask = slots_.size() - 1;
    for (size_t i = HashPtr(key) & mask;; i = (i + 1) & mask) {
        if (slots_[i].key == key) return slots_[i].value;
        if (!slots_[i].key) return nullptr;
    }
}

void* Ndm_PtrMap::InsertIfAbsent(const void* key, void* value) {
    if ((used_ + 1) * 2 > slots_.size()) Grow();
    size_t mask = slots_.size() - 1;
    for (size_t i = HashPtr(key) & mask;; i = (i + 1) & mask) {
        if (slots_[i].key == key) return slots_[i].value;
        if (!slots_[i].key) {
            slots_[i] = Slot{key, value};
            ++used_;
            return value;
        }
    }
}

void Ndm_PtrMap::Reserve(size_t keys) {
    const size_t slots = SlotsFor(keys + 1);
    if (slots > slots_.size()) Rehash(slots);
}

void Ndm_PtrMap::Rehash(size_t slots) {
    decltype(slots_) old(slots);
    old.swap(slots_);
    size_t mask = slots_.size() - 1;
    for (const Slot& s : old) {
        if (!s.key) continue;
        size_t i = HashPtr(s.key) & mask;
        while (slots_[i].key) i = (i + 1) & mask;
        slots_[i] = s;
    }
}
