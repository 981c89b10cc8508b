// What the verbs say: results on standard output, errors on standard error,
// and questions answered on standard input.
#pragma once

#include <string>
#include <string_view>

namespace vaskel::regtool {

// Prints "ERROR: message" on standard error; answers the failing exit code.
int Fail(const std::string& message);
// A command line the verb cannot take: the message and where to find help.
int SyntaxError(const std::string& message, std::string_view verb);
// A question answered no: nothing was changed.
int Cancelled();
// Prints the system tool's line for a change made; answers the success code.
int Succeeded();
// Asks "question (Yes/No)? " until the answer is yes or no; the end of the
// input answers no.
bool Confirm(const std::string& question);
// Writes text as it is, NUL bytes and all, on standard output.
void Print(std::string_view text);

} // namespace vaskel::regtool
