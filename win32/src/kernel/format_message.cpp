// System error texts. The system keeps its English texts in a message table,
// each ending in a line break; this platform keeps those of the error codes
// its own functions set, and the common ones a caller is likely to show.
#include <vkwin32/kernel.h>

#include <algorithm>
#include <cstring>
#include <string>
#include <vector>

namespace {

struct Message {
    DWORD code;
    const char* text;
};

// Sorted by code.
constexpr Message kMessages[] = {
    {0, "The operation completed successfully.\r\n"},
    {1, "Incorrect function.\r\n"},
    {2, "The system cannot find the file specified.\r\n"},
    {3, "The system cannot find the path specified.\r\n"},
    {4, "The system cannot open the file.\r\n"},
    {5, "Access is denied.\r\n"},
    {6, "The handle is invalid.\r\n"},
    {8, "Not enough memory resources are available to process this command.\r\n"},
    {13, "The data is invalid.\r\n"},
    {14, "Not enough memory resources are available to complete this operation.\r\n"},
    {15, "The system cannot find the drive specified.\r\n"},
    {16, "The directory cannot be removed.\r\n"},
    {17, "The system cannot move the file to a different disk drive.\r\n"},
    {18, "There are no more files.\r\n"},
    {19, "The media is write protected.\r\n"},
    {32, "The process cannot access the file because it is being used by another process.\r\n"},
    {33, "The process cannot access the file because another process has locked a portion of "
         "the file.\r\n"},
    {38, "Reached the end of the file.\r\n"},
    {39, "The disk is full.\r\n"},
    {50, "The request is not supported.\r\n"},
    {53, "The network path was not found.\r\n"},
    {80, "The file exists.\r\n"},
    {87, "The parameter is incorrect.\r\n"},
    {109, "The pipe has been ended.\r\n"},
    {111, "The file name is too long.\r\n"},
    {112, "There is not enough space on the disk.\r\n"},
    {120, "This function is not supported on this system.\r\n"},
    {122, "The data area passed to a system call is too small.\r\n"},
    {123, "The filename, directory name, or volume label syntax is incorrect.\r\n"},
    {126, "The specified module could not be found.\r\n"},
    {127, "The specified procedure could not be found.\r\n"},
    {131, "An attempt was made to move the file pointer before the beginning of the file.\r\n"},
    {132, "The file pointer cannot be set on the specified device or file.\r\n"},
    {145, "The directory is not empty.\r\n"},
    {157, "The segment is already discarded and cannot be locked.\r\n"},
    {158, "The segment is already unlocked.\r\n"},
    {161, "The specified path is invalid.\r\n"},
    {170, "The requested resource is in use.\r\n"},
    {183, "Cannot create a file when that file already exists.\r\n"},
    {193, "%1 is not a valid Win32 application.\r\n"},
    {206, "The filename or extension is too long.\r\n"},
    {234, "More data is available.\r\n"},
    {258, "The wait operation timed out.\r\n"},
    {259, "No more data is available.\r\n"},
    {267, "The directory name is invalid.\r\n"},
    {317, "The system cannot find message text for message number 0x%1 in the message file for "
          "%2.\r\n"},
    {997, "Overlapped I/O operation is in progress.\r\n"},
    {998, "Invalid access to memory location.\r\n"},
    {1004, "Invalid flags.\r\n"},
    {1008, "An attempt was made to reference a token that does not exist.\r\n"},
    {1009, "The configuration registry database is corrupt.\r\n"},
    {1010, "The configuration registry key is invalid.\r\n"},
    {1011, "The configuration registry key could not be opened.\r\n"},
    {1012, "The configuration registry key could not be read.\r\n"},
    {1013, "The configuration registry key could not be written.\r\n"},
    {1015, "The registry is corrupted. The structure of one of the files containing registry "
           "data is corrupted, or the system's memory image of the file is corrupted, or the "
           "file could not be recovered because the alternate copy or log was absent or "
           "corrupted.\r\n"},
    {1016, "An I/O operation initiated by the registry failed unrecoverably. The registry could "
           "not read in, or write out, or flush, one of the files that contain the system's "
           "image of the registry.\r\n"},
    {1018, "Illegal operation attempted on a registry key that has been marked for "
           "deletion.\r\n"},
    {1113, "No mapping for the Unicode character exists in the target multi-byte code page.\r\n"},
    {1117, "The request could not be performed because of an I/O device error.\r\n"},
    {1168, "Element not found.\r\n"},
    {1223, "The operation was canceled by the user.\r\n"},
    {1400, "Invalid window handle.\r\n"},
    {1407, "Cannot find window class.\r\n"},
    {1410, "Class already exists.\r\n"},
    {1411, "Class does not exist.\r\n"},
    {1412, "Class still has open windows.\r\n"},
    {1413, "Invalid index.\r\n"},
    {1444, "Invalid thread identifier.\r\n"},
    {1460, "This operation returned because the timeout period expired.\r\n"},
    {1813, "The specified resource type cannot be found in the image file.\r\n"},
    {1815, "The specified resource language ID cannot be found in the image file.\r\n"},
};

const char* FindMessage(DWORD code) {
    // An HRESULT that wraps an error code reads as that code.
    if ((code & 0xFFFF0000u) == 0x80070000u)
        code &= 0xFFFFu;
    const auto it = std::lower_bound(std::begin(kMessages), std::end(kMessages), code,
                                     [](const Message& m, DWORD c) { return m.code < c; });
    return it != std::end(kMessages) && it->code == code ? it->text : nullptr;
}

// The texts are English: the neutral language, the user's and the system's
// defaults (both English here) and English itself find them.
bool LanguageKnown(DWORD language) {
    switch (language) {
    case 0x0000: // LANG_NEUTRAL, SUBLANG_NEUTRAL
    case 0x0400: // LANG_USER_DEFAULT
    case 0x0800: // LANG_SYSTEM_DEFAULT
    case 0x0009: // LANG_ENGLISH, SUBLANG_NEUTRAL
    case 0x0409: // en-US
        return true;
    default:
        return false;
    }
}

// A message's inserts are strings, read by number: from an array of
// pointer-sized values, or from a va_list in order as far as the highest
// number asked for.
class Arguments {
public:
    Arguments(va_list* list, bool isArray) : m_list(list), m_isArray(isArray) {}
    bool Available() const { return m_list != nullptr; }
    const char* Get(int number) {
        if (m_isArray)
            return reinterpret_cast<const char*>(
                reinterpret_cast<const ULONG_PTR*>(m_list)[number - 1]);
        while (static_cast<int>(m_read.size()) < number)
            m_read.push_back(va_arg(*m_list, const char*));
        return m_read[static_cast<std::size_t>(number - 1)];
    }

private:
    va_list* m_list;
    bool m_isArray;
    std::vector<const char*> m_read;
};

// Applies the escapes of a message text. Returns false for an insert that
// cannot be served: no arguments, or a "!format!", which is not supported.
bool Expand(const char* text, bool ignoreInserts, bool joinLines, Arguments& arguments,
            std::string& out) {
    for (const char* p = text; *p;) {
        if (*p == '\r' && p[1] == '\n' && joinLines) {
            out += ' ';
            p += 2;
            continue;
        }
        if (*p != '%') {
            out += *p++;
            continue;
        }
        const char escape = p[1];
        if (escape == '\0') {
            out += *p++;
            continue;
        }
        if (escape >= '1' && escape <= '9') {
            int number = escape - '0';
            const char* end = p + 2;
            if (*end >= '0' && *end <= '9')
                number = number * 10 + (*end++ - '0');
            if (ignoreInserts) {
                out.append(p, end);
                p = end;
                continue;
            }
            if (!arguments.Available() || *end == '!')
                return false;
            const char* value = arguments.Get(number);
            out += value ? value : "(null)";
            p = end;
            continue;
        }
        p += 2;
        switch (escape) {
        case '0':
            return true; // ends the message, and its line break with it
        case 'n':
            out += "\r\n";
            break;
        case 'r':
            out += '\r';
            break;
        case 't':
            out += '\t';
            break;
        default: // "%%", "% ", "%.", "%!" and the like stand for the character
            out += escape;
            break;
        }
    }
    return true;
}

DWORD Fail(DWORD error) {
    SetLastError(error);
    return 0;
}

// An allocated buffer is at least the size asked for, up to the largest
// buffer the function documents.
constexpr DWORD kMaxBufferBytes = 64 * 1024;

} // namespace

extern "C" DWORD WINAPI FormatMessageA(DWORD flags, LPCVOID /*source*/, DWORD messageId,
                                       DWORD languageId, LPSTR buffer, DWORD size,
                                       va_list* arguments) {
    const bool allocate = (flags & FORMAT_MESSAGE_ALLOCATE_BUFFER) != 0;
    if (allocate && buffer)
        *reinterpret_cast<LPSTR*>(buffer) = nullptr;
    if ((allocate && !buffer) || (flags & FORMAT_MESSAGE_FROM_STRING))
        return Fail(ERROR_INVALID_PARAMETER);
    // Only the system has a message table here; a module has none.
    if (!(flags & FORMAT_MESSAGE_FROM_SYSTEM))
        return Fail(flags & FORMAT_MESSAGE_FROM_HMODULE ? ERROR_RESOURCE_TYPE_NOT_FOUND
                                                        : ERROR_INVALID_PARAMETER);
    // Wrapping at a given width is not offered; no width and "no line
    // breaks but the hard ones" are.
    const DWORD width = flags & FORMAT_MESSAGE_MAX_WIDTH_MASK;
    if (width != 0 && width != FORMAT_MESSAGE_MAX_WIDTH_MASK)
        return Fail(ERROR_INVALID_PARAMETER);

    const char* text = FindMessage(messageId);
    if (!text)
        return Fail(ERROR_MR_MID_NOT_FOUND);
    if (!LanguageKnown(languageId))
        return Fail(ERROR_RESOURCE_LANG_NOT_FOUND);

    Arguments inserts(arguments, (flags & FORMAT_MESSAGE_ARGUMENT_ARRAY) != 0);
    std::string message;
    if (!Expand(text, (flags & FORMAT_MESSAGE_IGNORE_INSERTS) != 0, width != 0, inserts, message))
        return Fail(ERROR_INVALID_PARAMETER);

    const std::size_t needed = message.size() + 1;
    if (allocate) {
        const std::size_t bytes = std::max<std::size_t>(needed, std::min(size, kMaxBufferBytes));
        auto* text = static_cast<LPSTR>(LocalAlloc(LMEM_FIXED, bytes));
        if (!text)
            return Fail(ERROR_NOT_ENOUGH_MEMORY);
        std::memcpy(text, message.c_str(), needed);
        *reinterpret_cast<LPSTR*>(buffer) = text;
        return static_cast<DWORD>(message.size());
    }
    if (size < needed)
        return Fail(ERROR_INSUFFICIENT_BUFFER);
    if (!buffer)
        return Fail(ERROR_INVALID_PARAMETER);
    std::memcpy(buffer, message.c_str(), needed);
    return static_cast<DWORD>(message.size());
}
