#include "reg_file.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

using namespace vaskel::regtool;

namespace {

const std::string header = "Windows Registry Editor Version 5.00\r\n\r\n";

// UTF-16LE bytes of ASCII text, built here so the tests do not lean on the
// conversions under test.
Bytes Utf16(std::string_view ascii, bool terminated = true) {
    Bytes bytes;
    for (char c : ascii)
        bytes.insert(bytes.end(), {static_cast<unsigned char>(c), 0});
    if (terminated)
        bytes.insert(bytes.end(), {0, 0});
    return bytes;
}

std::string Utf16File(std::string_view ascii) {
    Bytes bytes = Utf16(ascii, false);
    return "\xFF\xFE" + std::string(bytes.begin(), bytes.end());
}

// The text of a written file whose characters are all ASCII.
std::string AsciiText(const std::string& file) {
    EXPECT_EQ(file.substr(0, 2), "\xFF\xFE");
    std::string text;
    for (std::size_t i = 2; i + 1 < file.size(); i += 2) {
        EXPECT_EQ(file[i + 1], '\0') << "at byte " << i;
        text.push_back(file[i]);
    }
    return text;
}

std::vector<RegKeyEntry> Parse(const std::string& bytes) {
    std::vector<RegKeyEntry> entries;
    RegFileError error;
    EXPECT_TRUE(ParseRegFile(bytes, entries, error))
        << "line " << error.line << ": " << error.message;
    return entries;
}

RegFileError ParseError(const std::string& bytes) {
    std::vector<RegKeyEntry> entries{RegKeyEntry{}};
    RegFileError error;
    EXPECT_FALSE(ParseRegFile(bytes, entries, error));
    EXPECT_TRUE(entries.empty()) << "a failed file gave entries";
    EXPECT_FALSE(error.message.empty());
    return error;
}

// The only value of a file with one key holding one value line.
RegValue OneValue(const std::string& line) {
    auto entries = Parse(header + "[HKEY_CURRENT_USER\\Software\\Test]\r\n" + line + "\r\n");
    if (entries.size() != 1 || entries[0].values.size() != 1) {
        ADD_FAILURE() << "no single value in " << line;
        return {};
    }
    return entries[0].values[0].value;
}

std::string Written(const std::vector<RegKeyEntry>& entries) {
    std::string bytes;
    std::string error;
    EXPECT_TRUE(WriteRegFile(entries, bytes, error)) << error;
    return AsciiText(bytes);
}

RegKeyEntry Key(const std::string& subkey, std::vector<RegValue> values = {}) {
    RegKeyEntry entry{0, false, {RootKey::CurrentUser, subkey}, {}};
    for (RegValue& value : values)
        entry.values.push_back({0, false, std::move(value)});
    return entry;
}

bool Same(const RegValue& a, const RegValue& b) {
    return a.name == b.name && a.type == b.type && a.data == b.data;
}

TEST(RegFileReadTest, ReadsEveryValueForm) {
    EXPECT_TRUE(Same(OneValue("@=\"Default\""), {"", REG_SZ, Utf16("Default")}));
    EXPECT_TRUE(Same(OneValue("\"Text\"=\"\""), {"Text", REG_SZ, Utf16("")}));
    EXPECT_TRUE(Same(OneValue("\"D\"=dword:0000002a"), {"D", REG_DWORD, {0x2a, 0, 0, 0}}));
    EXPECT_TRUE(Same(OneValue("\"D\"=DWORD:1"), {"D", REG_DWORD, {1, 0, 0, 0}}));
    EXPECT_TRUE(Same(OneValue("\"B\"=hex:00,ff,A0,7"), {"B", REG_BINARY, {0, 0xff, 0xa0, 7}}));
    EXPECT_TRUE(Same(OneValue("\"B\"=hex:"), {"B", REG_BINARY, {}}));
    EXPECT_TRUE(
        Same(OneValue("\"E\"=hex(2):25,00,50,00,00,00"), {"E", REG_EXPAND_SZ, Utf16("%P")}));
    EXPECT_TRUE(Same(OneValue("\"M\"=hex(7):61,00,00,00,00,00"),
                     {"M", REG_MULTI_SZ, {'a', 0, 0, 0, 0, 0}}));
    EXPECT_TRUE(Same(OneValue("\"Q\"=hex(b):01,02,03,04,05,06,07,08"),
                     {"Q", REG_QWORD, {1, 2, 3, 4, 5, 6, 7, 8}}));
    EXPECT_TRUE(Same(OneValue("\"N\"=hex(0):"), {"N", REG_NONE, {}}));
    EXPECT_TRUE(Same(OneValue("\"U\"=hex(ABCD):56"), {"U", 0xabcd, {0x56}}));
    EXPECT_TRUE(Same(OneValue("\"U\"=hex(ffffffff):"), {"U", 0xffffffffu, {}}));
    EXPECT_TRUE(Same(OneValue("\"Spaced\" =  \"x\"  "), {"Spaced", REG_SZ, Utf16("x")}));

    RegValueEntry removed =
        Parse(header + "[HKEY_CURRENT_USER\\T]\r\n\"Gone\"= - ;why\r\n")[0].values[0];
    EXPECT_TRUE(removed.remove);
    EXPECT_EQ(removed.value.name, "Gone");
}

TEST(RegFileReadTest, UnescapesQuotesAndBackslashes) {
    RegValue value = OneValue(R"("a \"q\" \\ b"="C:\\Program Files\\\"x\"")");
    EXPECT_EQ(value.name, R"(a "q" \ b)");
    EXPECT_EQ(value.data, Utf16(R"(C:\Program Files\"x")"));
    // Brackets, equals signs and semicolons inside quotes are text.
    EXPECT_TRUE(Same(OneValue(R"("[k]=;v"="x;y=[z]")"), {"[k]=;v", REG_SZ, Utf16("x;y=[z]")}));

    const std::string key = header + "[HKEY_CURRENT_USER\\T]\r\n";
    EXPECT_EQ(ParseError(key + R"("a"="C:\Windows")" + "\r\n").line, 4);
    EXPECT_EQ(ParseError(key + R"("a"="unterminated)" + "\r\n").line, 4);
    EXPECT_EQ(ParseError(key + R"("a"="x"y")" + "\r\n").line, 4);
}

TEST(RegFileReadTest, JoinsContinuedHexLines) {
    const RegValue expected{"M", REG_MULTI_SZ, {'L', 'i', 'n', 'e', 0, 0}};
    EXPECT_TRUE(Same(OneValue("\"M\"=hex(7):4c,69,\\\r\n  6e,65,00,00"), expected));
    // Blank lines, comment lines and comments after the backslash are passed over.
    EXPECT_TRUE(Same(OneValue("\"M\"=hex(7):4c,\\ ;one\r\n\r\n;two\r\n\t69 , 6e,\\\r\n65,00,00"),
                     expected));

    const std::string key = header + "[HKEY_CURRENT_USER\\T]\r\n";
    // The system's editor keeps the bytes before such a break and drops the rest.
    EXPECT_EQ(ParseError(key + "\"B\"=hex:01,02,\r\n  03\r\n").line, 4);
    EXPECT_EQ(ParseError(key + "\"B\"=hex:01,02\\\r\n  ,03\r\n").line, 4);
    EXPECT_EQ(ParseError(key + "\"B\"=hex:01,\\\r\n  #comment\r\n  02\r\n").line, 5);
    EXPECT_EQ(ParseError(key + "\"B\"=hex:01,\\\r\n\r\n").line, 4);
    EXPECT_EQ(ParseError(key + "\"B\"=hex:01,\\ x\r\n  02\r\n").line, 4);
    EXPECT_EQ(ParseError(key + "\"B\"=hex:123\r\n").line, 4);
    EXPECT_EQ(ParseError(key + "\"B\"=hex:01 02\r\n").line, 4);
    EXPECT_EQ(ParseError(key + "\"S\"=\"one\\\r\ntwo\"\r\n").line, 4);
}

TEST(RegFileReadTest, SkipsCommentsAndBlankLines) {
    auto entries = Parse(header + "; a comment\r\n# another\r\n   \t\r\n"
                                  "[HKEY_CURRENT_USER\\T]\r\n"
                                  "  ;\"Hidden\"=\"x\"\r\n"
                                  "\"Shown\"=\"y\" ; trailing\r\n"
                                  "\"D\"=dword:00000004;comment\r\n");
    ASSERT_EQ(entries.size(), 1u);
    ASSERT_EQ(entries[0].values.size(), 2u);
    EXPECT_EQ(entries[0].values[0].value.name, "Shown");
    EXPECT_EQ(entries[0].values[0].line, 8);
    EXPECT_EQ(entries[0].values[1].value.data, (Bytes{4, 0, 0, 0}));
    // Only ; starts a comment after a value.
    EXPECT_EQ(ParseError(header + "[HKEY_CURRENT_USER\\T]\r\n\"a\"=\"b\" #no\r\n").line, 4);
}

TEST(RegFileReadTest, ReadsKeysAndTheirDeletion) {
    auto entries = Parse(header + "[HKEY_CURRENT_USER\\Software\\A]\r\n\"v\"=\"1\"\r\n"
                                  "[-HKEY_LOCAL_MACHINE\\Software\\B]\r\n"
                                  "[hkey_classes_root\\.txt\\]\r\n"
                                  "[HKEY_CURRENT_USER]\r\n");
    ASSERT_EQ(entries.size(), 4u);
    EXPECT_FALSE(entries[0].remove);
    EXPECT_EQ(entries[0].key.Text(), "HKEY_CURRENT_USER\\Software\\A");
    EXPECT_EQ(entries[0].line, 3);
    EXPECT_TRUE(entries[1].remove);
    EXPECT_EQ(entries[1].key.Text(), "HKEY_LOCAL_MACHINE\\Software\\B");
    EXPECT_EQ(entries[2].key.Text(), "HKEY_CLASSES_ROOT\\.txt");
    EXPECT_TRUE(entries[3].key.IsRoot());
    // The last bracket closes the name, so a name may hold one.
    EXPECT_EQ(Parse(header + "[HKEY_CURRENT_USER\\a]b]\r\n")[0].key.subkey, "a]b");

    EXPECT_EQ(ParseError(header + "[HKCU\\Software]\r\n").line, 3);
    EXPECT_EQ(ParseError(header + "[HKEY_CURRENT_USER\\x]\r\n[-HKEY_CURRENT_USER]\r\n").line, 4);
    EXPECT_EQ(ParseError(header + "[HKEY_USERS\\x]\r\n").line, 3);
    EXPECT_EQ(ParseError(header + "[ HKEY_CURRENT_USER\\x]\r\n").line, 3);
    EXPECT_EQ(ParseError(header + "[HKEY_CURRENT_USER\\a\\\\b]\r\n").line, 3);
    EXPECT_EQ(ParseError(header + "[HKEY_CURRENT_USER\\x\r\n").line, 3);
    EXPECT_EQ(ParseError(header + "[HKEY_CURRENT_USER\\x] ;c\r\n").line, 3);
    EXPECT_EQ(ParseError(header + "\"early\"=\"x\"\r\n").line, 3);
    EXPECT_EQ(ParseError(header + "[-HKEY_CURRENT_USER\\x]\r\n\"v\"=\"x\"\r\n").line, 4);
    EXPECT_EQ(ParseError(header + "[HKEY_CURRENT_USER\\x]\r\nv=\"x\"\r\n").line, 4);
}

TEST(RegFileReadTest, RefusesBadDataWithItsLine) {
    const std::string key = header + "[HKEY_CURRENT_USER\\T]\r\n";
    for (const char* line :
         {"\"d\"=dword:", "\"d\"=dword:123456789", "\"d\"=dword:0x12", "\"d\"=dword:12 34",
          "\"q\"=qword:1", "\"x\"=hex(2)01", "\"x\"=hex(123456789):", "\"x\"=hex(:", "\"x\"",
          "\"x\"=", "\"x\"=text"})
        EXPECT_EQ(ParseError(key + "\"ok\"=\"1\"\r\n" + line + "\r\n").line, 5) << line;
    std::string longName(16384, 'n');
    EXPECT_EQ(ParseError(key + "\"" + longName + "\"=\"\"\r\n").line, 4);
    std::string longKey(256, 'k');
    EXPECT_EQ(ParseError(header + "[HKEY_CURRENT_USER\\" + longKey + "]\r\n").line, 3);
}

TEST(RegFileReadTest, NeedsTheHeaderOnTheFirstLine) {
    EXPECT_EQ(ParseError("").line, 1);
    EXPECT_EQ(ParseError("\r\nWindows Registry Editor Version 5.00\r\n").line, 1);
    EXPECT_EQ(ParseError("windows registry editor version 5.00\r\n").line, 1);
    EXPECT_EQ(ParseError("REGEDIT5\r\n").line, 1);
    EXPECT_TRUE(Parse("  Windows Registry Editor Version 5.00  \r\n").empty());
    EXPECT_TRUE(Parse("Windows Registry Editor Version 5.00").empty());
}

TEST(RegFileReadTest, ReadsOlderFilesWithTextInTheCodePage) {
    auto entries = Parse("REGEDIT4\n\n[HKEY_CURRENT_USER\\T]\n"
                         "\"E\"=hex(2):25,50,25,00\n\"B\"=hex:25,50\n");
    ASSERT_EQ(entries.size(), 1u);
    EXPECT_EQ(entries[0].values[0].value.data, Utf16("%P%"));
    EXPECT_EQ(entries[0].values[1].value.data, (Bytes{0x25, 0x50}));
}

TEST(RegFileReadTest, ReadsUtf16AndUtf8Alike) {
    const std::string text = "Windows Registry Editor Version 5.00\r\n\r\n"
                             "[HKEY_CURRENT_USER\\T]\r\n\"a\"=\"b\"\r\n\"c\"=dword:00000001\r\n";
    auto utf8 = Parse(text);
    auto utf8Marked = Parse("\xEF\xBB\xBF" + text);
    auto utf16 = Parse(Utf16File(text));
    ASSERT_EQ(utf8.size(), 1u);
    ASSERT_EQ(utf16.size(), 1u);
    ASSERT_EQ(utf8Marked.size(), 1u);
    for (std::size_t i = 0; i < 2; ++i) {
        EXPECT_TRUE(Same(utf16[0].values[i].value, utf8[0].values[i].value));
        EXPECT_TRUE(Same(utf8Marked[0].values[i].value, utf8[0].values[i].value));
    }

    // é, € and U+1F600 in UTF-16LE, then the same characters in UTF-8.
    const std::string wide = Utf16File("Windows Registry Editor Version 5.00\r\n"
                                       "[HKEY_CURRENT_USER\\T]\r\n\"") +
                             std::string("\xE9\0\xAC\x20\x3D\xD8\x00\xDE", 8) +
                             std::string("\"\0=\0\"\0\"\0", 8);
    auto entries = Parse(wide);
    ASSERT_EQ(entries.size(), 1u);
    EXPECT_EQ(entries[0].values[0].value.name, "\xC3\xA9\xE2\x82\xAC\xF0\x9F\x98\x80");
}

TEST(RegFileReadTest, RefusesBrokenTextWithItsLine) {
    const std::string start = "Windows Registry Editor Version 5.00\n[HKEY_CURRENT_USER\\T]\n";
    EXPECT_EQ(ParseError(start + "\"a\"=\"\xC3\"\n").line, 3);
    EXPECT_EQ(ParseError(start + "\"a\"=\"\xED\xA0\x80\"\n").line, 3); // an encoded surrogate
    EXPECT_EQ(ParseError(start + std::string("\"a\"=\"\0\"\n", 7)).line, 3);
    EXPECT_EQ(ParseError(Utf16File(start) + "\x3D").line, 3); // half a character
    EXPECT_EQ(ParseError(Utf16File(start) + std::string("\x3D\xD8\n\0", 4)).line, 3);
}

TEST(RegFileWriteTest, WritesTheLayoutOfTheSystemsEditor) {
    std::vector<RegKeyEntry> entries{
        Key("Software\\Test", {{"", REG_SZ, Utf16("Default")},
                               {"Quote\"and\\", REG_SZ, Utf16("C:\\ \"x\"")},
                               {"D", REG_DWORD, {0x78, 0x56, 0x34, 0x12}},
                               {"B", REG_BINARY, {0x11, 0xab}},
                               {"E", REG_EXPAND_SZ, Utf16("%P%")},
                               {"Q", REG_QWORD, {1, 0, 0, 0, 0, 0, 0, 0}},
                               {"N", REG_NONE, {}},
                               {"U", 0xabcd, {0x56}}}),
        Key("Software\\Test\\Empty")};
    entries.push_back(Key("Software\\Old"));
    entries.back().remove = true;
    entries[1].values.push_back({0, true, {"Gone", REG_SZ, {}}});

    EXPECT_EQ(Written(entries), header + "[HKEY_CURRENT_USER\\Software\\Test]\r\n"
                                         "@=\"Default\"\r\n"
                                         "\"Quote\\\"and\\\\\"=\"C:\\\\ \\\"x\\\"\"\r\n"
                                         "\"D\"=dword:12345678\r\n"
                                         "\"B\"=hex:11,ab\r\n"
                                         "\"E\"=hex(2):25,00,50,00,25,00,00,00\r\n"
                                         "\"Q\"=hex(b):01,00,00,00,00,00,00,00\r\n"
                                         "\"N\"=hex(0):\r\n"
                                         "\"U\"=hex(abcd):56\r\n"
                                         "\r\n"
                                         "[HKEY_CURRENT_USER\\Software\\Test\\Empty]\r\n"
                                         "\"Gone\"=-\r\n"
                                         "\r\n"
                                         "[-HKEY_CURRENT_USER\\Software\\Old]\r\n"
                                         "\r\n");
    EXPECT_EQ(Written({}), header);
}

TEST(RegFileWriteTest, WrapsHexAsTheSystemsEditorDoes) {
    // From a file the system's editor wrote.
    Bytes comSpec = Utf16("%SystemRoot%\\system32\\cmd.exe");
    EXPECT_EQ(Written({Key("E", {{"ComSpec", REG_EXPAND_SZ, comSpec}})}),
              header + "[HKEY_CURRENT_USER\\E]\r\n"
                       "\"ComSpec\"=hex(2):25,00,53,00,79,00,73,00,74,00,65,00,6d,00,52,00,6f,00,"
                       "6f,00,\\\r\n"
                       "  74,00,25,00,5c,00,73,00,79,00,73,00,74,00,65,00,6d,00,33,00,32,00,5c,"
                       "00,63,\\\r\n"
                       "  00,6d,00,64,00,2e,00,65,00,78,00,65,00,00,00\r\n\r\n");

    // Lines break once they reach 77 characters, the last byte's comma aside:
    // 25 bytes fill a continuation line, and a name past the limit breaks
    // after the first byte.
    for (std::size_t bytes = 1; bytes <= 80; ++bytes) {
        const std::string text = Written({Key("K", {{"Name", REG_BINARY, Bytes(bytes, 0xee)}})});
        const std::string start = header + "[HKEY_CURRENT_USER\\K]\r\n";
        std::size_t lineStart = start.size();
        std::size_t total = 0;
        for (int line = 0;; ++line) {
            std::size_t end = text.find("\r\n", lineStart);
            std::string current = text.substr(lineStart, end - lineStart);
            std::size_t count = (current.size() - (line == 0 ? 11 : 2) + 1) / 3;
            total += count;
            if (current.back() != '\\') {
                EXPECT_EQ(total, bytes);
                break;
            }
            EXPECT_EQ(count, line == 0 ? 22u : 25u) << bytes << " bytes, line " << line;
            lineStart = end + 2;
        }
    }
    std::string longName(80, 'n');
    EXPECT_EQ(Written({Key("K", {{longName, REG_BINARY, {1, 2}}})}),
              header + "[HKEY_CURRENT_USER\\K]\r\n\"" + longName + "\"=hex:01,\\\r\n  02\r\n\r\n");
}

TEST(RegFileWriteTest, WritesAsHexWhatTheShortFormsWouldChange) {
    const std::string start = header + "[HKEY_CURRENT_USER\\K]\r\n";
    EXPECT_EQ(Written({Key("K", {{"a", REG_SZ, {}}})}), start + "\"a\"=hex(1):\r\n\r\n");
    EXPECT_EQ(Written({Key("K", {{"a", REG_SZ, Utf16("ab", false)}})}),
              start + "\"a\"=hex(1):61,00,62,00\r\n\r\n");
    EXPECT_EQ(Written({Key("K", {{"a", REG_SZ, {'a', 0, 0, 0, 'b', 0, 0, 0}}})}),
              start + "\"a\"=hex(1):61,00,00,00,62,00,00,00\r\n\r\n");
    EXPECT_EQ(Written({Key("K", {{"a", REG_SZ, Utf16("1\r\n2")}})}),
              start + "\"a\"=hex(1):31,00,0d,00,0a,00,32,00,00,00\r\n\r\n");
    EXPECT_EQ(Written({Key("K", {{"a", REG_SZ, {'a', 0, 0}}})}),
              start + "\"a\"=hex(1):61,00,00\r\n\r\n");
    EXPECT_EQ(Written({Key("K", {{"a", REG_DWORD, {1, 2}}})}),
              start + "\"a\"=hex(4):01,02\r\n\r\n");
    EXPECT_EQ(Written({Key("K", {{"a", REG_DWORD, {}}})}), start + "\"a\"=hex(4):\r\n\r\n");
}

TEST(RegFileWriteTest, RefusesNamesALineCannotHold) {
    std::string bytes;
    std::string error;
    EXPECT_FALSE(WriteRegFile({Key("a\nb")}, bytes, error));
    EXPECT_FALSE(WriteRegFile({Key("K", {{"a\rb", REG_SZ, Utf16("")}})}, bytes, error));
    EXPECT_FALSE(WriteRegFile({Key("K", {{"\xC3", REG_SZ, Utf16("")}})}, bytes, error));
    RegKeyEntry removed = Key("K", {{"a", REG_SZ, Utf16("")}});
    removed.remove = true;
    EXPECT_FALSE(WriteRegFile({removed}, bytes, error));
    EXPECT_FALSE(error.empty());
}

TEST(RegFileRoundTripTest, ReadsBackWhatItWrote) {
    std::vector<RegKeyEntry> entries{
        Key("A", {{"", REG_SZ, Utf16("x")},
                  {"s", REG_SZ, Utf16("")},
                  {"odd", REG_SZ, {'a', 0, 0}},
                  {"nul", REG_SZ, {'a', 0, 0, 0, 'b', 0, 0, 0}},
                  {"e", REG_EXPAND_SZ, Utf16("%TEMP%")},
                  {"m", REG_MULTI_SZ, {'a', 0, 0, 0, 'b', 0, 0, 0, 0, 0}},
                  {"d", REG_DWORD, {1, 2, 3, 4}},
                  {"short", REG_DWORD, {1}},
                  {"q", REG_QWORD, {1, 2, 3, 4, 5, 6, 7, 8}},
                  {"b", REG_BINARY, Bytes(300, 0x5a)},
                  {"n", REG_NONE, {}},
                  {"\xE2\x82\xAC \"\\", 0x12345678, {0}}}),
        Key("A\\B \xC3\xA9", {{"x", REG_SZ, Utf16("y")}})};
    std::string bytes;
    std::string error;
    ASSERT_TRUE(WriteRegFile(entries, bytes, error)) << error;
    auto read = Parse(bytes);
    ASSERT_EQ(read.size(), entries.size());
    for (std::size_t k = 0; k < entries.size(); ++k) {
        EXPECT_EQ(read[k].key.Text(), entries[k].key.Text());
        ASSERT_EQ(read[k].values.size(), entries[k].values.size());
        for (std::size_t v = 0; v < entries[k].values.size(); ++v)
            EXPECT_TRUE(Same(read[k].values[v].value, entries[k].values[v].value))
                << entries[k].values[v].value.name;
    }
}

} // namespace
