// Process-wide start-up of the HTTP library, run once by the module's init before any
// thread can make a request.
#pragma once

namespace platform::http {

// Safe to call more than once; only the first call does anything.
void GlobalInit();

}  // namespace platform::http
