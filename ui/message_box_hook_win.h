#pragma once

// The hook that shows every dialog box of a thread, the system's message
// boxes included, in the player's language: it relabels the standard
// buttons (OK, Cancel, Retry, Yes, No) from the lexicon and gives the box
// the dialog font. Only Windows code includes this header.

// Installs the hook for the calling thread. The hook handle goes into a
// thread-local slot, allocated once for the process, where the hook
// procedure finds it. False when the system refused the hook.
bool InstallMessageBoxHook();
// Removes the calling thread's hook and clears its slot value.
void RemoveMessageBoxHook();
// At process end, after every thread removed its hook.
void FreeMessageBoxHookSlot();
