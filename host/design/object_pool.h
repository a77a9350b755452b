// Storage of a design's objects (internal to host/design): objects are made in place in large
// chunks and never move, and all of them go with the design. A million cells cost their own
// size, with no allocator header or rounding per object.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <memory>
#include <new>
#include <utility>
#include <vector>

// Memory for objects that live as long as the design, handed out in 8-byte steps from 1 MB
// chunks; a request of more than a quarter chunk gets a chunk of its own.
class Ndm_Arena {
public:
    Ndm_Arena() = default;
    Ndm_Arena(const Ndm_Arena&) = delete;
    Ndm_Arena& operator=(const Ndm_Arena&) = delete;

    void* Allocate(size_t bytes) {
        bytes = (bytes + 7) & ~size_t{7};
        if (bytes > left_) return Refill(bytes);
        void* out = cursor_;
        cursor_ += bytes;
        left_ -= bytes;
        return out;
    }

private:
    static constexpr size_t kChunk = size_t{1} << 20;
    struct alignas(8) Word {
        unsigned char bytes[8];
    };
    void* Refill(size_t bytes) {
        if (bytes > kChunk / 4) {
            chunks_.emplace_back(new Word[bytes / 8]);
            return chunks_.back().get();
        }
        chunks_.emplace_back(new Word[kChunk / 8]);
        cursor_ = reinterpret_cast<unsigned char*>(chunks_.back().get()) + bytes;
        left_ = kChunk - bytes;
        return chunks_.back().get();
    }
    std::vector<std::unique_ptr<Word[]>> chunks_;
    unsigned char* cursor_ = nullptr;
    size_t left_ = 0;
};

// Numbers from 1 up to a limit, handed out and given back for reuse: the process-wide numbers of
// chunks that 32-bit ids point into. 0 is never handed out.
class Ndm_Numbers {
public:
    explicit Ndm_Numbers(uint32_t limit) : limit_(limit) {}
    // A free number; throws bad_alloc when all are taken.
    uint32_t Take() {
        if (!free_.empty()) {
            const uint32_t n = free_.back();
            free_.pop_back();
            return n;
        }
        if (next_ == limit_) throw std::bad_alloc();
        return next_++;
    }
    void Give(uint32_t n) { free_.push_back(n); }

private:
    uint32_t limit_, next_ = 1;
    std::vector<uint32_t> free_;
};

// Objects of one type, made in chunks of kPer and destroyed in the order they were made.
template <class T>
class Ndm_Pool {
public:
    Ndm_Pool() = default;
    Ndm_Pool(const Ndm_Pool&) = delete;
    Ndm_Pool& operator=(const Ndm_Pool&) = delete;
    ~Ndm_Pool() {
        ForEach([](T* item) { item->~T(); });
    }

    // Calls f on every object, in the order they were made.
    template <class F>
    void ForEach(F f) {
        for (size_t c = 0; c < chunks_.size(); ++c) {
            T* items = reinterpret_cast<T*>(chunks_[c].get());
            const size_t n = c + 1 < chunks_.size() ? kPer : used_;
            for (size_t i = 0; i < n; ++i) f(items + i);
        }
    }

    template <class... Args>
    T* Make(Args&&... args) {
        if (chunks_.empty() || used_ == kPer) {
            chunks_.emplace_back(new Slot[kPer]);
            used_ = 0;
        }
        T* at = reinterpret_cast<T*>(chunks_.back().get()) + used_;
        new (at) T(std::forward<Args>(args)...);
        ++used_;
        return at;
    }

private:
    static constexpr size_t kPer = 4096;
    struct alignas(T) Slot {
        unsigned char bytes[sizeof(T)];
    };
    std::vector<std::unique_ptr<Slot[]>> chunks_;
    size_t used_ = 0;  // in the last chunk
};
