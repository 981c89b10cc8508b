#include "value_forms.h"

namespace vaskel::regtool {

bool ToFileForm(const RegValue& registryValue, RegValue& fileValue, std::string& error) {
    fileValue.type = registryValue.type;
    if (!AnsiToUtf8(registryValue.name, fileValue.name)) {
        error = "its name is not valid text in the system code page";
        return false;
    }
    if (!IsStringType(registryValue.type)) {
        fileValue.data = registryValue.data;
        return true;
    }
    const std::string text(registryValue.data.begin(), registryValue.data.end());
    if (!AnsiToUtf16Le(text, fileValue.data)) {
        error = "its data is not valid text in the system code page";
        return false;
    }
    return true;
}

bool ToRegistryForm(const RegValue& fileValue, RegValue& registryValue, std::string& error) {
    registryValue.type = fileValue.type;
    if (!Utf8ToAnsi(fileValue.name, registryValue.name)) {
        error = "the system code page cannot hold its name";
        return false;
    }
    if (!IsStringType(fileValue.type)) {
        registryValue.data = fileValue.data;
        return true;
    }
    std::string text;
    if (!Utf16LeToAnsi(fileValue.data.data(), fileValue.data.size(), text)) {
        error = fileValue.data.size() % 2 != 0
                    ? "its text data has an odd number of bytes, which is no UTF-16 text"
                    : "the system code page cannot hold its text";
        return false;
    }
    registryValue.data.assign(text.begin(), text.end());
    return true;
}

} // namespace vaskel::regtool
