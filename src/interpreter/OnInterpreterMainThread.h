#pragma once

namespace interpreter {

// True when the calling thread is the interpreter's main thread, the one that
// runs the interpreter's pending calls and so dispatches posted messages. Needs
// the interpreter lock.
bool OnInterpreterMainThread();

}  // namespace interpreter
