// Byte offsets of the host's structures, as the host lays them out for a module built with
// pointers of a given size. The 32-bit values are the shipped contract; the 64-bit ones follow
// from the same rule: pointers and pointer-sized values grow to 8 bytes and align to 8, every
// other field keeps its size.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace hv {

struct HostLayout {
    size_t pointerSize;

    // ObjectHeader, the host's part of the instance record.
    size_t runHeader;
    size_t headerFlags;
    size_t headerSize;
    // The module's fields after the header, and the record size GetRunObjectDataSize reports.
    size_t rootKeyIndex, currentKey, lastError, use64BitView, recordSize;

    // Run header services.
    size_t getStringBuffer, getFirstExpressionParameter, getNextExpressionParameter;
    size_t getNextParameter, runHeaderSize;

    // Editor structure.
    size_t editorWindow, getHostVersion, insertProperties, editorSize;

    // RunObjectInfos: the tables and their counts, the host's own byte, the identifier.
    size_t infoConditions, infoActions, infoExpressions;
    size_t infoConditionCount, infoActionCount, infoExpressionCount;
    size_t infoHostByte, infoIdentifier, infoSize;

    // RootKeyParam: the same on every build.
    size_t rootParamIndex, rootParamSize;
};

constexpr size_t alignUp(size_t offset, size_t alignment) {
    return (offset + alignment - 1) / alignment * alignment;
}

// The layout for a module whose pointers are `p` bytes (4 or 8).
constexpr HostLayout layoutFor(size_t p) {
    HostLayout l{};
    l.pointerSize = p;
    l.runHeader = 8;
    l.headerFlags = 124;
    l.headerSize = 184;
    l.rootKeyIndex = l.headerSize;
    l.currentKey = alignUp(l.rootKeyIndex + 4, p);
    l.lastError = l.currentKey + p;
    l.use64BitView = l.lastError + 4;
    l.recordSize = alignUp(l.use64BitView + 4, p);

    l.getStringBuffer = 872;
    l.getFirstExpressionParameter = l.getStringBuffer + p;
    l.getNextExpressionParameter = l.getFirstExpressionParameter + p;
    l.getNextParameter = 928;
    l.runHeaderSize = l.getNextParameter + p;

    l.editorWindow = alignUp(20, p);
    l.getHostVersion = 336;
    l.insertProperties = l.getHostVersion + p;
    l.editorSize = l.insertProperties + p;

    l.infoConditions = 0;
    l.infoActions = p;
    l.infoExpressions = 2 * p;
    l.infoConditionCount = 3 * p;
    l.infoActionCount = l.infoConditionCount + 2;
    l.infoExpressionCount = l.infoConditionCount + 4;
    l.infoHostByte = l.infoConditionCount + 13;
    l.infoIdentifier = l.infoConditionCount + 16;
    l.infoSize = l.infoConditionCount + 22;

    l.rootParamIndex = 6;
    l.rootParamSize = 16;
    return l;
}

// The layout of this build.
constexpr HostLayout BuildLayout = layoutFor(sizeof(void*));

// Reads and writes of host fields at byte offsets; memcpy, since many are not aligned.
template <typename T>
T readAt(const uint8_t* base, size_t offset) {
    T value;
    std::memcpy(&value, base + offset, sizeof value);
    return value;
}

template <typename T>
void writeAt(uint8_t* base, size_t offset, T value) {
    std::memcpy(base + offset, &value, sizeof value);
}

}  // namespace hv
