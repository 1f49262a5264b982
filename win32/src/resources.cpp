// Compiled resources of loaded libraries: the .res record reader, resource lookup, and
// LoadStringW over the string-table blocks.
#include "resources.h"

#include "internal.h"

#include <cstring>

namespace {

// DataSize and HeaderSize, the smallest TYPE and NAME, then DataVersion, MemoryFlags,
// LanguageId, Version and Characteristics.
constexpr size_t SmallestHeaderSize = 8 + 4 + 4 + 16;
constexpr WORD StringsPerBlock = 16;

// Bytes that follow `offset` up to the next DWORD boundary.
size_t padToDword(size_t offset) { return (4 - offset % 4) % 4; }

// Whether a TYPE or NAME field is the number `number`.
bool isNumber(const w32::TemplateId& id, WORD number) {
    return id.isOrdinal && id.ordinal == number;
}

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
    const BYTE* start = image_ + offset_;
    Cursor c(start, left);
    DWORD dataSize = 0, headerSize = 0;
    if (left < SmallestHeaderSize || !c.dword(&dataSize) || !c.dword(&headerSize)) return false;
    if (headerSize < SmallestHeaderSize || headerSize % 4 != 0 || headerSize > left ||
        dataSize > left - headerSize)
        return false;
    Cursor header(start, headerSize);
    if (!header.skip(8) || !header.id(&record->type) || !header.id(&record->name)) return false;
    header.alignToDword();
    // DataVersion and MemoryFlags come before the language, Version and Characteristics after.
    if (!header.skip(6) || !header.word(&record->language) || !header.skip(8)) return false;
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
    Cursor c(block, size);
    WORD count = 0;
    for (unsigned i = 0; c.word(&count); ++i) {
        if ((size - c.at()) / 2 < count) break;  // a damaged block is not read past its end
        if (i == index) {
            *length = count;
            return block + c.at();
        }
        c.skip(2 * static_cast<size_t>(count));
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

// Serves LoadStringW once the block is found: the copy and its truncation.
int copyString(const BYTE* text, WORD length, LPWSTR buffer, int bufferMax) {
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
    // Callers lend a buffer of at least two characters. A capacity of 1 has no room for any
    // text and leaves the buffer as it was; 0 would ask for a pointer to the resource itself,
    // which no caller wants, and a negative one describes no buffer at all.
    if (!buffer || bufferMax < 2) return 0;
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
