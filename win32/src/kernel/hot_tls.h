// Thread-local data read on every message or lock operation. The subset is
// loaded with the program, not opened later, so its thread-local storage can
// sit at a fixed offset and be read without a call.
#pragma once

#define VKW32_HOT_TLS __attribute__((tls_model("initial-exec")))
