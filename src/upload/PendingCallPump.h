#pragma once

namespace upload {

// Makes the calling thread, which must be the interpreter's main thread, dispatch
// the messages posted to its windows whenever it runs Python code: a post that
// finds no dispatch scheduled registers one interpreter pending call that drains
// the queue. Installing again changes nothing.
void InstallPendingCallPump();

}  // namespace upload
