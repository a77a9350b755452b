// Names a design reader holds back for a few objects before it interns them (internal to the
// design readers). Interning a new name costs a cache miss in the design's name set; a name
// that waits has had its slot fetched (Ndm_Design::PrefetchName) while the reader went on.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

// A ring of the last names read, oldest first, each with its hash and what the reader keeps
// with it (the object that will carry the name).
template <class Payload, size_t kCount = 8>
class Ndm_WaitingNames {
public:
    struct Name {
        std::string text;  // its own copy: the object carries it until the name is interned
        uint64_t hash = 0;
        Payload payload{};
    };
    bool full() const { return count_ == kCount; }
    bool empty() const { return count_ == 0; }
    // Adds a name (the ring must not be full); it stays where it is until taken out.
    Name& Add(std::string_view text, uint64_t hash) {
        Name& name = names_[(first_ + count_++) % kCount];
        name.text.assign(text);
        name.hash = hash;
        name.payload = Payload{};
        return name;
    }
    // Takes the oldest name out; it stays valid until kCount more are added.
    Name& TakeOldest() {
        Name& name = names_[first_];
        first_ = (first_ + 1) % kCount;
        --count_;
        return name;
    }

private:
    Name names_[kCount];
    size_t first_ = 0, count_ = 0;
};
