// The snapshot of a repository file and the seal that tells Restore it may trust it.
//
// Snapshot layout: "LUNS", then the texts (a count, then each as its length, its bytes and a
// terminating zero, each distinct text once), then one record per row, each a tag byte and its
// fields. Numbers are varints, seven bits a byte, low bits first (signed ones zigzag-coded), texts are numbers into the text
// table, the ids of a constraint's own rows are implied by the constraint before them.
#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <unordered_map>
#include <vector>

#include "host/design/name_pool.h"
#include "host/parser/pr_logical.h"
#include "host/repository/cs_rows.h"

namespace Cs_Rows {

const char* ObjectWord(Object kind) {
    switch (kind) {
        case Object::Block: return "block";
        case Object::Network: return "network";
        case Object::Signal: return "signal";
        case Object::Pin: return "pin";
        case Object::Design: return "design";
        case Object::Constraint: return "constraint";
        case Object::None: break;
    }
    return nullptr;
}

bool ObjectFrom(std::string_view word, Object& out) {
    for (Object k : {Object::Block, Object::Network, Object::Signal, Object::Pin, Object::Design, Object::Constraint})
        if (word == ObjectWord(k)) {
            out = k;
            return true;
        }
    return false;
}

namespace {

constexpr char kMagic[4] = {'L', 'U', 'N', 'S'};
enum Tag : uint8_t { kSource = 1, kConstraint, kPath, kAssociation, kConflict, kStatus };

void PutU(std::string& out, uint64_t v) {
    while (v >= 0x80) {
        out.push_back(static_cast<char>(v | 0x80));
        v >>= 7;
    }
    out.push_back(static_cast<char>(v));
}
void PutS(std::string& out, int64_t v) { PutU(out, (static_cast<uint64_t>(v) << 1) ^ static_cast<uint64_t>(v >> 63)); }

// Reads a snapshot from the front; every read checks the bounds.
class Reader {
public:
    Reader(const char* data, size_t size) : p_(reinterpret_cast<const unsigned char*>(data)), end_(p_ + size) {}
    bool ok() const { return ok_; }
    bool done() const { return p_ == end_; }
    uint64_t U() {
        uint64_t v = 0;
        for (int shift = 0; shift < 64; shift += 7) {
            if (p_ == end_) return Bad();
            const unsigned char b = *p_++;
            v |= static_cast<uint64_t>(b & 0x7f) << shift;
            if (!(b & 0x80)) return v;
        }
        return Bad();
    }
    int64_t S() {
        const uint64_t v = U();
        return static_cast<int64_t>(v >> 1) ^ -static_cast<int64_t>(v & 1);
    }
    uint8_t Byte() { return p_ == end_ ? static_cast<uint8_t>(Bad()) : *p_++; }
    // size bytes followed by a zero
    const char* Bytes(uint64_t size) {
        if (static_cast<uint64_t>(end_ - p_) <= size || p_[size] != 0) return Bad(), nullptr;
        const char* at = reinterpret_cast<const char*>(p_);
        p_ += size + 1;
        return at;
    }
    std::string_view Text(const std::vector<std::string_view>& texts) {
        const uint64_t i = U();
        if (i >= texts.size()) return Bad(), std::string_view();
        return texts[i];
    }
    uint64_t Bad() {
        ok_ = false;
        p_ = end_;
        return 0;
    }

private:
    const unsigned char* p_;
    const unsigned char* end_;
    bool ok_ = true;
};

}  // namespace

struct SnapshotWriter::Impl {
    Ndm_NamePool pool;
    std::unordered_map<const char*, uint64_t> numbers;
    std::string texts, body;
    uint64_t count = 0;
    int64_t constraint = 0;  // the last constraint written
    void Text(std::string_view text) {
        const char* at = pool.Intern(text);
        auto [it, fresh] = numbers.try_emplace(at, count);
        if (fresh) {
            ++count;
            PutU(texts, text.size());
            texts.append(text).push_back('\0');
        }
        PutU(body, it->second);
    }
    bool Own(int64_t id, std::string& why) {
        if (id == constraint) return true;
        why = "a row does not follow its constraint";
        return false;
    }
};

SnapshotWriter::SnapshotWriter() : impl_(std::make_unique<Impl>()) {}
SnapshotWriter::~SnapshotWriter() = default;

bool SnapshotWriter::Add(const Source& row) {
    std::string& b = impl_->body;
    b.push_back(kSource);
    impl_->Text(row.file);
    PutS(b, row.syntax);
    PutU(b, row.hash);
    PutU(b, row.size);
    b.push_back(row.read ? 1 : 0);
    return true;
}

bool SnapshotWriter::Add(const Constraint& row) {
    if (row.id != impl_->constraint + 1) {
        why_ = "constraints are not numbered in order";
        return false;
    }
    impl_->constraint = row.id;
    std::string& b = impl_->body;
    b.push_back(kConstraint);
    PutS(b, row.source);
    PutS(b, row.line);
    PutS(b, TypeNumber(*row.type));
    b.push_back(static_cast<char>(row.scope));
    impl_->Text(row.target);
    impl_->Text(row.key);
    impl_->Text(row.value);
    b.push_back(row.flag ? 1 : 0);
    impl_->Text(row.statement);
    PutS(b, row.parent);
    b.push_back(static_cast<char>(row.block));
    if (row.block != Cs_Block::None) {
        impl_->Text(row.entry);
        impl_->Text(row.stored);
    }
    return true;
}

bool SnapshotWriter::Add(const Path& row) {
    if (!impl_->Own(row.constraint, why_)) return false;
    impl_->body.push_back(kPath);
    impl_->Text(row.group);
    return true;
}

bool SnapshotWriter::Add(const Association& row) {
    if (!impl_->Own(row.constraint, why_)) return false;
    std::string& b = impl_->body;
    b.push_back(kAssociation);
    b.push_back(static_cast<char>(row.kind));
    if (row.kind == Object::Constraint)
        PutS(b, row.other);
    else
        impl_->Text(row.object);
    return true;
}

bool SnapshotWriter::Add(const Conflict& row) {
    if (!impl_->Own(row.constraint, why_)) return false;
    std::string& b = impl_->body;
    b.push_back(kConflict);
    PutS(b, row.type);
    b.push_back(static_cast<char>(row.kind));
    if (row.kind != Object::None) impl_->Text(row.object);
    PutS(b, row.by);
    return true;
}

bool SnapshotWriter::Add(const Status& row) {
    std::string& b = impl_->body;
    b.push_back(kStatus);
    PutS(b, row.source);
    PutS(b, row.id);
    PutS(b, row.severity);
    PutS(b, row.number);
    impl_->Text(row.message);
    impl_->Text(row.file);
    PutS(b, row.line);
    PutS(b, row.constraint);
    return true;
}

std::string SnapshotWriter::Finish() {
    std::string out(kMagic, sizeof kMagic);
    PutU(out, impl_->count);
    out += impl_->texts;
    out += impl_->body;
    return out;
}

bool ReadSnapshot(const char* data, size_t size, Sink& sink, std::string& error) {
    if (size < sizeof kMagic || std::memcmp(data, kMagic, sizeof kMagic) != 0) {
        error = "its snapshot has no known layout";
        return false;
    }
    Reader in(data + sizeof kMagic, size - sizeof kMagic);
    std::vector<std::string_view> texts;
    const uint64_t count = in.U();
    if (count > size) in.Bad();
    texts.reserve(in.ok() ? count : 0);
    for (uint64_t i = 0; i < count && in.ok(); ++i) {
        const uint64_t n = in.U();
        const char* at = in.Bytes(n);
        texts.emplace_back(at, at ? n : 0);
    }
    int64_t constraint = 0;
    auto object = [&](Object& kind) {
        const uint8_t k = in.Byte();
        if (k > static_cast<uint8_t>(Object::Constraint)) in.Bad();
        kind = static_cast<Object>(k);
    };
    bool fed = true;
    while (in.ok() && !in.done() && fed) {
        switch (in.Byte()) {
            case kSource: {
                Source r;
                r.file = in.Text(texts);
                r.syntax = in.S();
                r.hash = in.U();
                r.size = in.U();
                r.read = in.Byte() != 0;
                fed = in.ok() && sink.Add(r);
                break;
            }
            case kConstraint: {
                Constraint r;
                r.id = ++constraint;
                r.source = in.S();
                r.line = in.S();
                r.type = TypeAt(in.S());
                const uint8_t scope = in.Byte();
                if (!r.type || scope > static_cast<uint8_t>(Cs_Scope::Comment)) in.Bad();
                r.scope = static_cast<Cs_Scope>(scope);
                r.target = in.Text(texts);
                r.key = in.Text(texts);
                r.value = in.Text(texts);
                r.flag = in.Byte() != 0;
                r.statement = in.Text(texts);
                r.parent = in.S();
                const uint8_t block = in.Byte();
                if (block > static_cast<uint8_t>(Cs_Block::Config)) in.Bad();
                r.block = static_cast<Cs_Block>(block);
                if (r.block != Cs_Block::None) {
                    r.entry = in.Text(texts);
                    r.stored = in.Text(texts);
                }
                fed = in.ok() && sink.Add(r);
                break;
            }
            case kPath: {
                Path r{constraint, in.Text(texts)};
                fed = in.ok() && constraint && sink.Add(r);
                break;
            }
            case kAssociation: {
                Association r;
                r.constraint = constraint;
                object(r.kind);
                if (r.kind == Object::Constraint)
                    r.other = in.S();
                else
                    r.object = in.Text(texts);
                fed = in.ok() && constraint && r.kind != Object::None && sink.Add(r);
                break;
            }
            case kConflict: {
                Conflict r;
                r.constraint = constraint;
                r.type = in.S();
                object(r.kind);
                if (r.kind != Object::None) r.object = in.Text(texts);
                r.by = in.S();
                fed = in.ok() && constraint && sink.Add(r);
                break;
            }
            case kStatus: {
                Status r;
                r.source = in.S();
                r.id = in.S();
                r.severity = in.S();
                r.number = in.S();
                r.message = in.Text(texts);
                r.file = in.Text(texts);
                r.line = in.S();
                r.constraint = in.S();
                fed = in.ok() && sink.Add(r);
                break;
            }
            default: in.Bad();
        }
    }
    if (!fed && !sink.why().empty()) {
        error = sink.why();
        return false;
    }
    if (!in.ok() || !fed) {
        error = "its snapshot is malformed";
        return false;
    }
    return true;
}

// ---- the seal

namespace {

// Four independent lanes of multiply-rotate rounds, so that the processor overlaps them: a few
// bytes a cycle, for files of megabytes.
struct LaneHash {
    static constexpr uint64_t kP1 = 11400714785074694791ull, kP2 = 14029467366897019727ull;
    uint64_t lane[4] = {kP1 + kP2, kP2, 0, 0 - kP1};
    static uint64_t Rotl(uint64_t v, int r) { return (v << r) | (v >> (64 - r)); }
    static uint64_t Round(uint64_t acc, uint64_t v) { return Rotl(acc + v * kP2, 31) * kP1; }
    // Whole blocks of 32 bytes; returns how many bytes it took.
    size_t Blocks(const unsigned char* p, size_t n) {
        size_t done = 0;
        for (; n - done >= 32; done += 32)
            for (int i = 0; i < 4; ++i) {
                uint64_t v;
                std::memcpy(&v, p + done + 8 * i, 8);
                lane[i] = Round(lane[i], v);
            }
        return done;
    }
    uint32_t Final(const unsigned char* tail, size_t n, size_t total) {
        uint64_t h = Rotl(lane[0], 1) + Rotl(lane[1], 7) + Rotl(lane[2], 12) + Rotl(lane[3], 18);
        h ^= total * kP1;
        for (size_t i = 0; i < n; ++i) h = Rotl(h ^ (tail[i] * kP2), 11) * kP1;
        h ^= h >> 33;
        h *= kP2;
        h ^= h >> 29;
        return static_cast<uint32_t>(h ^ (h >> 32));
    }
};

constexpr size_t kHeader = 100;  // the database header, which holds the seal

const unsigned char* Bytes(const Pr_FileText& file) { return reinterpret_cast<const unsigned char*>(file.data()); }

uint32_t Stored(const unsigned char* data) {
    return static_cast<uint32_t>(data[kSealOffset]) << 24 | static_cast<uint32_t>(data[kSealOffset + 1]) << 16 |
           static_cast<uint32_t>(data[kSealOffset + 2]) << 8 | data[kSealOffset + 3];
}

}  // namespace

uint32_t Seal(const unsigned char* data, size_t size) {
    LaneHash h;
    // The header with the seal's own bytes as zeros, padded to whole blocks; then the rest.
    unsigned char head[128] = {};
    const size_t head_size = size < kHeader ? size : kHeader;
    std::memcpy(head, data, head_size);
    if (head_size >= kSealOffset + 4) std::memset(head + kSealOffset, 0, 4);
    h.Blocks(head, sizeof head);
    const unsigned char* rest = data + head_size;
    const size_t left = size - head_size;
    const size_t took = h.Blocks(rest, left);
    return h.Final(rest + took, left - took, size);
}

bool SealFile(const std::string& path, std::string& error) {
    uint32_t seal;
    {
        auto file = Pr_FileText::Read(path.c_str());
        if (!file || file->size() < kHeader) {
            error = "cannot read back " + path;
            return false;
        }
        seal = Seal(Bytes(*file), file->size());
    }
    const unsigned char bytes[4] = {static_cast<unsigned char>(seal >> 24), static_cast<unsigned char>(seal >> 16),
                                    static_cast<unsigned char>(seal >> 8), static_cast<unsigned char>(seal)};
    const int fd = ::open(path.c_str(), O_WRONLY | O_CLOEXEC);
    const bool ok = fd >= 0 && ::pwrite(fd, bytes, 4, kSealOffset) == 4;
    if (!ok) error = std::strerror(errno);
    if (fd >= 0 && ::close(fd) != 0 && ok) {
        error = std::strerror(errno);
        return false;
    }
    return ok;
}

bool SealHolds(const std::string& path) {
    auto file = Pr_FileText::Read(path.c_str());
    return file && file->size() >= kHeader && Stored(Bytes(*file)) == Seal(Bytes(*file), file->size());
}

}  // namespace Cs_Rows
