// The verbs. Each takes the arguments after its name and answers the exit
// code: 0 when it did what was asked, 1 otherwise, with the reason on
// standard error.
#pragma once

#include <string>
#include <vector>

namespace vaskel::regtool {

using Args = std::vector<std::string>;

int RunQuery(const Args& args);
int RunAdd(const Args& args);
int RunDelete(const Args& args);
int RunExport(const Args& args);
int RunImport(const Args& args);

} // namespace vaskel::regtool
