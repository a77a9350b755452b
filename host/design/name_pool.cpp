#include "host/design/name_pool.h"

#include <cstring>

namespace {
constexpr size_t kChunk = 1 << 20;
}

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

Ndm_NamePool::Ndm_NamePool() : slots_(1024) {}

const char* Ndm_NamePool::Find(std::string_view text) const {
    uint64_t h = Hash(text);
    size_t mask = slots_.size() - 1;
    for (size_t i = h & mask;; i = (i + 1) & mask) {
        const Slot& s = slots_[i];
        if (!s.text) return nullptr;
        if (s.hash == static_cast<uint32_t>(h) && s.size == text.size() &&
            (text.empty() || std::memcmp(s.text, text.data(), text.size()) == 0))
            return s.text;
    }
}

const char* Ndm_NamePool::Intern(std::string_view text) {
    const size_t n = text.size();
    if (n > kShortBytes) return Lookup(text);
    uint64_t head = 0, tail = 0;
    if (n > 8) {
        std::memcpy(&head, text.data(), 8);
        std::memcpy(&tail, text.data() + 8, n - 8);
    } else if (n) {
        std::memcpy(&head, text.data(), n);
    }
    Short& entry = short_[((head * 0x9e3779b97f4a7c15ull) ^ (tail * 0x94d049bb133111ebull)) >> 56];
    if (entry.stored && entry.head == head && entry.tail == tail && entry.size == n) return entry.stored;
    const char* stored = Lookup(text);
    entry = Short{head, tail, n, stored};
    return stored;
}

const char* Ndm_NamePool::Lookup(std::string_view text) {
    uint64_t h = Hash(text);
    size_t mask = slots_.size() - 1;
    size_t i = h & mask;
    for (;; i = (i + 1) & mask) {
        Slot& s = slots_[i];
        if (!s.text) break;
        if (s.hash == static_cast<uint32_t>(h) && s.size == text.size() &&
            (text.empty() || std::memcmp(s.text, text.data(), text.size()) == 0))
            return s.text;
    }
    const char* stored = Store(text);
    slots_[i] = Slot{stored, static_cast<uint32_t>(h), static_cast<uint32_t>(text.size())};
    if (++used_ * 2 > slots_.size()) Grow();
    return stored;
}

char* Ndm_NamePool::Keep(size_t size) {
    chunks_.emplace_back(new char[size ? size : 1]);  // Store fills its chunk through cursor_
    bytes_ += size;
    return chunks_.back().get();
}

const char* Ndm_NamePool::Store(std::string_view text) {
    size_t need = text.size() + 1;
    if (need > left_) {
        size_t size = need > kChunk / 4 ? need : kChunk;
        chunks_.emplace_back(new char[size]);
        cursor_ = chunks_.back().get();
        left_ = size;
    }
    char* out = cursor_;
    if (!text.empty()) std::memcpy(out, text.data(), text.size());
    out[text.size()] = '\0';
    cursor_ += need;
    left_ -= need;
    bytes_ += need;
    return out;
}

void Ndm_NamePool::Grow() {
    std::vector<Slot> old(slots_.size() * 2);
    old.swap(slots_);
    size_t mask = slots_.size() - 1;
    for (const Slot& s : old) {
        if (!s.text) continue;
        size_t i = s.hash & mask;  // the low 32 bits of the hash are kept; tables stay below 2^32 slots
        while (slots_[i].text) i = (i + 1) & mask;
        slots_[i] = s;
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

void Ndm_PtrMap::Grow() {
    std::vector<Slot> old(slots_.empty() ? 16 : slots_.size() * 2);
    old.swap(slots_);
    size_t mask = slots_.size() - 1;
    for (const Slot& s : old) {
        if (!s.key) continue;
        size_t i = HashPtr(s.key) & mask;
        while (slots_[i].key) i = (i + 1) & mask;
        slots_[i] = s;
    }
}
