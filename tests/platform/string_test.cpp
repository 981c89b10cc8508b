// Tests of CString: copy-on-write sharing, the GetBuffer lock, aliasing of
// the string's own text, clamping, searching, editing and comparison.
#include <vaskel/framework/exceptions.h>
#include <vaskel/framework/string.h>

#include <gtest/gtest.h>

#include <atomic>
#include <climits>
#include <cstring>
#include <functional>
#include <iterator>
#include <memory>
#include <string>
#include <thread>
#include <tuple>
#include <vector>

using namespace vaskel;

namespace {

// The whole text of a CString, embedded NULs included.
std::string Text(const CString& s) {
    return std::string(s.GetString(), static_cast<size_t>(s.GetLength()));
}

// Checks length, characters and the terminating NUL together.
::testing::AssertionResult Holds(const CString& s, const std::string& expected) {
    if (Text(s) != expected || s.GetString()[s.GetLength()] != '\0')
        return ::testing::AssertionFailure()
               << "holds \"" << Text(s) << "\", not \"" << expected << "\"";
    return ::testing::AssertionSuccess();
}

// Each string against the text expected of it; the counts must match.
template <size_t N>
void ExpectAll(const CString (&strings)[N], const char* const (&expected)[N]) {
    for (size_t i = 0; i < N; ++i)
        EXPECT_TRUE(Holds(strings[i], expected[i])) << "case " << i;
}

TEST(CStringTest, ConstructionAssignmentAndEmbeddedNuls) {
    const unsigned char bytes[] = {'a', 0xE9, 0};
    const CString made[] = {CString(static_cast<const char*>(nullptr), 4), CString("hello", -1),
                            CString(bytes), CString('x', 4), CString('x', -3)};
    ExpectAll(made, {"", "", "a\xE9", "xxxx", ""});
    CString s("x");
    s = '\0'; // a NUL character makes the empty string, not one holding a NUL
    EXPECT_TRUE(Holds(s, ""));
    CString moved(std::move(s = "c"));
    EXPECT_TRUE(Holds(s, "")); // NOLINT(bugprone-use-after-move): moved-from is empty
    EXPECT_TRUE(Holds('b' + moved + "d" + 'e', "bcde"));
    CString nul("ab\0cd", 5);
    EXPECT_TRUE(Holds(nul.Right(3), std::string("\0cd", 3)));
    EXPECT_EQ(nul.Compare("ab"), 0); // comparisons stop at the first NUL
    EXPECT_TRUE(Holds(nul.MakeUpper(), std::string("AB\0CD", 5)));
    EXPECT_EQ(nul.Remove('\0'), 1);
    nul.Append("yz\0w", 4); // a counted append stops at a NUL inside the count
    EXPECT_TRUE(Holds(nul, "ABCDyz"));
}

TEST(CStringCopyOnWriteTest, EveryMutatorChangesOnlyItsStringEvenGivenItsOwnText) {
    const char* const base = "  Hello, World  ";
    const char* const bang = "  Hello, World  !";
    const std::tuple<const char*, std::function<void(CString&)>, const char*> cases[] = {
        {base, [](CString& s) { s.SetAt(2, 'J'); }, "  Jello, World  "},
        {base, [](CString& s) { s.MakeUpper(); }, "  HELLO, WORLD  "},
        {base, [](CString& s) { s.MakeLower(); }, "  hello, world  "},
        {base, [](CString& s) { s.MakeReverse(); }, "  dlroW ,olleH  "},
        {base, [](CString& s) { s.Replace('l', 'L'); }, "  HeLLo, WorLd  "},
        {base, [](CString& s) { s.Replace("World", "Moon"); }, "  Hello, Moon  "},
        {base, [](CString& s) { s.Remove('l'); }, "  Heo, Word  "},
        {base, [](CString& s) { s.Insert(2, '>'); }, "  >Hello, World  "},
        {base, [](CString& s) { s.Delete(2, 7); }, "  World  "},
        {base, [](CString& s) { s.Trim(); }, "Hello, World"},
        {base, [](CString& s) { s.TrimLeft(' '); }, "Hello, World  "},
        {base, [](CString& s) { s.TrimRight(" d"); }, "  Hello, Worl"},
        {base, [](CString& s) { s.Append("!?", 1); }, bang},
        {base, [](CString& s) { s += CString("!"); }, bang},
        {base, [](CString& s) { s += '!'; }, bang},
        {base, [](CString& s) { s.Format("%d-%s", 7, "x"); }, "7-x"},
        {base, [](CString& s) { s.SetString("other", 3); }, "oth"},
        {base, [](CString& s) { s.Empty(); }, ""},
        {base, [](CString& s) { s.Preallocate(200); }, base},
        {base, [](CString& s) { s.FreeExtra(); }, base},
        // The string's own text as the argument.
        {"abc", [](CString& s) { s += s; }, "abcabc"},
        {"abcdef", [](CString& s) { s.Append(s.GetString() + 1); }, "abcdefbcdef"},
        {"hello", [](CString& s) { s.Append(s.GetString() + 1, 3); }, "helloell"},
        {"abc", [](CString& s) { s.Insert(1, s.GetString()); }, "aabcbc"},
        {"hello", [](CString& s) { s.Insert(0, s.GetString() + 3); }, "lohello"},
        {"abc", [](CString& s) { s.Format("%s-%s", s.GetString(), s.GetString()); }, "abc-abc"},
        {"%s%s", [](CString& s) { s.Format(s.GetString(), "a", "b"); }, "ab"},
        {"12", [](CString& s) { s.AppendFormat("<%s>", s.GetString()); }, "12<12>"},
        {"abcdef", [](CString& s) { s.SetString(s.GetString() + 1, 2); }, "bc"},
        {"abcdef", [](CString& s) { s = s.GetString() + 5; }, "f"},
        {"a-b", [](CString& s) { s.Replace("-", s.GetString()); }, "aa-bb"},
        {"whole", [](CString& s) { s.Replace(s.GetString(), "part"); }, "part"},
        {"xxyxx", [](CString& s) { s.Trim(s.GetString() + 2); }, ""},
    };
    // Alone, with room to spare, and sharing its buffer with two copies.
    for (int setup = 0; setup < 3; ++setup) {
        for (const auto& [start, apply, expected] : cases) {
            SCOPED_TRACE(std::string(expected) + ", setup " + std::to_string(setup));
            CString s(start);
            CString copy, bystander;
            if (setup == 1)
                s.Preallocate(100);
            if (setup == 2)
                copy = bystander = s;
            apply(s);
            EXPECT_TRUE(Holds(s, expected));
            EXPECT_TRUE(Holds(copy, setup == 2 ? start : ""));
            EXPECT_EQ(copy.GetString(), bystander.GetString()) << "the others still share";
        }
    }
    // Every empty string shares one block, which must never be written.
    CString a;
    CString b(a);
    b += "x";
    a.GetBuffer()[0] = 'q'; // room of its own, even for an empty string
    a.ReleaseBuffer(1);
    EXPECT_TRUE(Holds(a, "q") && Holds(CString(), ""));
}

TEST(CStringCopyOnWriteTest, CopiesAreEditedAndDroppedOnManyThreads) {
    // Threads copy one buffer and edit their copies while this thread drops
    // the original, so the count moves from every side at once.
    std::atomic<int> failures{0};
    for (int round = 0; round < 100; ++round) {
        auto original = std::make_unique<CString>("the shared text");
        std::vector<CString> given(4, *original);
        std::atomic<bool> go{false};
        std::vector<std::thread> threads;
        for (CString& mine : given) {
            threads.emplace_back([&failures, &go, mine = std::move(mine)] {
                while (!go.load())
                    std::this_thread::yield();
                CString copy(mine);
                copy.SetAt(0, 'T');
                if (Text(copy) != "The shared text" || Text(mine) != "the shared text")
                    failures.fetch_add(1);
            });
        }
        go.store(true);
        original.reset();
        for (std::thread& th : threads)
            th.join();
    }
    EXPECT_EQ(failures.load(), 0);
}

TEST(CStringBufferTest, TheBufferIsTheStringsAloneUntilReleased) {
    CString s("hello");
    CString before(s);
    char* p = s.GetBuffer(40);
    p[0] = 'J';
    CString during(s);
    CString whole = s.Left(100);
    std::strcpy(p + 4, "!!");
    s.ReleaseBuffer();
    EXPECT_TRUE(Holds(s, "Jell!!"));
    EXPECT_TRUE(Holds(during, "Jello") && Holds(whole, "Jello") && Holds(before, "hello"));
    CString after(s); // released: shared and copied on write again
    EXPECT_EQ(after.GetString(), s.GetString());
    s.GetBufferSetLength(2);
    s.ReleaseBuffer();
    EXPECT_TRUE(Holds(s, "Je") && Holds(after, "Jell!!"));
}

TEST(CStringBufferTest, ReleaseBufferAndFreeExtra) {
    CString s("ab");
    int room = s.GetAllocLength();
    std::memset(s.GetBuffer(), 'r', static_cast<size_t>(room)); // the whole room, no NUL
    s.ReleaseBuffer();
    EXPECT_TRUE(Holds(s, std::string(static_cast<size_t>(room), 'r')));
    std::memcpy(s.GetBuffer(8), "ab\0cdefg", 8);
    s.ReleaseBuffer(5);
    EXPECT_TRUE(Holds(s, std::string("ab\0cd", 5)));
    EXPECT_THROW(s.GetBuffer(-1), CInvalidArgException);
    // Until ReleaseBuffer the room is the caller's, even while the length is 0.
    CString t;
    char* p = t.GetBuffer(100);
    t.FreeExtra();
    std::strcpy(p, "written after FreeExtra");
    t.ReleaseBuffer();
    t.FreeExtra(); // released: now the room may shrink
    EXPECT_EQ(t.GetAllocLength(), t.GetLength());
    EXPECT_TRUE(Holds(t, "written after FreeExtra"));
}

TEST(CStringSubstringTest, PositionsAndCountsAreClamped) {
    const CString s("abcdef");
    const CString e;
    const CString parts[] = {s.Left(-1),       s.Left(INT_MIN), s.Left(INT_MAX),   s.Mid(-2),
                             s.Mid(5),         s.Mid(INT_MAX),  s.Mid(-2, 3),      s.Mid(2, -1),
                             s.Mid(6, 1),      s.Right(-1),     s.Mid(2, INT_MAX), s.Right(100),
                             s.Right(INT_MIN), e.Mid(0, 3)};
    ExpectAll(parts,
              {"", "", "abcdef", "abcdef", "f", "", "abc", "", "", "", "cdef", "abcdef", "", ""});
    const CString more[] = {s.Mid(INT_MIN, INT_MAX), s.SpanIncluding("cba"), s.SpanExcluding("ed"),
                            s.SpanExcluding("")};
    ExpectAll(more, {"abcdef", "abc", "abc", "abcdef"});
    for (int bad : {-1, 6, INT_MAX}) {
        EXPECT_THROW(s.GetAt(bad), CInvalidArgException) << bad;
        EXPECT_THROW(CString(s).SetAt(bad, 'x'), CInvalidArgException) << bad;
    }
}

TEST(CStringFindTest, FindersReturnTheIndexOrMinusOne) {
    const CString s("abcabc");
    const CString nul("ab\0cd", 5);
    const int found[] = {s.Find('c', 3),       s.Find('c', 6),     s.Find('c', -1),
                         s.Find("bc", 2),      s.Find("abcabcd"),  s.Find("c", 7),
                         s.Find("a", -1),      s.Find("", 3),      s.ReverseFind('a'),
                         s.ReverseFind('z'),   s.FindOneOf("zc"),  s.FindOneOf(""),
                         nul.FindOneOf("xyz"), nul.FindOneOf("b"), nul.Find('c')};
    // An embedded NUL ends the scan of FindOneOf and is not one of the set.
    EXPECT_EQ(std::vector<int>(std::begin(found), std::end(found)),
              (std::vector<int>{5, -1, -1, 4, -1, -1, -1, 3, 3, -1, 2, -1, -1, 1, 3}));
    EXPECT_EQ(s.Find(static_cast<const char*>(nullptr)), -1);
    EXPECT_EQ(s.FindOneOf(nullptr), -1);
    const CString text("  a, b,,c  ");
    std::string tokens;
    for (int start = 0, calls = 0; start != -1 && calls < 10; ++calls)
        tokens += Text(text.Tokenize(" ,", start)) + "|";
    EXPECT_EQ(tokens, "a|b|c||") << "runs of delimiters are skipped; the last call gives \"\"";
    int start = 2;
    EXPECT_TRUE(Holds(text.Tokenize(nullptr, start), "a, b,,c  ") && start == 11);
}

TEST(CStringEditTest, EditsReturnTheirCountOrTheNewLength) {
    CString s("aXbXc");
    EXPECT_EQ(s.Replace("X", "--"), 2);
    EXPECT_EQ(s.Replace("--", ""), 2); // an empty or missing replacement removes
    EXPECT_EQ(s.Replace("b", nullptr), 1);
    EXPECT_TRUE(Holds(s, "ac"));
    CString t("aaaaa");
    EXPECT_EQ(t.Replace("aa", "ab"), 2); // no overlaps, and the output is not searched
    EXPECT_TRUE(Holds(t, "ababa"));
    for (const char* nothing : {"", static_cast<const char*>(nullptr), "z", "ababab"})
        EXPECT_EQ(t.Replace(nothing, "x"), 0);
    EXPECT_EQ(t.Remove('a'), 3);
    EXPECT_EQ(t.Insert(100, "!"), 3);
    EXPECT_EQ(t.Insert(-5, '^'), 4);
    EXPECT_EQ(t.Delete(1, -4), 4);
    EXPECT_EQ(t.Delete(-2, 2), 2);
    EXPECT_TRUE(Holds(t, "b!"));
    CString u(" \t\r\n\v\f xy \t\r\n\v\f ");
    EXPECT_TRUE(Holds(u.Trim().Trim(static_cast<const char*>(nullptr)).Trim('\0'), "xy"));
    CString mixed("MiXeD 1_[]{} \xC9\xE9");
    EXPECT_TRUE(Holds(mixed.MakeUpper(), "MIXED 1_[]{} \xC9\xE9")); // ASCII letters only
    std::string big(5000, 'q'); // longer than any small fixed buffer
    u.Format("%d-%s-%.2f-%05x-%%<%s>", 42, "str", 1.5, 255, big.c_str());
    EXPECT_TRUE(Holds(u, "42-str-1.50-000ff-%<" + big + ">"));
}

TEST(CStringCompareTest, ComparisonsAgreeWithStrcmpAndNoCaseFoldsToLowerCase) {
    const char* texts[] = {"", "a", "b", "ab", "B", "\xE9"}; // bytes compare unsigned
    for (const char* x : texts) {
        for (const char* y : texts) {
            int r = std::strcmp(x, y);
            r = r < 0 ? -1 : (r > 0 ? 1 : 0);
            CString a(x);
            CString b(y);
            const bool results[][3] = {{a == b, a == y, x == b}, {a != b, a != y, x != b},
                                       {a < b, a < y, x < b},    {a > b, a > y, x > b},
                                       {a <= b, a <= y, x <= b}, {a >= b, a >= y, x >= b}};
            const bool expected[] = {r == 0, r != 0, (r < 0), (r > 0), r <= 0, r >= 0};
            EXPECT_EQ(a.Compare(y), r) << x << " vs " << y;
            for (size_t op = 0; op < 6; ++op)
                for (bool result : results[op])
                    EXPECT_EQ(result, expected[op]) << x << " vs " << y << ", operator " << op;
        }
    }
    EXPECT_EQ(CString("aBc").CompareNoCase("AbC"), 0);
    EXPECT_EQ(CString("abc").CompareNoCase("AB"), 1);
    // The characters between 'Z' and 'a' sort before the letters only when
    // letters are folded to lower case.
    for (const char* mid : {"[", "\\", "]", "^", "_", "`"}) {
        EXPECT_EQ(CString(mid).CompareNoCase("A"), -1) << mid;
        EXPECT_EQ(CString("Z").CompareNoCase(mid), 1) << mid;
    }
    EXPECT_EQ(CString("\xE9").CompareNoCase("\xC9"), 1) << "only ASCII letters are folded";
}

} // namespace
