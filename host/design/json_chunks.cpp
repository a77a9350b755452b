#include "host/design/json_chunks.h"

#include <algorithm>
#include <bit>
#include <cstdint>
#include <cstring>

#if defined(__SSE2__)
#include <emmintrin.h>
#endif
#if defined(__x86_64__) && (defined(__GNUC__) || defined(__clang__))
#include <immintrin.h>
#endif

namespace Ndm_JsonChunks {

namespace od = simdjson::ondemand;

Sizes& GetSizes() {
    static Sizes sizes;
    return sizes;
}

bool& UseWideBlocks() {
    static bool wide = true;
    return wide;
}

namespace {

// Which of 64 bytes are quotes, backslashes, opening and closing brackets, and commas.
struct Masks {
    uint64_t quote = 0, backslash = 0, open = 0, close = 0, comma = 0;
};

Masks Classify(const unsigned char* p) {
    Masks m;
#if defined(__SSE2__)
    const __m128i quote = _mm_set1_epi8('"'), backslash = _mm_set1_epi8('\\'), comma = _mm_set1_epi8(','),
                  open = _mm_set1_epi8('{'), close = _mm_set1_epi8('}'), fold = _mm_set1_epi8(0x20);
    for (int i = 0; i < 4; ++i) {
        const __m128i v = _mm_loadu_si128(reinterpret_cast<const __m128i*>(p + 16 * i));
        const __m128i folded = _mm_or_si128(v, fold);  // '[' and ']' become '{' and '}'
        auto bits = [i](__m128i eq) {
            return static_cast<uint64_t>(static_cast<uint32_t>(_mm_movemask_epi8(eq))) << (16 * i);
        };
        m.quote |= bits(_mm_cmpeq_epi8(v, quote));
        m.backslash |= bits(_mm_cmpeq_epi8(v, backslash));
        m.comma |= bits(_mm_cmpeq_epi8(v, comma));
        m.open |= bits(_mm_cmpeq_epi8(folded, open));
        m.close |= bits(_mm_cmpeq_epi8(folded, close));
    }
#else
    for (int i = 0; i < 64; ++i) {
        const uint64_t bit = uint64_t{1} << i;
        switch (p[i]) {
            case '"': m.quote |= bit; break;
            case '\\': m.backslash |= bit; break;
            case ',': m.comma |= bit; break;
            case '{': case '[': m.open |= bit; break;
            case '}': case ']': m.close |= bit; break;
            default: break;
        }
    }
#endif
    return m;
}

// The bytes escaped by a backslash: the byte after each run of an odd number of backslashes.
// carry tells whether the previous block ended on such a run, and is updated for the next.
uint64_t Escaped(uint64_t backslash, uint64_t& carry) {
    constexpr uint64_t kEven = 0x5555555555555555ULL;
    backslash &= ~carry;
    const uint64_t follows = backslash << 1 | carry;
    const uint64_t odd_starts = backslash & ~kEven & ~follows;
    uint64_t even_runs;
    carry = __builtin_add_overflow(odd_starts, backslash, &even_runs) ? 1 : 0;
    return (kEven ^ (even_runs << 1)) & follows;
}

// Bit i set when an odd number of bits up to and including i are set.
uint64_t PrefixXor(uint64_t x) {
    x ^= x << 1;
    x ^= x << 2;
    x ^= x << 4;
    x ^= x << 8;
    x ^= x << 16;
    x ^= x << 32;
    return x;
}

// What a pass looks at in a block of 64 bytes, strings taken out: its brackets and commas, and
// the string state it starts in (Escaped's carry, and whether it starts inside a string).
struct Block {
    uint64_t brackets, commas;
    uint64_t carry, in_string;
};

// Classifies count blocks from p, carrying the string state from block to block.
void ClassifyBlocks(const unsigned char* p, size_t count, uint64_t& carry, uint64_t& in_string, Block* out) {
    for (size_t k = 0; k < count; ++k, p += 64) {
        const Masks m = Classify(p);
        out[k].carry = carry;
        out[k].in_string = in_string;
        const uint64_t inside = PrefixXor(m.quote & ~Escaped(m.backslash, carry)) ^ in_string;
        in_string = static_cast<uint64_t>(static_cast<int64_t>(inside) >> 63);
        out[k].brackets = (m.open | m.close) & ~inside;
        out[k].commas = m.comma & ~inside;
    }
}

#if defined(__x86_64__) && (defined(__GNUC__) || defined(__clang__))
#define LUN_WIDE_BLOCKS 1
// The same with 32-byte registers, and the string bits by a carry-less multiplication.
__attribute__((target("avx2,pclmul"))) void ClassifyBlocksWide(const unsigned char* p, size_t count, uint64_t& carry,
                                                                uint64_t& in_string, Block* out) {
    const __m256i quote = _mm256_set1_epi8('"'), backslash = _mm256_set1_epi8('\\'), comma = _mm256_set1_epi8(','),
                  open = _mm256_set1_epi8('{'), close = _mm256_set1_epi8('}'), fold = _mm256_set1_epi8(0x20);
    const __m128i ones = _mm_set1_epi8(-1);
    for (size_t k = 0; k < count; ++k, p += 64) {
        const __m256i lo = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(p));
        const __m256i hi = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(p + 32));
        const __m256i lo_folded = _mm256_or_si256(lo, fold), hi_folded = _mm256_or_si256(hi, fold);
#define LUN_BITS(lo_eq, hi_eq)                                                   \
    (static_cast<uint64_t>(static_cast<uint32_t>(_mm256_movemask_epi8(lo_eq))) | \
     static_cast<uint64_t>(static_cast<uint32_t>(_mm256_movemask_epi8(hi_eq))) << 32)
        const uint64_t quotes = LUN_BITS(_mm256_cmpeq_epi8(lo, quote), _mm256_cmpeq_epi8(hi, quote));
        const uint64_t backslashes = LUN_BITS(_mm256_cmpeq_epi8(lo, backslash), _mm256_cmpeq_epi8(hi, backslash));
        const uint64_t commas = LUN_BITS(_mm256_cmpeq_epi8(lo, comma), _mm256_cmpeq_epi8(hi, comma));
        const uint64_t opens = LUN_BITS(_mm256_cmpeq_epi8(lo_folded, open), _mm256_cmpeq_epi8(hi_folded, open));
        const uint64_t closes = LUN_BITS(_mm256_cmpeq_epi8(lo_folded, close), _mm256_cmpeq_epi8(hi_folded, close));
#undef LUN_BITS
        out[k].carry = carry;
        out[k].in_string = in_string;
        const uint64_t real = quotes & ~Escaped(backslashes, carry);
        const uint64_t inside = static_cast<uint64_t>(_mm_cvtsi128_si64(
                                    _mm_clmulepi64_si128(_mm_cvtsi64_si128(static_cast<int64_t>(real)), ones, 0))) ^
                                in_string;
        in_string = static_cast<uint64_t>(static_cast<int64_t>(inside) >> 63);
        out[k].brackets = (opens | closes) & ~inside;
        out[k].commas = commas & ~inside;
    }
}
#endif

using ClassifyFn = void (*)(const unsigned char*, size_t, uint64_t&, uint64_t&, Block*);

ClassifyFn ChooseClassify() {
#if defined(LUN_WIDE_BLOCKS)
    if (UseWideBlocks() && __builtin_cpu_supports("avx2") && __builtin_cpu_supports("pclmul"))
        return ClassifyBlocksWide;
#endif
    return ClassifyBlocks;
}

bool IsSpace(char c) { return c == ' ' || c == '\n' || c == '\r' || c == '\t'; }

size_t SkipSpace(const char* d, size_t p, size_t end) {
    while (p < end && IsSpace(d[p])) ++p;
    return p;
}

// One past the closing quote of the string whose text starts at p, or end when it is not closed
// before end.
size_t StringEnd(const char* d, size_t p, size_t end) {
    while (p < end) {
        if (d[p] == '\\') {
            p += 2;
        } else if (d[p] == '"') {
            return p + 1;
        } else {
            ++p;
        }
    }
    return end;
}

// The outline; with input, its pages are given back as the pass goes.
bool Outline1(const char* data, size_t size, size_t piece, Outline& out, Ndm_JsonInput::Input* input) {
    out.containers.clear();
    out.root = UINT32_MAX;
    const size_t first = SkipSpace(data, 0, size);
    if (first == size || (data[first] != '{' && data[first] != '[')) return false;
    size_t last = size;
    while (last > first && IsSpace(data[last - 1])) --last;

    // An open container: its bracket, its last comma (or bracket), where its last cut falls, and
    // its record once it has one.
    struct Open {
        size_t open, separator, cut, element;
        uint32_t record;
        bool object;
        size_t commas = 0;
    };
    std::vector<Open> stack;
    auto record = [&out](Open& t) {
        if (t.record == UINT32_MAX) {
            t.record = static_cast<uint32_t>(out.containers.size());
            Container c;
            c.open = t.open;
            c.element = t.element;
            c.object = t.object;
            out.containers.push_back(std::move(c));
        }
        return t.record;
    };
    // A container that closes less than piece bytes after it opens leaves nothing in the
    // outline: in one, brackets are only matched and commas are not looked at. Each container
    // below the outermost is first taken for such a small one; when piece bytes pass before it
    // closes, or it holds containers more than kSkipDepth deep, the pass goes back to its
    // bracket and reads it as a large one. (A small cap keeps going back from costing more than
    // a few passes over any text.)
    constexpr int kSkipDepth = 4;
    struct Skip {
        size_t open = 0;                   // its bracket
        size_t base = 0;                   // the block of its bracket, and the string state
        uint64_t carry = 0, in_string = 0;  // before that block
        uint64_t kinds = 0;                // which brackets open in it are objects, innermost lowest
        int depth = 0;                     // 0: no container is being skipped
    } skip;
    size_t large = SIZE_MAX;  // the bracket of the container gone back to: not skipped again
    bool closed = false;      // the outermost container has closed
    // Blocks are classified a batch at a time, ahead of the walk through their brackets and
    // commas; carry and in_string are the string state after the batch.
    const ClassifyFn classify = ChooseClassify();
    constexpr size_t kBatch = 64;
    Block batch[kBatch];
    size_t batch_base = 0, batch_count = 0;
    uint64_t carry = 0, in_string = 0;
    uint64_t resume = ~uint64_t{0};  // the bits of the block to look at
    unsigned char tail[64];
    for (size_t base = first; base < size;) {
        if (input && (base & ((size_t{1} << 20) - 1)) < 64)
            input->DropBefore(base > piece + 128 ? base - piece - 128 : 0);  // going back stays mapped
        const unsigned char* block = reinterpret_cast<const unsigned char*>(data) + base;
        if (size - base < 64) {
            std::memset(tail, ' ', sizeof tail);
            std::memcpy(tail, block, size - base);
            block = tail;
        }
        if (base - batch_base >= batch_count * 64) {
            batch_base = base;
            batch_count = std::min((size - base) / 64, kBatch);
            if (batch_count)
                classify(block, batch_count, carry, in_string, batch);
            else
                classify(tail, batch_count = 1, carry, in_string, batch);
        }
        const Block& b = batch[(base - batch_base) / 64];
        const uint64_t brackets = b.brackets & resume;
        const uint64_t all = brackets | (b.commas & resume);
        resume = ~uint64_t{0};
        bool back = skip.depth && base - skip.open >= piece;  // the skipped container is large
        for (uint64_t s = all; s && !back;) {
            if (skip.depth) {
                uint64_t b = s & brackets;
                s = 0;
                for (; b; b &= b - 1) {
                    const int i = std::countr_zero(b);
                    const uint64_t object = (block[i] >> 5) & 1;  // '{' and '}', not '[' and ']'
                    if ((block[i] >> 1) & 1) {                    // '[' and '{'
                        if (skip.depth == kSkipDepth) {
                            back = true;
                            break;
                        }
                        skip.kinds = skip.kinds << 1 | object;
                        ++skip.depth;
                        continue;
                    }
                    if ((skip.kinds & 1) != object) return false;
                    skip.kinds >>= 1;
                    if (--skip.depth) continue;
                    if (base + static_cast<size_t>(i) - skip.open >= piece) {
                        back = true;
                        skip.depth = 1;
                    } else {
                        s = all & ~((uint64_t{2} << i) - 1);  // what follows it in the block
                    }
                    break;
                }
                continue;
            }
            const int i = std::countr_zero(s);
            s &= s - 1;
            const size_t pos = base + static_cast<size_t>(i);
            const unsigned char c = block[i];
            if (c == ',') {
                if (stack.empty()) return false;
                Open& t = stack.back();
                if (pos - t.cut >= piece) {
                    out.containers[record(t)].cuts.push_back(pos);
                    t.cut = pos;
                }
                t.separator = pos;
                ++t.commas;
            } else if (c == '{' || c == '[') {
                if (closed) return false;
                if (!stack.empty() && pos != large) {
                    skip = Skip{pos, base, b.carry, b.in_string, uint64_t{c == '{'}, 1};
                    continue;
                }
                const size_t element = stack.empty() ? pos : stack.back().separator + 1;
                stack.push_back({pos, pos, pos, element, UINT32_MAX, c == '{'});
            } else {
                if (stack.empty()) return false;
                Open t = stack.back();
                if (t.object != (c == '}')) return false;
                stack.pop_back();
                if (stack.empty()) closed = true;
                if (t.record == UINT32_MAX && pos - t.open < piece) continue;
                const uint32_t r = record(t);
                out.containers[r].close = pos;
                out.containers[r].members = t.commas + 1;  // a large container is not empty
                if (stack.empty())
                    out.root = r;
                else
                    out.containers[record(stack.back())].children.push_back(r);
            }
        }
        if (back) {
            large = skip.open;
            base = skip.base;
            carry = skip.carry;
            in_string = skip.in_string;
            batch_count = 0;
            resume = ~uint64_t{0} << (skip.open - skip.base);
            skip.depth = 0;
            continue;
        }
        base += 64;
    }
    if (skip.depth || in_string || !stack.empty() || !closed) return false;
    // Nothing but white space may follow the outermost container.
    if (out.root != UINT32_MAX) return out.containers[out.root].close == last - 1;
    return true;
}

}  // namespace

bool MakeOutline(const char* data, size_t size, size_t piece, Outline& out) {
    return Outline1(data, size, piece, out, nullptr);
}

bool MakeOutline(Ndm_JsonInput::Input& input, size_t piece, Outline& out) {
    const bool ok = Outline1(input.data(), input.size(), piece, out, &input);
    input.Rewind();
    return ok;
}

bool Reader::Fail(simdjson::error_code e, size_t offset) {
    error_ = e;
    error_offset_ = offset;
    return false;
}

size_t Reader::Offset() {
    const char* at = nullptr;
    if (!has_doc_ || doc_.current_location().get(at) || !at) return end_;
    const char* run = run_.get();
    if (run && at >= run && at <= run + run_size_) {
        const size_t k = static_cast<size_t>(at - run);
        return k == 0 ? run_base_ : std::min(run_base_ + k - 1, end_);
    }
    const char* d = input_.data();
    if (at >= d && at <= d + input_.size()) return static_cast<size_t>(at - d);
    return end_;
}

bool Reader::Read(const Outline& outline, Visitor& visitor) {
    error_ = simdjson::SUCCESS;
    const char* d = input_.data();
    enum : uint8_t { kOpener, kComma, kElement };  // what stands before the cursor
    struct Frame {
        uint32_t c;
        size_t cursor, child = 0, cut = 0;
        uint8_t left = kOpener;
    };
    std::vector<Frame> stack{{outline.root, outline.containers[outline.root].open + 1}};
    // Moves a frame past a large element that ends at close: to the comma after it, if any.
    auto after = [&](Frame& f, size_t close) {
        const Container& c = outline.containers[f.c];
        size_t p = SkipSpace(d, close + 1, c.close);
        f.left = kElement;
        if (p < c.close) {
            if (d[p] != ',') return Fail(simdjson::TAPE_ERROR, p);
            if (f.cut < c.cuts.size() && c.cuts[f.cut] == p) ++f.cut;
            f.left = kComma;
            ++p;
        }
        f.cursor = p;
        input_.DropBefore(close);
        return true;
    };
    while (!stack.empty()) {
        Frame& f = stack.back();
        const Container& c = outline.containers[f.c];
        const Container* child = f.child < c.children.size() ? &outline.containers[c.children[f.child]] : nullptr;
        const size_t stop = child ? child->element - 1 : c.close;
        const bool cut = f.cut < c.cuts.size() && c.cuts[f.cut] <= stop;
        const size_t end = cut ? c.cuts[f.cut] : stop;
        if (f.cursor <= end) {
            // Between two separators: a run of members, or white space only where that is allowed.
            if (SkipSpace(d, f.cursor, end) == end) {
                if (f.left == kComma || (f.left == kOpener && end != c.close))
                    return Fail(simdjson::TAPE_ERROR, end);
            } else if (!Run(c.object, f.cursor, end, visitor)) {
                return false;
            }
        }
        if (cut) {
            ++f.cut;
            f.cursor = end + 1;
            f.left = kComma;
            continue;
        }
        if (!child) {
            const size_t close = c.close;
            stack.pop_back();
            if (stack.empty()) break;
            if (!visitor.Leave() || !after(stack.back(), close)) return false;
            continue;
        }
        ++f.child;
        // The member's key, for a member of an object.
        size_t p = SkipSpace(d, child->element, child->open);
        od::raw_json_string key;
        if (c.object) {
            if (p >= child->open || d[p] != '"') return Fail(simdjson::TAPE_ERROR, p);
            key = od::raw_json_string(reinterpret_cast<const uint8_t*>(d + p + 1));
            const size_t key_end = StringEnd(d, p + 1, child->open);
            // The parser checks the text of every piece; a key between pieces is checked here.
            for (size_t k = p + 1; k < key_end; ++k)
                if (static_cast<unsigned char>(d[k]) < 0x20) return Fail(simdjson::UNESCAPED_CHARS, k);
            if (!simdjson::validate_utf8(d + p + 1, key_end - p - 1))
                return Fail(simdjson::UTF8_ERROR,
                            p + 1 + Ndm_JsonInput::EarlyErrorOffset(simdjson::UTF8_ERROR, d + p + 1, key_end - p - 1));
            p = SkipSpace(d, key_end, child->open);
            if (p >= child->open || d[p] != ':') return Fail(simdjson::TAPE_ERROR, p);
            p = SkipSpace(d, p + 1, child->open);
        }
        if (p != child->open) return Fail(simdjson::TAPE_ERROR, p);
        end_ = child->open;
        run_size_ = 0;
        Visitor::Take take = Visitor::Take::Parts;
        if (!visitor.Enter(key, child->object, child->members, take)) return false;
        if (take == Visitor::Take::Whole) {
            if (!Whole(key, *child, visitor) || !after(f, child->close)) return false;
            continue;
        }
        stack.push_back({c.children[f.child - 1], child->open + 1});  // f is not used after this
    }
    return true;
}

bool Reader::Run(bool object, size_t begin, size_t end, Visitor& visitor, const od::raw_json_string* key) {
    const size_t n = end - begin;
    const size_t need = n + 2 + simdjson::SIMDJSON_PADDING;
    if (need > run_room_) {
        run_room_ = std::max(need, run_room_ + run_room_ / 2);
        run_.reset(new char[run_room_]);
    }
    char* run = run_.get();
    run[0] = object ? '{' : '[';
    std::memcpy(run + 1, input_.data() + begin, n);
    run[n + 1] = object ? '}' : ']';
    std::memset(run + n + 2, 0, simdjson::SIMDJSON_PADDING);
    run_base_ = begin;
    run_size_ = n + 2;
    end_ = end;
    has_doc_ = false;
    if (simdjson::error_code e = Ndm_JsonInput::Iterate(parser_, run, n + 2, need, doc_)) {
        const size_t at = Ndm_JsonInput::EarlyErrorOffset(e, run, n + 2);
        return Fail(e, std::min(begin + (at ? at - 1 : 0), end));
    }
    has_doc_ = true;
    if (object) {
        od::object members;
        if (simdjson::error_code e = doc_.get_object().get(members)) return Fail(e, Offset());
        for (auto item : members) {
            od::field field;
            if (simdjson::error_code e = std::move(item).get(field)) return Fail(e, Offset());
            if (!visitor.Member(field.key(), field.value())) return false;
        }
    } else {
        od::array array;
        if (simdjson::error_code e = doc_.get_array().get(array)) return Fail(e, Offset());
        for (auto item : array) {
            od::value value;
            if (simdjson::error_code e = std::move(item).get(value)) return Fail(e, Offset());
            if (!visitor.Member(key ? *key : od::raw_json_string(), value)) return false;
        }
    }
    if (doc_.current_location().error() != simdjson::OUT_OF_BOUNDS)
        return Fail(simdjson::TRAILING_CONTENT, Offset());
    input_.DropBefore(end);
    return true;
}

// A large member taken whole: read as the one element of a run, so that the visitor gets it as
// it gets any member (the parser treats a document's own value apart).
bool Reader::Whole(od::raw_json_string key, const Container& c, Visitor& visitor) {
    return Run(false, c.open, c.close + 1, visitor, &key);
}

LargeRead ReadLarge(Ndm_JsonInput::Input& input, Visitor& visitor, Reader*& active) {
    LargeRead result;
    const Sizes& sizes = GetSizes();
    Outline outline;
    if (input.size() < sizes.chunked_from || !MakeOutline(input, sizes.piece, outline) ||
        outline.root == UINT32_MAX || !outline.containers[outline.root].object)
        return result;
    Reader pieces(input);
    active = &pieces;
    result.read = true;
    result.ok = pieces.Read(outline, visitor);
    active = nullptr;
    result.error = pieces.error();
    result.error_offset = pieces.error_offset();
    return result;
}

}  // namespace Ndm_JsonChunks
