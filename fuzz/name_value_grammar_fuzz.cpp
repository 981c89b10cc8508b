// Reads arbitrary text as a name-value list under one of a few separators.
// The text is copied into a buffer of its own size plus the NUL, so a read
// past the NUL is reported. A successful read writes back to text that reads
// to the same pairs: names are letters and digits and values hold no quote
// and no white space at their ends, which is all the format can carry.
#include <vaskel/namevalue.h>

#include <cstdint>
#include <cstdlib>
#include <vector>

using namespace vaskel;

namespace {

struct Setting {
    const char* separator;
    bool caseSensitive;
};

// None begins with white space, which the reader skips away.
const Setting settings[] = {{",", true}, {";", true}, {"", true},     {"; ", true},
                            {"AND", false}, {"\"", true}, {"=", true}, {"x", false}};

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    if (size == 0)
        return 0;
    const Setting& setting = settings[data[0] % (sizeof(settings) / sizeof(settings[0]))];
    std::vector<char> text(data + 1, data + size);
    text.push_back('\0');
    CVKNameValueGrammar grammar;
    grammar.SetSeparator(setting.separator, setting.caseSensitive);

    CVKNameValueVector pairs;
    pairs.push_back(CVKNameValue("kept", CGenericVal(1)));
    if (!grammar.Read(text.data(), pairs)) {
        if (pairs.size() != 1 || pairs[0].GetName() != "kept")
            std::abort(); // a failed read changed the list
        return 0;
    }
    if (pairs.empty())
        std::abort();
    CVKNameValueVector again;
    if (!grammar.Read(grammar.Write(pairs).GetString(), again) || again != pairs)
        std::abort();
    return 0;
}
