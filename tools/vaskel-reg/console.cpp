#include "console.h"

#include <cctype>
#include <cstdio>
#include <iostream>

namespace vaskel::regtool {

int Fail(const std::string& message) {
    std::fflush(stdout);
    std::fprintf(stderr, "ERROR: %s\n", message.c_str());
    return 1;
}

int SyntaxError(const std::string& message, std::string_view verb) {
    return Fail(message + ". Type \"vaskel-reg " + std::string(verb) + " /?\" for usage.");
}

int Cancelled() {
    return Fail("The operation was cancelled; nothing was changed.");
}

int Succeeded() {
    Print("The operation completed successfully.\n");
    return 0;
}

bool Confirm(const std::string& question) {
    std::string answer;
    for (;;) {
        Print(question + " (Yes/No)? ");
        std::fflush(stdout);
        if (!std::getline(std::cin, answer)) {
            Print("\n");
            return false;
        }
        while (!answer.empty() && std::isspace(static_cast<unsigned char>(answer.back())))
            answer.pop_back();
        for (char& c : answer)
            c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
        if (answer == "y" || answer == "yes")
            return true;
        if (answer == "n" || answer == "no")
            return false;
    }
}

void Print(std::string_view text) {
    std::fwrite(text.data(), 1, text.size(), stdout);
}

} // namespace vaskel::regtool
