// Values as the registry's ANSI functions take them and as registry files
// hold them: names in the system code page or in UTF-8, the data of the
// string types in the system code page or in UTF-16LE. Where the system code
// page is UTF-8 only the data changes.
#pragma once

#include "reg_value.h"

#include <string>

namespace vaskel::regtool {

// Each fails, saying why, when the other form cannot hold the value exactly.
bool ToFileForm(const RegValue& registryValue, RegValue& fileValue, std::string& error);
bool ToRegistryForm(const RegValue& fileValue, RegValue& registryValue, std::string& error);

} // namespace vaskel::regtool
