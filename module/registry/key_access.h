// How a registry routine reaches the key it works on. An event names its key in one of two
// ways: the instance's current key (its root index and key path), or a root key and a path of
// its own; the readers name their root by text. Either way the routine checks what it was
// given (only null pointers and root indexes of 5 or more fail), then opens or creates the key
// with the access it needs, in the view the instance has chosen.
//
// Every use but KeyUse::Test reports in lastError: ERR_INVALID_PARAMETERS from before the
// checks until a registry call answers, then that call's result.
#pragma once

#include "../runtime/error_state.h"
#include "../runtime/host_services.h"
#include "../runtime/key_selection.h"

// What a routine does with its key, which decides how it is opened and whether the outcome is
// reported.
enum class KeyUse {
    Test,    // opened to read; nothing reported (the existence conditions)
    Read,    // opened to read (the value readers)
    Change,  // opened, never created, with write access (value deletion)
    Write,   // created when missing, with write access (the writers)
    Delete,  // not opened here: the deletion walks the key itself
};

// The key a routine works on, and its handle once open. The routine closes the handle.
struct TargetKey {
    HKEY root;
    const WCHAR* path;
    HKEY handle;
};

// The instance's current key. False when there is none, `given` is false (a parameter the event
// needs is missing), the root index is invalid, or the open fails.
bool ReachCurrentKey(RunObjectData* instance, KeyUse use, TargetKey* key, bool given = true);

// The key that a root-key parameter and a key path name, with the same checks and open.
bool ReachNamedKey(RunObjectData* instance, KeyUse use, HostValue rootKey, HostValue keyPath,
                   TargetKey* key, bool given = true);

// The key below the root whose display name is `rootName`, opened for a reader.
bool ReachKeyByRootName(RunObjectData* instance, const WCHAR* rootName, const WCHAR* path,
                        TargetKey* key, bool given = true);
