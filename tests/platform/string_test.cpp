// Tests of CString: copy-on-write sharing, the GetBuffer lock, aliasing of
// the string's own text, clamping of positions, searching, comparison and
// conversion.
#include <vaskel/framework/exceptions.h>
#include <vaskel/framework/string.h>

#include <gtest/gtest.h>

#include <atomic>
#include <climits>
#include <cstring>
#include <functional>
#include <memory>
#include <random>
#include <string>
#include <thread>
#include <vector>

using vaskel::CException;
using vaskel::CInvalidArgException;
using vaskel::CString;

namespace {

// The whole text of a CString, embedded NULs included.
std::string Text(const CString& s) {
    return std::string(s.GetString(), static_cast<size_t>(s.GetLength()));
}

// Checks length, characters and the terminating NUL together.
::testing::AssertionResult Holds(const CString& s, const std::string& expected) {
    std::string actual = Text(s);
    if (actual != expected)
        return ::testing::AssertionFailure()
               << "text is \"" << actual << "\" (length " << s.GetLength() << "), expected \""
               << expected << "\" (length " << expected.size() << ")";
    if (s.GetString()[s.GetLength()] != '\0')
        return ::testing::AssertionFailure() << "no NUL after the text \"" << actual << "\"";
    return ::testing::AssertionSuccess();
}

int Sign(int value) {
    return value < 0 ? -1 : (value > 0 ? 1 : 0);
}

// ---------------------------------------------------------------------------
// Construction and assignment

TEST(CStringTest, ConstructorsGiveTheExpectedText) {
    EXPECT_TRUE(Holds(CString(), ""));
    EXPECT_TRUE(CString().IsEmpty());
    EXPECT_TRUE(Holds(CString("hello"), "hello"));
    EXPECT_TRUE(Holds(CString(static_cast<const char*>(nullptr)), ""));
    EXPECT_TRUE(Holds(CString("hello", 3), "hel"));
    EXPECT_TRUE(Holds(CString("hello", 0), ""));
    EXPECT_TRUE(Holds(CString("hello", -1), ""));
    EXPECT_TRUE(Holds(CString(static_cast<const char*>(nullptr), 4), ""));
    const unsigned char bytes[] = {'a', 0xE9, 'b', 0};
    EXPECT_TRUE(Holds(CString(bytes), "a\xE9"
                                      "b"));
    EXPECT_TRUE(Holds(CString('x'), "x"));
    EXPECT_TRUE(Holds(CString('x', 4), "xxxx"));
    EXPECT_TRUE(Holds(CString('x', 0), ""));
    EXPECT_TRUE(Holds(CString('x', -3), ""));
}

TEST(CStringTest, EmbeddedNulsAreKeptByTheCountedConstructor) {
    const char raw[] = "ab\0cd";
    CString s(raw, 5);
    ASSERT_EQ(s.GetLength(), 5);
    EXPECT_EQ(s[2], '\0');
    EXPECT_EQ(s[3], 'c');
    EXPECT_EQ(std::memcmp(s.GetString(), raw, 6), 0); // NUL-terminated after the fifth
    CString copy(s);
    EXPECT_TRUE(Holds(copy, std::string(raw, 5)));
    EXPECT_TRUE(Holds(s.Mid(3), "cd"));
    EXPECT_TRUE(Holds(s.Right(3), std::string("\0cd", 3)));
    EXPECT_TRUE(Holds(s.Left(4), std::string("ab\0c", 4)));
    // Comparisons stop at the first NUL.
    EXPECT_EQ(s.Compare("ab"), 0);
    EXPECT_TRUE(s == CString("ab\0zz", 5));
    EXPECT_EQ(s.CompareNoCase("AB"), 0);
    // Counted appends stop at a NUL inside the count, as the framework does.
    CString t("x");
    t.Append("yz\0w", 4);
    EXPECT_TRUE(Holds(t, "xyz"));
    // Characters after the embedded NUL are still edited.
    CString u(raw, 5);
    u.MakeUpper();
    EXPECT_TRUE(Holds(u, std::string("AB\0CD", 5)));
    EXPECT_EQ(u.Remove('\0'), 1);
    EXPECT_TRUE(Holds(u, "ABCD"));
}

TEST(CStringTest, AssignmentReplacesTheText) {
    CString s("first");
    s = "second";
    EXPECT_TRUE(Holds(s, "second"));
    s = 'c';
    EXPECT_TRUE(Holds(s, "c"));
    const unsigned char bytes[] = {'u', 'c', 0};
    s = bytes;
    EXPECT_TRUE(Holds(s, "uc"));
    s = static_cast<const char*>(nullptr);
    EXPECT_TRUE(Holds(s, ""));
    CString other("other");
    s = other;
    EXPECT_TRUE(Holds(s, "other"));
    CString& same = s; // self-assignment, without the compiler's warning
    s = same;
    EXPECT_TRUE(Holds(s, "other"));
    CString moved(std::move(s));
    EXPECT_TRUE(Holds(moved, "other"));
    EXPECT_TRUE(Holds(s, "")); // NOLINT(bugprone-use-after-move): moved-from is empty
    s = std::move(moved);
    EXPECT_TRUE(Holds(s, "other"));
    s = std::move(same);
    EXPECT_TRUE(Holds(s, "other"));
    s.Empty();
    EXPECT_TRUE(s.IsEmpty());
    EXPECT_TRUE(Holds(s, ""));
}

TEST(CStringTest, ConcatenationOperatorsLeaveTheirOperandsAlone) {
    CString a("ab");
    CString b("cd");
    EXPECT_TRUE(Holds(a + b, "abcd"));
    EXPECT_TRUE(Holds(a + "xy", "abxy"));
    EXPECT_TRUE(Holds("xy" + a, "xyab"));
    EXPECT_TRUE(Holds(a + 'z', "abz"));
    EXPECT_TRUE(Holds('z' + a, "zab"));
    EXPECT_TRUE(Holds(CString() + CString(), ""));
    EXPECT_TRUE(Holds(CString() + b, "cd"));
    EXPECT_TRUE(Holds(a + CString(), "ab"));
    EXPECT_TRUE(Holds(a, "ab"));
    EXPECT_TRUE(Holds(b, "cd"));
    CString s;
    s += "x";
    s += CString("y");
    s += 'z';
    s += static_cast<const char*>(nullptr);
    EXPECT_TRUE(Holds(s, "xyz"));
}

// ---------------------------------------------------------------------------
// Copy on write

TEST(CStringCopyOnWriteTest, CopiesShareOneBuffer) {
    CString original("shared text");
    CString copy(original);
    CString assigned;
    assigned = original;
    EXPECT_EQ(copy.GetString(), original.GetString());
    EXPECT_EQ(assigned.GetString(), original.GetString());
    CString third(copy);
    EXPECT_EQ(third.GetString(), original.GetString());
}

struct Mutation {
    const char* name;
    std::function<void(CString&)> apply;
    const char* expected; // the text of "  Hello, World  " after the mutation
};

const char* const base = "  Hello, World  ";

std::vector<Mutation> Mutations() {
    return {
        {"SetAt", [](CString& s) { s.SetAt(2, 'J'); }, "  Jello, World  "},
        {"MakeUpper", [](CString& s) { s.MakeUpper(); }, "  HELLO, WORLD  "},
        {"MakeLower", [](CString& s) { s.MakeLower(); }, "  hello, world  "},
        {"MakeReverse", [](CString& s) { s.MakeReverse(); }, "  dlroW ,olleH  "},
        {"ReplaceChar", [](CString& s) { s.Replace('l', 'L'); }, "  HeLLo, WorLd  "},
        {"ReplaceText", [](CString& s) { s.Replace("World", "Moon"); }, "  Hello, Moon  "},
        {"Remove", [](CString& s) { s.Remove('l'); }, "  Heo, Word  "},
        {"InsertChar", [](CString& s) { s.Insert(2, '>'); }, "  >Hello, World  "},
        {"InsertText", [](CString& s) { s.Insert(2, "Oh, "); }, "  Oh, Hello, World  "},
        {"Delete", [](CString& s) { s.Delete(2, 7); }, "  World  "},
        {"Trim", [](CString& s) { s.Trim(); }, "Hello, World"},
        {"TrimLeft", [](CString& s) { s.TrimLeft(); }, "Hello, World  "},
        {"TrimRight", [](CString& s) { s.TrimRight(); }, "  Hello, World"},
        {"TrimRightChars", [](CString& s) { s.TrimRight(" d"); }, "  Hello, Worl"},
        {"TrimLeftChar", [](CString& s) { s.TrimLeft(' '); }, "Hello, World  "},
        {"Append", [](CString& s) { s.Append("!"); }, "  Hello, World  !"},
        {"AppendCounted", [](CString& s) { s.Append("!?", 1); }, "  Hello, World  !"},
        {"AppendString", [](CString& s) { s.Append(CString("!")); }, "  Hello, World  !"},
        {"AppendChar", [](CString& s) { s.AppendChar('!'); }, "  Hello, World  !"},
        {"PlusEqualsText", [](CString& s) { s += "!"; }, "  Hello, World  !"},
        {"PlusEqualsString", [](CString& s) { s += CString("!"); }, "  Hello, World  !"},
        {"PlusEqualsChar", [](CString& s) { s += '!'; }, "  Hello, World  !"},
        {"Format", [](CString& s) { s.Format("%d-%s", 7, "x"); }, "7-x"},
        {"AppendFormat", [](CString& s) { s.AppendFormat("%d", 42); }, "  Hello, World  42"},
        {"GetBuffer",
         [](CString& s) {
             char* p = s.GetBuffer();
             p[2] = 'Y';
             s.ReleaseBuffer();
         },
         "  Yello, World  "},
        {"GetBufferLonger",
         [](CString& s) {
             char* p = s.GetBuffer(40);
             std::strcpy(p + 16, "and more");
             s.ReleaseBuffer();
         },
         "  Hello, World  and more"},
        {"GetBufferSetLength",
         [](CString& s) {
             s.GetBufferSetLength(7);
             s.ReleaseBuffer();
         },
         "  Hello"},
        {"ReleaseBufferShorter",
         [](CString& s) {
             s.GetBuffer();
             s.ReleaseBuffer(4);
         },
         "  He"},
        {"SetString", [](CString& s) { s.SetString("other"); }, "other"},
        {"AssignText", [](CString& s) { s = "other"; }, "other"},
        {"Empty", [](CString& s) { s.Empty(); }, ""},
        {"Preallocate", [](CString& s) { s.Preallocate(200); }, base},
        {"FreeExtra", [](CString& s) { s.FreeExtra(); }, base},
    };
}

TEST(CStringCopyOnWriteTest, WritingThroughACopyLeavesTheOriginal) {
    for (const Mutation& m : Mutations()) {
        SCOPED_TRACE(m.name);
        CString original(base);
        CString copy(original);
        CString bystander(original);
        ASSERT_EQ(copy.GetString(), original.GetString());
        m.apply(copy);
        EXPECT_TRUE(Holds(copy, m.expected));
        EXPECT_TRUE(Holds(original, base));
        EXPECT_TRUE(Holds(bystander, base));
        // The untouched copies still share with each other.
        EXPECT_EQ(bystander.GetString(), original.GetString());
    }
}

TEST(CStringCopyOnWriteTest, WritingThroughTheOriginalLeavesTheCopy) {
    for (const Mutation& m : Mutations()) {
        SCOPED_TRACE(m.name);
        CString original(base);
        CString copy;
        copy = original;
        m.apply(original);
        EXPECT_TRUE(Holds(original, m.expected));
        EXPECT_TRUE(Holds(copy, base));
    }
}

TEST(CStringCopyOnWriteTest, CopiesOfEmptyStringsAreIndependent) {
    // Every mutation starting from an empty string must leave other empty
    // strings empty, whatever they share.
    CString a;
    CString b(a);
    b += "x";
    EXPECT_TRUE(Holds(a, ""));
    char* p = a.GetBuffer();
    p[0] = 'q';
    p[1] = '\0';
    a.ReleaseBuffer();
    EXPECT_TRUE(Holds(a, "q"));
    CString c;
    c.GetBufferSetLength(0);
    c.ReleaseBuffer();
    c.MakeUpper().MakeReverse().Trim();
    c.Replace('a', 'b');
    c.Replace("a", "b");
    c.Remove('a');
    c.Delete(0, 3);
    c.FreeExtra();
    EXPECT_TRUE(Holds(c, ""));
    EXPECT_TRUE(Holds(CString(), ""));
    EXPECT_EQ(CString().GetLength(), 0);
}

TEST(CStringCopyOnWriteTest, SubstringsThatAreTheWholeStringAreStillCopiedOnWrite) {
    CString s("abcdef");
    CString whole[] = {s.Left(6),      s.Left(100), s.Mid(0),
                       s.Mid(-1, 100), s.Right(6),  s.Right(INT_MAX)};
    for (CString& w : whole) {
        w.SetAt(0, 'X');
        EXPECT_TRUE(Holds(w, "Xbcdef"));
    }
    EXPECT_TRUE(Holds(s, "abcdef"));
}

TEST(CStringCopyOnWriteTest, TheLastOwnerWritesInPlace) {
    // Once the other copies are gone the survivor owns its buffer: writing
    // does not copy it. A reference count that never comes back down would
    // make every write copy.
    CString s("some text to own");
    {
        CString a(s);
        CString b;
        b = s;
        CString c(std::move(a));
    }
    const char* before = s.GetString();
    s.SetAt(0, 'S');
    s.MakeUpper();
    EXPECT_EQ(s.GetString(), before);
    EXPECT_TRUE(Holds(s, "SOME TEXT TO OWN"));
}

TEST(CStringCopyOnWriteTest, MatchesAStdStringModelOverRandomEdits) {
    // A pool of strings, copied from one another at random and edited at
    // random; each must always hold the text of its std::string twin.
    std::mt19937 random(12345);
    const int poolSize = 8;
    std::vector<CString> pool(poolSize, CString("seed text"));
    std::vector<std::string> model(poolSize, "seed text");
    auto pick = [&](int n) { return static_cast<int>(random() % static_cast<unsigned>(n)); };
    for (int step = 0; step < 3000; ++step) {
        int i = pick(poolSize);
        CString& s = pool[static_cast<size_t>(i)];
        std::string& m = model[static_cast<size_t>(i)];
        int length = static_cast<int>(m.size());
        char ch = static_cast<char>('a' + pick(6));
        switch (pick(11)) {
        case 0: {
            int j = pick(poolSize);
            s = pool[static_cast<size_t>(j)];
            m = model[static_cast<size_t>(j)];
            break;
        }
        case 1:
            s += ch;
            m += ch;
            break;
        case 2: {
            int j = pick(poolSize);
            s += pool[static_cast<size_t>(j)];
            m += model[static_cast<size_t>(j)];
            break;
        }
        case 3: {
            int at = pick(length + 1);
            s.Insert(at, "XY");
            m.insert(static_cast<size_t>(at), "XY");
            break;
        }
        case 4:
            if (length > 0) {
                int at = pick(length);
                int count = pick(4) + 1;
                s.Delete(at, count);
                m.erase(static_cast<size_t>(at), static_cast<size_t>(count));
            }
            break;
        case 5:
            if (length > 0) {
                int at = pick(length);
                s.SetAt(at, ch);
                m[static_cast<size_t>(at)] = ch;
            }
            break;
        case 6: {
            int count = s.Replace(ch, 'Z');
            int expected = 0;
            for (char& c : m)
                if (c == ch) {
                    c = 'Z';
                    ++expected;
                }
            EXPECT_EQ(count, expected);
            break;
        }
        case 7:
            s.MakeUpper();
            for (char& c : m)
                if (c >= 'a' && c <= 'z')
                    c = static_cast<char>(c - 'a' + 'A');
            break;
        case 8:
            if (length > 64) { // keep the strings short
                s = s.Mid(length / 2);
                m = m.substr(static_cast<size_t>(length / 2));
            }
            break;
        case 9: {
            char* p = s.GetBuffer(length + 1);
            p[length] = ch;
            p[length + 1] = '\0';
            s.ReleaseBuffer();
            m += ch;
            break;
        }
        default: {
            // A copy taken here and edited must not change anything else.
            CString t(s);
            t += "tmp";
            EXPECT_TRUE(Holds(t, m + "tmp"));
            break;
        }
        }
        for (int k = 0; k < poolSize; ++k)
            ASSERT_TRUE(Holds(pool[static_cast<size_t>(k)], model[static_cast<size_t>(k)]))
                << "string " << k << " after step " << step;
    }
}

// ---------------------------------------------------------------------------
// Copies edited on many threads at once

TEST(CStringThreadTest, ThreadsCopyOneStringAndEditTheirCopies) {
    const CString shared("the shared text that every thread copies");
    const std::string expected = Text(shared);
    const int threadCount = 8;
    const int rounds = 300;
    std::atomic<int> ready{0};
    std::atomic<int> failures{0};
    std::vector<std::thread> threads;
    for (int t = 0; t < threadCount; ++t) {
        threads.emplace_back([&, t] {
            ready.fetch_add(1);
            while (ready.load() < threadCount)
                std::this_thread::yield();
            char mark = static_cast<char>('A' + t);
            for (int r = 0; r < rounds; ++r) {
                CString mine(shared);
                if (mine.GetString() != shared.GetString())
                    failures.fetch_add(1);
                CString second(mine); // a third owner of the same buffer
                mine.SetAt(0, mark);
                mine += mark;
                mine.Replace("shared", "own");
                second.MakeUpper();
                std::string want =
                    std::string(1, mark) + "he own text that every thread copies" + mark;
                if (Text(mine) != want ||
                    Text(second) != "THE SHARED TEXT THAT EVERY THREAD COPIES" ||
                    Text(shared) != expected)
                    failures.fetch_add(1);
            }
        });
    }
    for (std::thread& th : threads)
        th.join();
    EXPECT_EQ(failures.load(), 0);
    EXPECT_TRUE(Holds(shared, expected));
    // Every copy is gone: a fresh copy shares, and writing to it copies.
    CString last(shared);
    EXPECT_EQ(last.GetString(), shared.GetString());
    last.SetAt(0, 'T');
    EXPECT_TRUE(Holds(shared, expected));
}

TEST(CStringThreadTest, CopiesReleasedOnOtherThreadsWhileTheOriginalDies) {
    // Each thread gets a copy made here; the threads edit and drop them while
    // this thread drops the original, so the count falls from every side.
    const int threadCount = 8;
    const int rounds = 100;
    std::atomic<int> failures{0};
    for (int r = 0; r < rounds; ++r) {
        auto original = std::make_unique<CString>("a string whose last owner frees it");
        std::vector<CString> copies(threadCount, *original);
        std::atomic<bool> go{false};
        std::vector<std::thread> threads;
        for (int t = 0; t < threadCount; ++t) {
            threads.emplace_back([&, t] {
                CString mine(std::move(copies[static_cast<size_t>(t)]));
                while (!go.load())
                    std::this_thread::yield();
                if (t % 2 == 0) {
                    mine.MakeUpper();
                    if (Text(mine) != "A STRING WHOSE LAST OWNER FREES IT")
                        failures.fetch_add(1);
                }
            });
        }
        go.store(true);
        original.reset();
        for (std::thread& th : threads)
            th.join();
    }
    EXPECT_EQ(failures.load(), 0);
}

// ---------------------------------------------------------------------------
// GetBuffer and ReleaseBuffer

TEST(CStringBufferTest, ACopyTakenWhileLockedDoesNotSeeLaterWrites) {
    CString s("hello");
    CString before(s);
    char* p = s.GetBuffer();
    p[0] = 'J';
    CString during(s);
    CString assigned;
    assigned = s;
    EXPECT_NE(during.GetString(), s.GetString());
    EXPECT_NE(assigned.GetString(), s.GetString());
    EXPECT_TRUE(Holds(during, "Jello"));
    p[1] = 'E';
    p[4] = '!';
    s.ReleaseBuffer();
    EXPECT_TRUE(Holds(s, "JEll!"));
    EXPECT_TRUE(Holds(during, "Jello"));
    EXPECT_TRUE(Holds(assigned, "Jello"));
    EXPECT_TRUE(Holds(before, "hello"));
    // Released: copies share again and are copied on write again.
    CString after(s);
    EXPECT_EQ(after.GetString(), s.GetString());
    after.SetAt(0, 'x');
    EXPECT_TRUE(Holds(s, "JEll!"));
}

TEST(CStringBufferTest, SubstringsOfALockedStringGetTheirOwnCharacters) {
    CString s("locked");
    char* p = s.GetBuffer();
    CString whole = s.Left(100);
    CString mid = s.Mid(0);
    p[0] = 'L';
    s.ReleaseBuffer();
    EXPECT_TRUE(Holds(whole, "locked"));
    EXPECT_TRUE(Holds(mid, "locked"));
    EXPECT_TRUE(Holds(s, "Locked"));
}

TEST(CStringBufferTest, ReleaseBufferMeasuresToTheFirstNul) {
    CString s("hello world");
    char* p = s.GetBuffer();
    p[5] = '\0';
    s.ReleaseBuffer(); // -1
    EXPECT_TRUE(Holds(s, "hello"));

    CString t("ab");
    p = t.GetBuffer(64);
    EXPECT_GE(t.GetAllocLength(), 64);
    EXPECT_EQ(std::string(p), "ab"); // the old text is kept
    std::strcpy(p, "a much longer text written in place");
    t.ReleaseBuffer(-1);
    EXPECT_TRUE(Holds(t, "a much longer text written in place"));

    // Filling the whole room without a NUL: the measure stops at the room's end.
    CString u("xyz");
    p = u.GetBuffer(10);
    int room = u.GetAllocLength();
    std::memset(p, 'r', static_cast<size_t>(room));
    u.ReleaseBuffer();
    EXPECT_TRUE(Holds(u, std::string(static_cast<size_t>(room), 'r')));
}

TEST(CStringBufferTest, ReleaseBufferWithALengthKeepsThatManyCharacters) {
    CString s;
    char* p = s.GetBuffer(8);
    std::memcpy(p, "ab\0cdefg", 8);
    s.ReleaseBuffer(5);
    EXPECT_TRUE(Holds(s, std::string("ab\0cd", 5)));
    s.GetBuffer();
    s.ReleaseBufferSetLength(1);
    EXPECT_TRUE(Holds(s, "a"));
    s.GetBuffer();
    s.ReleaseBuffer(0);
    EXPECT_TRUE(Holds(s, ""));
    EXPECT_TRUE(s.IsEmpty());
}

TEST(CStringBufferTest, GetBufferSetLengthSetsTheLength) {
    CString s("abcdef");
    char* p = s.GetBufferSetLength(3);
    EXPECT_EQ(s.GetLength(), 3);
    EXPECT_EQ(p[3], '\0');
    s.ReleaseBuffer();
    EXPECT_TRUE(Holds(s, "abc"));
    p = s.GetBufferSetLength(5);
    p[3] = 'x';
    p[4] = 'y';
    s.ReleaseBuffer(5);
    EXPECT_TRUE(Holds(s, "abcxy"));
}

TEST(CStringBufferTest, PreallocateAndFreeExtraKeepTheText) {
    CString s("abc");
    s.Preallocate(100);
    EXPECT_GE(s.GetAllocLength(), 100);
    EXPECT_TRUE(Holds(s, "abc"));
    s += "def";
    s.FreeExtra();
    EXPECT_EQ(s.GetAllocLength(), 6);
    EXPECT_TRUE(Holds(s, "abcdef"));
    // A shared buffer keeps its room: the other copy may be using it.
    CString copy(s);
    copy.FreeExtra();
    EXPECT_TRUE(Holds(copy, "abcdef"));
    EXPECT_TRUE(Holds(s, "abcdef"));
}

TEST(CStringBufferTest, FreeExtraLeavesAHandedOutBufferAlone) {
    // Until ReleaseBuffer the characters are the caller's to write, even
    // while the string's length is still 0.
    CString s;
    char* p = s.GetBuffer(100);
    s.FreeExtra();
    std::strcpy(p, "written after FreeExtra");
    s.ReleaseBuffer();
    EXPECT_TRUE(Holds(s, "written after FreeExtra"));
    CString t("abc");
    p = t.GetBuffer(50);
    t.FreeExtra();
    std::strcpy(p, "longer than the text before");
    t.ReleaseBuffer();
    EXPECT_TRUE(Holds(t, "longer than the text before"));
    t.FreeExtra(); // released: now it may shrink
    EXPECT_EQ(t.GetAllocLength(), t.GetLength());
}

TEST(CStringBufferTest, NegativeLengthsAreRejected) {
    CString s("abc");
    EXPECT_THROW(s.GetBuffer(-1), CInvalidArgException);
    EXPECT_THROW(s.GetBufferSetLength(-1), CInvalidArgException);
    EXPECT_THROW(s.Preallocate(-1), CInvalidArgException);
    EXPECT_TRUE(Holds(s, "abc"));
    s.GetBuffer();
    EXPECT_THROW(s.ReleaseBufferSetLength(-1), CInvalidArgException);
    s.ReleaseBuffer();
    EXPECT_TRUE(Holds(s, "abc"));
}

// ---------------------------------------------------------------------------
// The string's own text as an argument

TEST(CStringAliasingTest, AppendingItself) {
    CString s("abc");
    s += s;
    EXPECT_TRUE(Holds(s, "abcabc"));
    s.Append(s);
    EXPECT_TRUE(Holds(s, "abcabcabcabc"));
    // Doubling repeatedly moves the buffer each time.
    CString d("xy");
    std::string m = "xy";
    for (int i = 0; i < 12; ++i) {
        d += d;
        m += m;
    }
    EXPECT_TRUE(Holds(d, m));
    // Shared with another copy while appending itself.
    CString e("12");
    CString other(e);
    e += e;
    EXPECT_TRUE(Holds(e, "1212"));
    EXPECT_TRUE(Holds(other, "12"));
}

TEST(CStringAliasingTest, AppendingATailOfItself) {
    CString s("abcdef");
    std::string m = "abcdef";
    for (int i = 0; i < 10; ++i) { // grows well past the first room
        s.Append(s.GetString() + 1);
        m += m.substr(1);
        ASSERT_TRUE(Holds(s, m)) << "round " << i;
    }
    CString t("hello");
    t.Append(t.GetString() + 1, 3);
    EXPECT_TRUE(Holds(t, "helloell"));
    CString u("abc");
    CString sharer(u);
    u.Append(sharer.GetString() + 1); // the text lies in a buffer u shares
    EXPECT_TRUE(Holds(u, "abcbc"));
    EXPECT_TRUE(Holds(sharer, "abc"));
    // With room to spare: the append happens in place.
    CString v("abc");
    v.Preallocate(100);
    v.Append(v.GetString());
    EXPECT_TRUE(Holds(v, "abcabc"));
    v.AppendFormat("%s", v.GetString());
    EXPECT_TRUE(Holds(v, "abcabcabcabc"));
}

TEST(CStringAliasingTest, InsertingItsOwnText) {
    CString s("abc");
    s.Insert(1, s.GetString());
    EXPECT_TRUE(Holds(s, "aabcbc"));
    CString t("hello");
    t.Insert(0, t.GetString() + 3);
    EXPECT_TRUE(Holds(t, "lohello"));
    CString u("end");
    u.Insert(u.GetLength(), u.GetString());
    EXPECT_TRUE(Holds(u, "endend"));
}

TEST(CStringAliasingTest, FormattingWithItselfAsAnArgument) {
    CString s("abc");
    s.Format("%s-%s", s.GetString(), s.GetString());
    EXPECT_TRUE(Holds(s, "abc-abc"));
    s.Format("[%s]", s.GetString() + 4);
    EXPECT_TRUE(Holds(s, "[abc]"));
    CString fmt("%s%s");
    fmt.Format(fmt.GetString(), "a", "b"); // the format itself is the string
    EXPECT_TRUE(Holds(fmt, "ab"));
    CString t("12");
    t.AppendFormat("<%s>", t.GetString());
    EXPECT_TRUE(Holds(t, "12<12>"));
}

TEST(CStringAliasingTest, SettingFromInsideItsOwnBuffer) {
    CString s("abcdef");
    s.SetString(s.GetString() + 2);
    EXPECT_TRUE(Holds(s, "cdef"));
    s.SetString(s.GetString() + 1, 2);
    EXPECT_TRUE(Holds(s, "de"));
    s = s.GetString() + 1;
    EXPECT_TRUE(Holds(s, "e"));
    s.SetString(s.GetString());
    EXPECT_TRUE(Holds(s, "e"));
    CString t("xyz");
    CString sharer(t);
    t.SetString(t.GetString() + 1);
    EXPECT_TRUE(Holds(t, "yz"));
    EXPECT_TRUE(Holds(sharer, "xyz"));
}

TEST(CStringAliasingTest, ReplacingWithItsOwnText) {
    CString s("a-b");
    EXPECT_EQ(s.Replace("-", s.GetString()), 1);
    EXPECT_TRUE(Holds(s, "aa-bb"));
    CString t("whole");
    EXPECT_EQ(t.Replace(t.GetString(), "part"), 1);
    EXPECT_TRUE(Holds(t, "part"));
    CString u("xxyxx");
    u.Trim(u.GetString() + 2); // trims the characters of "yxx"
    EXPECT_TRUE(Holds(u, ""));
}

// ---------------------------------------------------------------------------
// Substrings

TEST(CStringSubstringTest, LeftMidRightClampTheirArguments) {
    const CString s("abcdef");
    EXPECT_TRUE(Holds(s.Left(-1), ""));
    EXPECT_TRUE(Holds(s.Left(INT_MIN), ""));
    EXPECT_TRUE(Holds(s.Left(0), ""));
    EXPECT_TRUE(Holds(s.Left(3), "abc"));
    EXPECT_TRUE(Holds(s.Left(6), "abcdef"));
    EXPECT_TRUE(Holds(s.Left(7), "abcdef"));
    EXPECT_TRUE(Holds(s.Left(INT_MAX), "abcdef"));

    EXPECT_TRUE(Holds(s.Mid(-2), "abcdef"));
    EXPECT_TRUE(Holds(s.Mid(0), "abcdef"));
    EXPECT_TRUE(Holds(s.Mid(2), "cdef"));
    EXPECT_TRUE(Holds(s.Mid(5), "f"));
    EXPECT_TRUE(Holds(s.Mid(6), ""));
    EXPECT_TRUE(Holds(s.Mid(100), ""));
    EXPECT_TRUE(Holds(s.Mid(INT_MAX), ""));
    EXPECT_TRUE(Holds(s.Mid(-2, 3), "abc"));
    EXPECT_TRUE(Holds(s.Mid(2, 2), "cd"));
    EXPECT_TRUE(Holds(s.Mid(2, 0), ""));
    EXPECT_TRUE(Holds(s.Mid(2, -1), ""));
    EXPECT_TRUE(Holds(s.Mid(2, 100), "cdef"));
    EXPECT_TRUE(Holds(s.Mid(2, INT_MAX), "cdef"));
    EXPECT_TRUE(Holds(s.Mid(INT_MAX, INT_MAX), ""));
    EXPECT_TRUE(Holds(s.Mid(INT_MIN, INT_MAX), "abcdef"));
    EXPECT_TRUE(Holds(s.Mid(6, 1), ""));

    EXPECT_TRUE(Holds(s.Right(-1), ""));
    EXPECT_TRUE(Holds(s.Right(0), ""));
    EXPECT_TRUE(Holds(s.Right(2), "ef"));
    EXPECT_TRUE(Holds(s.Right(6), "abcdef"));
    EXPECT_TRUE(Holds(s.Right(100), "abcdef"));
    EXPECT_TRUE(Holds(s.Right(INT_MIN), ""));

    const CString empty;
    EXPECT_TRUE(Holds(empty.Left(3), ""));
    EXPECT_TRUE(Holds(empty.Mid(0), ""));
    EXPECT_TRUE(Holds(empty.Mid(0, 3), ""));
    EXPECT_TRUE(Holds(empty.Right(3), ""));
    EXPECT_TRUE(Holds(s, "abcdef"));
}

TEST(CStringSubstringTest, SpanIncludingAndExcluding) {
    const CString s("abc123def");
    EXPECT_TRUE(Holds(s.SpanIncluding("cba"), "abc"));
    EXPECT_TRUE(Holds(s.SpanIncluding("xyz"), ""));
    EXPECT_TRUE(Holds(s.SpanIncluding(""), ""));
    EXPECT_TRUE(Holds(s.SpanIncluding(nullptr), ""));
    EXPECT_TRUE(Holds(s.SpanIncluding("abcdef123"), "abc123def"));
    EXPECT_TRUE(Holds(s.SpanExcluding("0123456789"), "abc"));
    EXPECT_TRUE(Holds(s.SpanExcluding("a"), ""));
    EXPECT_TRUE(Holds(s.SpanExcluding(""), "abc123def"));
    EXPECT_TRUE(Holds(s.SpanExcluding("xyz"), "abc123def"));
}

// ---------------------------------------------------------------------------
// Searching

TEST(CStringFindTest, FindCharacter) {
    const CString s("abcabc");
    EXPECT_EQ(s.Find('a'), 0);
    EXPECT_EQ(s.Find('c'), 2);
    EXPECT_EQ(s.Find('c', 2), 2);
    EXPECT_EQ(s.Find('c', 3), 5);
    EXPECT_EQ(s.Find('c', 5), 5);
    EXPECT_EQ(s.Find('c', 6), -1);
    EXPECT_EQ(s.Find('c', 100), -1);
    EXPECT_EQ(s.Find('c', -1), -1);
    EXPECT_EQ(s.Find('z'), -1);
    EXPECT_EQ(CString().Find('a'), -1);
}

TEST(CStringFindTest, FindText) {
    const CString s("abcabc");
    EXPECT_EQ(s.Find("bc"), 1);
    EXPECT_EQ(s.Find("bc", 1), 1);
    EXPECT_EQ(s.Find("bc", 2), 4);
    EXPECT_EQ(s.Find("abc", 4), -1);
    EXPECT_EQ(s.Find("abcabc"), 0);
    EXPECT_EQ(s.Find("abcabcd"), -1);
    EXPECT_EQ(s.Find("cab"), 2);
    EXPECT_EQ(s.Find("c", 6), -1);
    EXPECT_EQ(s.Find("c", 7), -1);
    EXPECT_EQ(s.Find("a", -1), -1);
    EXPECT_EQ(s.Find(static_cast<const char*>(nullptr)), -1);
    EXPECT_EQ(s.Find(""), 0);
    EXPECT_EQ(s.Find("", 3), 3);
    EXPECT_EQ(CString().Find("a"), -1);
}

TEST(CStringFindTest, ReverseFind) {
    const CString s("abcabc");
    EXPECT_EQ(s.ReverseFind('a'), 3);
    EXPECT_EQ(s.ReverseFind('c'), 5);
    EXPECT_EQ(s.ReverseFind('z'), -1);
    EXPECT_EQ(CString("x").ReverseFind('x'), 0);
    EXPECT_EQ(CString().ReverseFind('x'), -1);
}

TEST(CStringFindTest, FindOneOf) {
    const CString s("abc,def;g");
    EXPECT_EQ(s.FindOneOf(";,"), 3);
    EXPECT_EQ(s.FindOneOf("g"), 8);
    EXPECT_EQ(s.FindOneOf("a"), 0);
    EXPECT_EQ(s.FindOneOf("xyz"), -1);
    EXPECT_EQ(s.FindOneOf(""), -1);
    EXPECT_EQ(s.FindOneOf(nullptr), -1);
    EXPECT_EQ(CString().FindOneOf("a"), -1);
    // An embedded NUL is not one of the characters looked for.
    const CString nul("ab\0cd", 5);
    EXPECT_EQ(nul.FindOneOf("xyz"), -1);
    EXPECT_EQ(nul.FindOneOf("b"), 1);
}

std::vector<std::string> Tokens(const CString& s, const char* delimiters, int start = 0) {
    std::vector<std::string> tokens;
    for (int guard = 0; guard < 100; ++guard) {
        CString token = s.Tokenize(delimiters, start);
        if (start == -1) {
            EXPECT_TRUE(token.IsEmpty()) << "the call that ends returns an empty token";
            return tokens;
        }
        tokens.push_back(Text(token));
    }
    ADD_FAILURE() << "Tokenize never ended";
    return tokens;
}

TEST(CStringTokenizeTest, SplitsAtRunsOfDelimiters) {
    using V = std::vector<std::string>;
    EXPECT_EQ(Tokens("a,b,c", ","), (V{"a", "b", "c"}));
    EXPECT_EQ(Tokens("  a, b,,c  ", " ,"), (V{"a", "b", "c"}));
    EXPECT_EQ(Tokens(",,,a", ","), (V{"a"}));
    EXPECT_EQ(Tokens("a,,,", ","), (V{"a"}));
    EXPECT_EQ(Tokens("single", ","), (V{"single"}));
    EXPECT_EQ(Tokens(",,,", ","), V{});
    EXPECT_EQ(Tokens("", ","), V{});
    EXPECT_EQ(Tokens("a,b,c", ",", 2), (V{"b", "c"}));
    EXPECT_EQ(Tokens("a,b,c", ",", 1), (V{"b", "c"}));
    EXPECT_EQ(Tokens("a,b,c", ",", 4), (V{"c"}));
    EXPECT_EQ(Tokens("a,b,c", ",", 5), V{});
    EXPECT_EQ(Tokens("a,b,c", ",", 100), V{});
    EXPECT_EQ(Tokens("a,b,c", ",", -1), V{});
}

TEST(CStringTokenizeTest, StartMovesBehindTheToken) {
    const CString s("ab;cd");
    int start = 0;
    EXPECT_TRUE(Holds(s.Tokenize(";", start), "ab"));
    EXPECT_EQ(start, 3);
    EXPECT_TRUE(Holds(s.Tokenize(";", start), "cd"));
    EXPECT_GE(start, s.GetLength());
    EXPECT_TRUE(Holds(s.Tokenize(";", start), ""));
    EXPECT_EQ(start, -1);
}

TEST(CStringTokenizeTest, NoDelimitersGiveTheRestOnceAndEnd) {
    using V = std::vector<std::string>;
    EXPECT_EQ(Tokens("a,b", ""), (V{"a,b"}));
    EXPECT_EQ(Tokens("a,b", "", 2), (V{"b"}));
    EXPECT_EQ(Tokens("a,b", nullptr), (V{"a,b"}));
    EXPECT_EQ(Tokens("", nullptr), V{});
}

// ---------------------------------------------------------------------------
// Editing

TEST(CStringEditTest, ReplaceTextWithLongerShorterOrNothing) {
    CString s("aXbXc");
    EXPECT_EQ(s.Replace("X", "--"), 2);
    EXPECT_TRUE(Holds(s, "a--b--c"));
    EXPECT_EQ(s.Replace("--", "+"), 2);
    EXPECT_TRUE(Holds(s, "a+b+c"));
    EXPECT_EQ(s.Replace("+", ""), 2);
    EXPECT_TRUE(Holds(s, "abc"));
    EXPECT_EQ(s.Replace("b", nullptr), 1);
    EXPECT_TRUE(Holds(s, "ac"));
    EXPECT_EQ(s.Replace("ac", ""), 1);
    EXPECT_TRUE(Holds(s, ""));
    EXPECT_TRUE(s.IsEmpty());
}

TEST(CStringEditTest, ReplaceTakesMatchesLeftToRightWithoutOverlap) {
    CString s("XXX");
    EXPECT_EQ(s.Replace("XX", "Y"), 1);
    EXPECT_TRUE(Holds(s, "YX"));
    CString t("aaaa");
    EXPECT_EQ(t.Replace("aa", "a"), 2);
    EXPECT_TRUE(Holds(t, "aa"));
    CString u("abab");
    EXPECT_EQ(u.Replace("ab", "abab"), 2); // the replacement is not searched again
    EXPECT_TRUE(Holds(u, "abababab"));
    CString v("at start, in middle, at end");
    EXPECT_EQ(v.Replace("at", "AT"), 2);
    EXPECT_TRUE(Holds(v, "AT start, in middle, AT end"));
}

TEST(CStringEditTest, ReplaceWithNothingToDoReturnsZero) {
    CString s("abc");
    EXPECT_EQ(s.Replace("", "x"), 0);
    EXPECT_EQ(s.Replace(nullptr, "x"), 0);
    EXPECT_EQ(s.Replace("z", "x"), 0);
    EXPECT_EQ(s.Replace("abcd", "x"), 0);
    EXPECT_EQ(s.Replace('z', 'x'), 0);
    EXPECT_EQ(s.Replace('a', 'a'), 0);
    EXPECT_TRUE(Holds(s, "abc"));
}

TEST(CStringEditTest, ReplaceManyOccurrencesMatchesAModel) {
    std::string m;
    for (int i = 0; i < 500; ++i)
        m += "ab-";
    CString s(m.c_str());
    EXPECT_EQ(s.Replace("a", "xyz"), 500);
    std::string want;
    for (int i = 0; i < 500; ++i)
        want += "xyzb-";
    EXPECT_TRUE(Holds(s, want));
    EXPECT_EQ(s.Replace("xyzb", ""), 500);
    EXPECT_TRUE(Holds(s, std::string(500, '-')));
}

TEST(CStringEditTest, ReplaceCharacter) {
    CString s("a.b.c.");
    EXPECT_EQ(s.Replace('.', '/'), 3);
    EXPECT_TRUE(Holds(s, "a/b/c/"));
}

TEST(CStringEditTest, RemoveCountsTheRemovedCharacters) {
    CString s("banana");
    EXPECT_EQ(s.Remove('a'), 3);
    EXPECT_TRUE(Holds(s, "bnn"));
    EXPECT_EQ(s.Remove('z'), 0);
    EXPECT_EQ(s.Remove('b'), 1);
    EXPECT_EQ(s.Remove('n'), 2);
    EXPECT_TRUE(Holds(s, ""));
}

TEST(CStringEditTest, InsertClampsThePositionAndReturnsTheLength) {
    CString s("abc");
    EXPECT_EQ(s.Insert(1, "XY"), 5);
    EXPECT_TRUE(Holds(s, "aXYbc"));
    EXPECT_EQ(s.Insert(100, "!"), 6);
    EXPECT_TRUE(Holds(s, "aXYbc!"));
    EXPECT_EQ(s.Insert(-5, "^"), 7);
    EXPECT_TRUE(Holds(s, "^aXYbc!"));
    EXPECT_EQ(s.Insert(0, ""), 7);
    EXPECT_EQ(s.Insert(0, static_cast<const char*>(nullptr)), 7);
    EXPECT_EQ(s.Insert(3, '-'), 8);
    EXPECT_TRUE(Holds(s, "^aX-Ybc!"));
    CString e;
    EXPECT_EQ(e.Insert(5, "x"), 1);
    EXPECT_TRUE(Holds(e, "x"));
}

TEST(CStringEditTest, DeleteClampsAndReturnsTheLength) {
    CString s("abcdef");
    EXPECT_EQ(s.Delete(1), 5);
    EXPECT_TRUE(Holds(s, "acdef"));
    EXPECT_EQ(s.Delete(1, 2), 3);
    EXPECT_TRUE(Holds(s, "aef"));
    EXPECT_EQ(s.Delete(3, 1), 3);
    EXPECT_EQ(s.Delete(100, 1), 3);
    EXPECT_EQ(s.Delete(1, 0), 3);
    EXPECT_EQ(s.Delete(1, -4), 3);
    EXPECT_TRUE(Holds(s, "aef"));
    EXPECT_EQ(s.Delete(-2, 2), 1);
    EXPECT_TRUE(Holds(s, "f"));
    EXPECT_EQ(s.Delete(0, INT_MAX), 0);
    EXPECT_TRUE(Holds(s, ""));
    CString t("abc");
    EXPECT_EQ(t.Delete(1, INT_MAX), 1);
    EXPECT_TRUE(Holds(t, "a"));
}

TEST(CStringEditTest, TrimRemovesOnlyTheGivenCharactersAtTheEnds) {
    CString s(" \t\r\n\v\f mid dle \t\r\n\v\f ");
    s.Trim();
    EXPECT_TRUE(Holds(s, "mid dle"));
    CString t("xxyhixyx");
    t.Trim("xy");
    EXPECT_TRUE(Holds(t, "hi"));
    CString u("--a-b--");
    u.TrimLeft('-');
    EXPECT_TRUE(Holds(u, "a-b--"));
    u.TrimRight('-');
    EXPECT_TRUE(Holds(u, "a-b"));
    CString all("    ");
    all.TrimLeft();
    EXPECT_TRUE(Holds(all, ""));
    CString all2("    ");
    all2.TrimRight();
    EXPECT_TRUE(Holds(all2, ""));
    CString keep("abc");
    keep.Trim(static_cast<const char*>(nullptr));
    keep.Trim("");
    keep.Trim('\0');
    EXPECT_TRUE(Holds(keep, "abc"));
    CString e;
    e.Trim();
    EXPECT_TRUE(Holds(e, ""));
}

TEST(CStringEditTest, CaseAndReverse) {
    CString s("MiXeD 123 _[]{} \xC9\xE9");
    s.MakeUpper();
    EXPECT_TRUE(Holds(s, "MIXED 123 _[]{} \xC9\xE9")); // only ASCII letters change
    s.MakeLower();
    EXPECT_TRUE(Holds(s, "mixed 123 _[]{} \xC9\xE9"));
    CString r("abcde");
    EXPECT_TRUE(Holds(r.MakeReverse(), "edcba"));
    CString r2("ab");
    EXPECT_TRUE(Holds(r2.MakeReverse(), "ba"));
}

TEST(CStringEditTest, FormatBuildsPrintfText) {
    CString s;
    s.Format("%d-%s-%c-%.2f-%05x-%%", 42, "str", 'c', 1.5, 255);
    EXPECT_TRUE(Holds(s, "42-str-c-1.50-000ff-%"));
    s.Format("%s", "");
    EXPECT_TRUE(Holds(s, ""));
    // Longer than any small fixed buffer.
    std::string big(5000, 'q');
    s.Format("<%s>", big.c_str());
    EXPECT_TRUE(Holds(s, "<" + big + ">"));
    s.AppendFormat("%d", -7);
    EXPECT_TRUE(Holds(s, "<" + big + ">-7"));
    CString e;
    e.AppendFormat("%s", "");
    EXPECT_TRUE(Holds(e, ""));
}

// ---------------------------------------------------------------------------
// Comparison

TEST(CStringCompareTest, CompareReturnsMinusOneZeroOrOne) {
    EXPECT_EQ(CString("a").Compare("z"), -1);
    EXPECT_EQ(CString("z").Compare("a"), 1);
    EXPECT_EQ(CString("abc").Compare("abc"), 0);
    EXPECT_EQ(CString("ab").Compare("abc"), -1);
    EXPECT_EQ(CString("abc").Compare("ab"), 1);
    EXPECT_EQ(CString("").Compare(""), 0);
    EXPECT_EQ(CString("").Compare(nullptr), 0);
    EXPECT_EQ(CString("a").Compare(nullptr), 1);
    EXPECT_EQ(CString("B").Compare("a"), -1); // case matters
    // Bytes compare unsigned.
    EXPECT_EQ(CString("\xE9").Compare("a"), 1);
    EXPECT_EQ(CString("a").Compare("\xE9"), -1);
}

TEST(CStringCompareTest, CompareNoCaseFoldsToLowerCase) {
    EXPECT_EQ(CString("ABC").CompareNoCase("abc"), 0);
    EXPECT_EQ(CString("aBc").CompareNoCase("AbC"), 0);
    EXPECT_EQ(CString("abc").CompareNoCase("ABD"), -1);
    EXPECT_EQ(CString("ABD").CompareNoCase("abc"), 1);
    EXPECT_EQ(CString("AB").CompareNoCase("abc"), -1);
    EXPECT_EQ(CString("abc").CompareNoCase("AB"), 1);
    EXPECT_EQ(CString("a").CompareNoCase("Z"), -1);
    EXPECT_EQ(CString("").CompareNoCase(nullptr), 0);
    EXPECT_EQ(CString("x").CompareNoCase(nullptr), 1);
    // The characters between 'Z' and 'a' sort before the letters, as they do
    // once the letters are folded to lower case (folding to upper case would
    // put them after).
    for (const char* mid : {"[", "\\", "]", "^", "_", "`"}) {
        SCOPED_TRACE(mid);
        EXPECT_EQ(CString(mid).CompareNoCase("a"), -1);
        EXPECT_EQ(CString(mid).CompareNoCase("A"), -1);
        EXPECT_EQ(CString(mid).CompareNoCase("z"), -1);
        EXPECT_EQ(CString(mid).CompareNoCase("Z"), -1);
        EXPECT_EQ(CString("A").CompareNoCase(mid), 1);
        EXPECT_EQ(CString("Z").CompareNoCase(mid), 1);
    }
    EXPECT_EQ(CString("file_b").CompareNoCase("FILEA"), -1);
    // Only ASCII letters are folded.
    EXPECT_NE(CString("\xC9").CompareNoCase("\xE9"), 0);
    EXPECT_EQ(CString("\xE9").CompareNoCase("\xC9"), 1);
}

TEST(CStringCompareTest, OperatorsAgreeWithStrcmpInEveryOperandOrder) {
    const char* texts[] = {"", "a", "b", "ab", "abc", "B", "_", "\xE9"};
    for (const char* x : texts) {
        for (const char* y : texts) {
            SCOPED_TRACE(std::string("\"") + x + "\" vs \"" + y + "\"");
            int r = Sign(std::strcmp(x, y));
            CString a(x);
            CString b(y);
            EXPECT_EQ(a.Compare(y), r);
            EXPECT_EQ(a == b, r == 0);
            EXPECT_EQ(a == y, r == 0);
            EXPECT_EQ(x == b, r == 0);
            EXPECT_EQ(a != b, r != 0);
            EXPECT_EQ(a != y, r != 0);
            EXPECT_EQ(x != b, r != 0);
            EXPECT_EQ(a < b, r < 0);
            EXPECT_EQ(a < y, r < 0);
            EXPECT_EQ(x < b, r < 0);
            EXPECT_EQ(a > b, r > 0);
            EXPECT_EQ(a > y, r > 0);
            EXPECT_EQ(x > b, r > 0);
            EXPECT_EQ(a <= b, r <= 0);
            EXPECT_EQ(a <= y, r <= 0);
            EXPECT_EQ(x <= b, r <= 0);
            EXPECT_EQ(a >= b, r >= 0);
            EXPECT_EQ(a >= y, r >= 0);
            EXPECT_EQ(x >= b, r >= 0);
        }
    }
}

// ---------------------------------------------------------------------------
// UTF-16 text

TEST(CStringWideTest, AsciiRoundTrips) {
    const WCHAR wide[] = {'H', 'e', 'l', 'l', 'o', ',', ' ', '1', '2', '3', 0};
    EXPECT_TRUE(Holds(CString(wide), "Hello, 123"));
    EXPECT_TRUE(Holds(CString(wide, 5), "Hello"));
    EXPECT_TRUE(Holds(CString(wide, 0), ""));
    EXPECT_TRUE(Holds(CString(wide, -1), ""));
    EXPECT_TRUE(Holds(CString(static_cast<const WCHAR*>(nullptr)), ""));
    const WCHAR empty[] = {0};
    EXPECT_TRUE(Holds(CString(empty), ""));
    CString s("old");
    s = wide;
    EXPECT_TRUE(Holds(s, "Hello, 123"));
}

#ifndef _WIN32
TEST(CStringWideTest, NonAsciiBecomesUtf8OnPosix) {
    // H, e acute, euro sign, and U+1F600 as a surrogate pair.
    const WCHAR wide[] = {0x48, 0xE9, 0x20AC, 0xD83D, 0xDE00, 0};
    EXPECT_TRUE(Holds(CString(wide), "H\xC3\xA9\xE2\x82\xAC\xF0\x9F\x98\x80"));
    EXPECT_TRUE(Holds(CString(wide, 3), "H\xC3\xA9\xE2\x82\xAC"));
    CString s;
    s = wide;
    EXPECT_EQ(s.GetLength(), 10);
}
#endif

// ---------------------------------------------------------------------------
// Positions out of range

TEST(CStringRangeTest, GetAtAndSetAtOutOfRangeRaiseInvalidArgument) {
    CString s("abc");
    CString copy(s);
    EXPECT_EQ(s.GetAt(0), 'a');
    EXPECT_EQ(s.GetAt(2), 'c');
    EXPECT_EQ(s[1], 'b');
    EXPECT_THROW(s.GetAt(-1), CInvalidArgException);
    EXPECT_THROW(s.GetAt(3), CInvalidArgException);
    EXPECT_THROW(s.GetAt(INT_MAX), CInvalidArgException);
    EXPECT_THROW(s[3], CInvalidArgException);
    EXPECT_THROW(s.SetAt(-1, 'x'), CInvalidArgException);
    EXPECT_THROW(s.SetAt(3, 'x'), CInvalidArgException);
    EXPECT_THROW(CString().GetAt(0), CInvalidArgException);
    EXPECT_THROW(CString().SetAt(0, 'x'), CInvalidArgException);
    // A failed write changes nothing and still shares.
    EXPECT_TRUE(Holds(s, "abc"));
    EXPECT_EQ(copy.GetString(), s.GetString());
}

TEST(CStringRangeTest, TheExceptionIsAFrameworkAndStandardException) {
    CString s("abc");
    EXPECT_THROW(s.GetAt(5), CException);
    EXPECT_THROW(s.GetAt(5), std::exception);
    try {
        s.SetAt(9, 'x');
        FAIL() << "no exception";
    } catch (const CException& e) {
        EXPECT_NE(dynamic_cast<const CInvalidArgException*>(&e), nullptr);
    }
}

} // namespace
