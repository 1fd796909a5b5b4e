// What runs in threads that a script creates: the routine of a child thread and the destructor of keys. Both are called
// by the library, long after the command that passed them may have ended, and beside the command thread. They touch no
// registry table.
#pragma once

#include "oci.h"

// What children started from now on work with.
void SetChildHandles(OCIEnv* environment, OCIError* error);

// The start routine; its argument is a key. Checks that the key keeps, for this thread, the value that this thread
// sets. Prints nothing when all is well.
void ChildThread(void* key);

// Prints a key's value. The name is spelled so.
void MyThreadKeyDescructor(void* value);
