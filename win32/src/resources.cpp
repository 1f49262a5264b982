// Compiled resources of loaded libraries: the .res record reader, resource lookup, and
// LoadStringW over the string-table blocks.
#include "resources.h"

#include "internal.h"

#include <cstring>

namespace {

// Fixed fields after TYPE and NAME: DataVersion, MemoryFlags, LanguageId, Version,
// Characteristics.
constexpr size_t FixedTailSize = 16;
constexpr size_t SmallestHeaderSize = 8 + 4 + 4 + FixedTailSize;
constexpr WORD StringsPerBlock = 16;

// Little-endian fields, read bytewise: an image need not be aligned in memory.
WORD read16(const BYTE* at) { return static_cast<WORD>(at[0] | (at[1] << 8)); }

DWORD read32(const BYTE* at) {
    return static_cast<DWORD>(read16(at)) | (static_cast<DWORD>(read16(at + 2)) << 16);
}

// Bytes that follow `offset` up to the next DWORD boundary.
size_t padToDword(size_t offset) { return (4 - offset % 4) % 4; }

// Reads a TYPE or NAME field at *at (an offset below `end`) and moves *at past it.
bool readId(const BYTE* image, size_t end, size_t* at, w32::ResourceId* id) {
    if (end - *at < 2) return false;
    if (read16(image + *at) == 0xFFFF) {
        if (end - *at < 4) return false;
        *id = {true, read16(image + *at + 2)};
        *at += 4;
        return true;
    }
    // A name given as text: skip it up to and including its terminator.
    for (; end - *at >= 2; *at += 2) {
        if (read16(image + *at) == 0) {
            *at += 2;
            *id = {};
            return true;
        }
    }
    return false;
}

// Whether a TYPE or NAME field is the number `number`.
bool isNumber(const w32::ResourceId& id, WORD number) { return id.isNumber && id.number == number; }

// Whether a record is the empty one that opens every 32-bit image.
bool isLeadingRecord(const w32::ResourceRecord& record) {
    return record.size == 0 && isNumber(record.type, 0) && isNumber(record.name, 0);
}

}  // namespace

namespace w32 {

ResourceReader::ResourceReader(const BYTE* image, size_t size) : image_(image), size_(size) {}

// Marks the image as malformed; returns the failed read's result.
bool ResourceReader::fail() {
    malformed_ = true;
    return false;
}

bool ResourceReader::next(ResourceRecord* record) {
    if (malformed_ || !image_) return false;
    if (!started_) {
        started_ = true;
        ResourceRecord first;
        if (!readRecord(&first) || !isLeadingRecord(first)) return fail();
    }
    if (offset_ == size_) return false;
    return readRecord(record) || fail();
}

// Reads the record at offset_ and moves offset_ to the next one.
bool ResourceReader::readRecord(ResourceRecord* record) {
    size_t left = size_ - offset_;
    if (left < SmallestHeaderSize) return false;
    const BYTE* start = image_ + offset_;
    DWORD dataSize = read32(start);
    DWORD headerSize = read32(start + 4);
    if (headerSize < SmallestHeaderSize || headerSize % 4 != 0 || headerSize > left ||
        dataSize > left - headerSize)
        return false;
    size_t at = 8;
    if (!readId(start, headerSize, &at, &record->type) ||
        !readId(start, headerSize, &at, &record->name))
        return false;
    at += padToDword(at);
    if (at > headerSize || headerSize - at < FixedTailSize) return false;
    record->language = read16(start + at + 6);
    record->data = start + headerSize;
    record->size = dataSize;
    size_t end = offset_ + headerSize + dataSize;
    // The padding after the last record's data may be missing.
    offset_ = padToDword(end) <= size_ - end ? end + padToDword(end) : size_;
    return true;
}

ResourceStatus lookupResource(const BYTE* image, size_t imageSize, WORD type, WORD name,
                              WORD language, const BYTE** data, size_t* size) {
    ResourceReader reader(image, imageSize);
    ResourceRecord record;
    ResourceRecord chosen;
    bool typeSeen = false;
    bool nameSeen = false;
    while (reader.next(&record)) {
        if (!isNumber(record.type, type)) continue;
        typeSeen = true;
        if (!isNumber(record.name, name)) continue;
        // The first record in the wanted language wins, else the first in any language.
        if (!nameSeen || (chosen.language != language && record.language == language))
            chosen = record;
        nameSeen = true;
    }
    // A damaged image could list anything; nothing in it is trusted.
    if (reader.malformed() || !image) return ResourceStatus::NoResources;
    if (!nameSeen) return typeSeen ? ResourceStatus::NameNotFound : ResourceStatus::TypeNotFound;
    *data = chosen.data;
    *size = chosen.size;
    return ResourceStatus::Found;
}

const BYTE* blockString(const BYTE* block, size_t size, unsigned index, WORD* length) {
    size_t at = 0;
    for (unsigned i = 0; size - at >= 2; ++i) {
        WORD count = read16(block + at);
        if ((size - at - 2) / 2 < count) break;  // a damaged block is not read past its end
        if (i == index) {
            *length = count;
            return block + at + 2;
        }
        at += 2 + 2 * static_cast<size_t>(count);
    }
    *length = 0;
    return block + size;
}

bool findResource(HINSTANCE instance, WORD type, WORD name, WORD language, const BYTE** data,
                  size_t* size) {
    const BYTE* image = nullptr;
    size_t imageSize = 0;
    ResourceStatus status = ResourceStatus::NoResources;
    if (resourceImage(instance, &image, &imageSize))
        status = lookupResource(image, imageSize, type, name, language, data, size);
    if (status != ResourceStatus::Found) SetLastError(static_cast<DWORD>(status));
    return status == ResourceStatus::Found;
}

}  // namespace w32

namespace {

// Serves LoadStringW once the block is found: the copy, truncation and special capacities.
int copyString(const BYTE* text, WORD length, LPWSTR buffer, int bufferMax) {
    if (bufferMax == 0) {
        // The caller gets a read-only pointer to the text itself, stored in its buffer.
        const WCHAR* pointer = reinterpret_cast<const WCHAR*>(text);
        std::memcpy(buffer, &pointer, sizeof pointer);
        return length;
    }
    if (bufferMax == 1) return 0;  // no room for any text; the buffer is left as it was
    int copied = length < bufferMax - 1 ? length : bufferMax - 1;
    std::memcpy(buffer, text, static_cast<size_t>(copied) * sizeof(WCHAR));
    buffer[copied] = 0;
    return copied;
}

// LoadStringW without its journal entry.
int loadString(HINSTANCE instance, UINT id, LPWSTR buffer, int bufferMax) {
    if (auto code = w32::takeFault("LoadStringW")) {
        SetLastError(static_cast<DWORD>(*code));
        return 0;
    }
    // A negative capacity describes no buffer at all.
    if (!buffer || bufferMax < 0) return 0;
    // String ids are 16-bit; as on Windows, the high word of `id` is ignored.
    WORD number = LOWORD(id);
    auto blockId = static_cast<WORD>(number / StringsPerBlock + 1);
    const BYTE* block = nullptr;
    size_t blockSize = 0;
    if (!w32::findResource(instance, w32::ResourceTypeString, blockId, w32::LanguageUsEnglish,
                           &block, &blockSize))
        return 0;
    WORD length = 0;
    const BYTE* text = w32::blockString(block, blockSize, number % StringsPerBlock, &length);
    return copyString(text, length, buffer, bufferMax);
}

}  // namespace

int WINAPI LoadStringW(HINSTANCE instance, UINT id, LPWSTR buffer, int bufferMax) {
    int result = loadString(instance, id, buffer, bufferMax);
    w32::record("LoadStringW", {w32::arg(instance), id, w32::arg(buffer), w32::arg(bufferMax)},
                result);
    return result;
}
