#pragma once

namespace interpreter {

// Python 3.9 to 3.11 decide whether the main thread must stop for pending calls
// on the thread that tries to add one, refused or not, and decide no for a thread
// other than the main one: the main thread then notices a call only when it next
// takes the interpreter lock, which a loop in pure Python never does. There a
// helper thread asks for the lock briefly after each such attempt: a waiter makes
// the holder let go after the switch interval, and the main thread, retaking the
// lock, decides again. Other interpreters notice at once; there both do nothing.

// Starts the helper, once. With the interpreter lock on its main thread (a nudge
// from the thread taken for the main one is left out), before it finalizes.
void PrepareMainThreadNudge();

// Has the helper ask for the lock soon when the calling thread is not the main
// one; requests coalesce. Never blocks; does nothing before the preparation.
void NudgeMainThread();

}  // namespace interpreter
