// A program outside the project that uses the installed library.
#include <vaskel/framework/string.h>
#include <vaskel/value.h>

#include <cstdio>
#include <cstring>

int main() {
    vaskel::CRGBColor color;
    color.SetColor(255, 128, 0);
    vaskel::CString text = color.ToString();
    std::printf("%s\n", text.GetString());
    return std::strcmp(text, "{255,128,0}") == 0 ? 0 : 1;
}
