// The debug trace: one process-wide switch (the registry value "DumpMsg" under
// HKEY_LOCAL_MACHINE\SOFTWARE\Quillmark\Lumivanta), one process-wide prefix naming
// the component created last, and lines written to the debug output.
//
// Never pass an account name, a password or a sign-in token to TraceMessage, in
// any form (escaped, in a URL or a request body). Tests capture the trace output
// and scan it for the secrets they used (tests/python/test_service.py).
#pragma once

namespace diag {

// Reads the switch again and sets the prefix to "[name]". A key that cannot be
// opened keeps the previous state; a missing or unreadable value turns the trace
// off. A name of 30 or more characters keeps the previous prefix.
void TraceSetPrefix(const char* name);

// Formats one line (at most kTraceTextLimit characters of text) and writes it
// behind the prefix, ending it with a line feed. "%s" takes a wide string and
// "%S" a narrow one. When the trace is off it costs one byte test.
void TraceMessage(const wchar_t* format, ...);

inline constexpr int kTraceTextLimit = 1023;

}  // namespace diag
