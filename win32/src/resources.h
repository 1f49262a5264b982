// Access to the compiled resources of a library loaded through LoadLibraryW.
//
// A library's resources are the .res image the resource compiler wrote: a sequence of records,
// each a header (DataSize, HeaderSize, TYPE, NAME, DataVersion, MemoryFlags, LanguageId,
// Version, Characteristics) followed by its data, both padded to a DWORD; the first record is
// the empty one that marks a 32-bit image. The reader here never reads outside the image, and
// treats an image with any malformed record as one without resources.
#pragma once

#include "byte_cursor.h"

namespace w32 {

// Standard resource types the layer looks up by number.
constexpr WORD ResourceTypeMenu = 4;
constexpr WORD ResourceTypeDialog = 5;
constexpr WORD ResourceTypeString = 6;
// U.S. English, the language of every resource the module ships.
constexpr WORD LanguageUsEnglish = 0x0409;

// The .res image embedded in `instance`, as the resource compiler wrote it; false if it has none.
bool resourceImage(HINSTANCE instance, const BYTE** data, size_t* size);

// One resource of an image; `data` points into the image.
struct ResourceRecord {
    TemplateId type;  // a text matches no numeric lookup
    TemplateId name;
    WORD language = 0;
    const BYTE* data = nullptr;
    size_t size = 0;
};

// Walks the records of an image in file order, after the leading empty record.
class W32_INTERNAL ResourceReader {
public:
    ResourceReader(const BYTE* image, size_t size);
    // Reads the next record; false at the end of the image or at the first malformed record.
    bool next(ResourceRecord* record);
    // True once a malformed record (or a missing leading empty record) has been met.
    bool malformed() const { return malformed_; }

private:
    bool fail();
    bool readRecord(ResourceRecord* record);
    const BYTE* image_;
    size_t size_;
    size_t offset_ = 0;
    bool started_ = false;
    bool malformed_ = false;
};

// Outcome of a lookup: 0 when found, otherwise the error code FindResourceW reports.
enum class ResourceStatus : DWORD {
    Found = 0,
    NoResources = 1812,   // ERROR_RESOURCE_DATA_NOT_FOUND: no image, or a malformed one
    TypeNotFound = 1813,  // ERROR_RESOURCE_TYPE_NOT_FOUND
    NameNotFound = 1814,  // ERROR_RESOURCE_NAME_NOT_FOUND
};

// Finds resource type/name in an image, in `language` if it has one, else in any language.
W32_INTERNAL ResourceStatus lookupResource(const BYTE* image, size_t imageSize, WORD type,
                                           WORD name, WORD language, const BYTE** data,
                                           size_t* size);

// String `index` (0-15) of a string-table block: its text, not terminated, and its length.
// Entries that would run past the block's end count as absent (length 0).
W32_INTERNAL const BYTE* blockString(const BYTE* block, size_t size, unsigned index, WORD* length);

// Finds a numbered resource of a loaded library as FindResourceW would; on failure sets the last
// error to the reason (1812, 1813 or 1814) and returns false.
W32_INTERNAL bool findResource(HINSTANCE instance, WORD type, WORD name, WORD language,
                               const BYTE** data, size_t* size);

}  // namespace w32
