// Groups of findings' material kept in the order their first member came, so that findings come
// out the same on every run whatever the hashing.
#pragma once

#include <functional>
#include <unordered_map>
#include <utility>
#include <vector>

struct Ck_PairHash {
    template <class A, class B>
    size_t operator()(const std::pair<A, B>& p) const {
        return std::hash<A>()(p.first) * 31 + std::hash<B>()(p.second);
    }
};

template <class Key, class Member, class Hash = std::hash<Key>>
class Ck_OrderedGroups {
public:
    std::vector<Member>& operator[](const Key& key) {
        auto [it, fresh] = index_.try_emplace(key, groups_.size());
        if (fresh) groups_.emplace_back(key, std::vector<Member>());
        return groups_[it->second].second;
    }
    bool contains(const Key& key) const { return index_.count(key) != 0; }
    std::vector<std::pair<Key, std::vector<Member>>>& groups() { return groups_; }

private:
    std::unordered_map<Key, size_t, Hash> index_;
    std::vector<std::pair<Key, std::vector<Member>>> groups_;
};
