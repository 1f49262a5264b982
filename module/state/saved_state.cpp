// Saving and restoring an instance's key selection and last error through a file handle the
// host opened: a 12-byte header, the key's byte length, then the key text with its terminator.
#include <stdlib.h>

#include "../runtime/host_services.h"

namespace {

const DWORD SavedStateVersion = 1;
// The key byte length is 16 bits: 32766 characters and the terminator.
const size_t LongestSavedKey = (0xFFFF - 1) / sizeof(WCHAR) - 1;

// Always written and read as one block of 12 bytes, little-endian.
struct SavedStateHeader {
    DWORD version;
    DWORD rootKeyIndex;
    DWORD lastError;
};
static_assert(sizeof(SavedStateHeader) == 12, "SavedStateHeader is 12 bytes");
static_assert(offsetof(SavedStateHeader, rootKeyIndex) == 4, "root key index at 4");
static_assert(offsetof(SavedStateHeader, lastError) == 8, "last error at 8");

// One synchronous write that must take the whole block: a write that reports success with
// fewer bytes would leave a record that a later load misreads.
bool WriteBlock(HANDLE file, const void* data, DWORD size) {
    DWORD written = 0;
    return WriteFile(file, data, size, &written, nullptr) != FALSE && written >= size;
}

// One synchronous read that must deliver the whole block.
bool ReadBlock(HANDLE file, void* data, DWORD size) {
    DWORD delivered = 0;
    return ReadFile(file, data, size, &delivered, nullptr) != FALSE && delivered >= size;
}

// A stored key text is kept only when it is whole: an even length ending in a zero character.
bool KeyTextIsSound(const WCHAR* text, WORD bytes) {
    return bytes % sizeof(WCHAR) == 0 && text[bytes / sizeof(WCHAR) - 1] == 0;
}

}  // namespace

// A key too long for the 16-bit length is refused before anything is written: a cut key would
// load as another key, and the registry operations would then work on that one.
HV_EXPORT BOOL WINAPI SaveRunObject(RunObjectData* instance, HANDLE file) {
    size_t characters = instance->currentKey ? wcslen(instance->currentKey) : 0;
    if (characters > LongestSavedKey) return 0;
    SavedStateHeader header = {SavedStateVersion, instance->rootKeyIndex, instance->lastError};
    if (!WriteBlock(file, &header, sizeof header)) return 0;
    WORD keyBytes = instance->currentKey ? static_cast<WORD>((characters + 1) * sizeof(WCHAR)) : 0;
    if (!WriteBlock(file, &keyBytes, sizeof keyBytes)) return 0;
    if (keyBytes && !WriteBlock(file, instance->currentKey, keyBytes)) return 0;
    return 1;
}

// Once a valid header is read, its root key index and last error are in force and the old key
// is gone, whatever the rest of the record holds. A key text that is short, of odd length or
// without its final zero is dropped: the instance then has no current key and the result is 0.
HV_EXPORT BOOL WINAPI LoadRunObject(RunObjectData* instance, HANDLE file) {
    SavedStateHeader header;
    if (!ReadBlock(file, &header, sizeof header) || header.version != SavedStateVersion) return 0;
    instance->rootKeyIndex = header.rootKeyIndex;
    instance->lastError = header.lastError;
    if (instance->currentKey) free(instance->currentKey);
    instance->currentKey = nullptr;
    WORD keyBytes = 0;
    if (!ReadBlock(file, &keyBytes, sizeof keyBytes)) return 0;
    if (keyBytes == 0) return 1;
    WCHAR* key = static_cast<WCHAR*>(malloc(keyBytes));
    if (!key) return 0;
    if (!ReadBlock(file, key, keyBytes) || !KeyTextIsSound(key, keyBytes)) {
        free(key);
        return 0;
    }
    instance->currentKey = key;
    return 1;
}
