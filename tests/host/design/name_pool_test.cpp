// Interning: one stored copy for each distinct text, whichever way it was found (short texts
// have a table of their own in front of the hash set, which must never confuse two texts; the
// set is rebuilt from the stored texts as it grows), and each text's id.
#include <gtest/gtest.h>

#include <set>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "host/design/name_pool.h"

namespace {

TEST(NamePool, EqualTextsShareOneCopyAndDifferentTextsNever) {
    Ndm_NamePool pool;
    using namespace std::string_literals;
    // Lengths around the short texts' limits, texts that differ only in a NUL, a trailing NUL
    // or their last byte, and the empty text.
    const std::vector<std::string> texts = {
        "", "a", "a\0"s, "\0a"s, "a\0b"s, "a\0c"s, "I0", "I1", "FROM_UCF", "FROM_UCX", "_TempPropList",
        "1234567890123456", "1234567890123457", "12345678901234567", "12345678901234568", "12345678",
        "123456789", std::string(1000, 'x'), std::string(254, 'y'), std::string(255, 'y'), std::string(256, 'y'),
        std::string(300, '\0'), std::string(1 << 19, 'z'),  // lengths a byte cannot hold; a chunk of its own
    };
    std::set<const char*> stored;
    for (int round = 0; round < 3; ++round) {
        for (const std::string& text : texts) {
            const std::string copy = text;  // another address with the same bytes
            const char* p = pool.Intern(copy);
            ASSERT_EQ(std::string_view(p, text.size()), text);
            EXPECT_EQ(p[text.size()], '\0');
            EXPECT_EQ(pool.Intern(text), p);
            EXPECT_EQ(pool.Find(text), p);
            // A text's 32-bit id gives its bytes back up to the first NUL, and stays the same.
            const uint32_t id = pool.IdOf(p);
            EXPECT_EQ(id, pool.IdOf(pool.Intern(copy)));
            EXPECT_STREQ(Ndm_NamePool::Text(id), p);
            EXPECT_EQ(id == 0, *p == '\0');
            stored.insert(p);
        }
        // Thousands of short texts between the rounds evict one another from the short table.
        for (int i = 0; i < 5000; ++i) pool.Intern("n" + std::to_string(i * 7919 + round));
    }
    EXPECT_EQ(stored.size(), texts.size());
    EXPECT_EQ(pool.Find("never interned"), nullptr);
    EXPECT_EQ(pool.Find("n12"), nullptr);
    const std::string elsewhere = "not stored by the pool";
    EXPECT_THROW(pool.IdOf(elsewhere.c_str()), std::invalid_argument);
}

}  // namespace
