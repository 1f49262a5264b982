// A stand-in module whose routines misuse the host on purpose, one fault per routine, so that
// the tests can prove the host simulator notices each kind of damage and misuse. It lays out
// the host's records by hand, as the real module's sources must not be shared with the host.
#include <windows.h>

#include <stdint.h>
#include <string.h>

#ifdef _WIN32
#define FAKE_EXPORT extern "C" __declspec(dllexport)
#else
#define FAKE_EXPORT extern "C" __attribute__((visibility("default")))
#endif

namespace {

typedef intptr_t Slot;
const size_t P = sizeof(void*);
const size_t RecordSize = P == 4 ? 200 : 208;

typedef void*(WINAPI* BufferService)(void*, int, int);
typedef Slot(WINAPI* ExpressionService)(void*, int, Slot);
typedef Slot(WINAPI* NextService)(void*, int, int);

uint8_t* runHeader(void* record) {
    uint8_t* header;
    memcpy(&header, static_cast<uint8_t*>(record) + 8, P);
    return header;
}

template <typename F>
F service(void* record, size_t offset) {
    F f;
    memcpy(&f, runHeader(record) + offset, P);
    return f;
}

void* borrow(void* record, int bytes) {
    return service<BufferService>(record, 872)(record, 0, bytes);
}

Slot first(void* record, int one, Slot host) {
    return service<ExpressionService>(record, 872 + P)(record, one, host);
}

Slot next(void* record, Slot host) {
    return service<ExpressionService>(record, 872 + 2 * P)(record, 1, host);
}

Slot nextParameter(void* record, int allBits) {
    return service<NextService>(record, 928)(record, allBits, 0);
}

Slot textResult(void* record, const void* text) {
    uint8_t* flags = static_cast<uint8_t*>(record) + 124;
    flags[1] |= 0x80;
    return reinterpret_cast<Slot>(text);
}

// Conditions.
LONG WINAPI ReturnFirst(void*, Slot a, Slot) { return static_cast<LONG>(a); }
LONG WINAPI ReturnSecond(void*, Slot, Slot b) { return static_cast<LONG>(b); }
// Fetches as many parameters as its first argument says, and answers the last one.
LONG WINAPI FetchCount(void* record, Slot count, Slot) {
    Slot last = 0;
    for (Slot i = 0; i < count; ++i) last = nextParameter(record, -1);
    return static_cast<LONG>(last);
}
LONG WINAPI FlagFromCondition(void* record, Slot, Slot) {
    return textResult(record, nullptr) ? 1 : 0;
}

// Actions.
short WINAPI WriteRootParam(void*, Slot param, Slot) {
    reinterpret_cast<uint8_t*>(param)[2] = 0;
    return 0;
}
short WINAPI WriteRecordTail(void* record, Slot, Slot) {
    static_cast<uint8_t*>(record)[RecordSize] = 0;
    return 0;
}
short WINAPI ClearHeaderFlag(void* record, Slot, Slot) {
    static_cast<uint8_t*>(record)[124] &= ~0x04;
    return 0;
}
short WINAPI WriteHeader(void* record, Slot, Slot) {
    static_cast<uint8_t*>(record)[40] ^= 1;
    return 0;
}
short WINAPI WrongConstant(void* record, Slot, Slot) {
    nextParameter(record, 0);
    return 0;
}
short WINAPI ForeignRecord(void* record, Slot, Slot) {
    static uint8_t stranger[256];
    service<NextService>(record, 928)(stranger, -1, 0);
    return 0;
}
short WINAPI WriteTextParam(void*, Slot text, Slot) {
    reinterpret_cast<uint8_t*>(text)[0] ^= 1;
    return 0;
}
short WINAPI ReturnMinusTwo(void*, Slot, Slot) { return -2; }

// Expressions.
Slot WINAPI OverrunBuffer(void* record, Slot) {
    auto* buffer = static_cast<uint8_t*>(borrow(record, 8));
    memset(buffer, 0, 10);
    return textResult(record, buffer);
}
Slot WINAPI Unterminated(void* record, Slot) {
    auto* buffer = static_cast<char16_t*>(borrow(record, 8));
    for (int i = 0; i < 4; ++i) buffer[i] = u'x';
    return textResult(record, buffer);
}
// Answers its first argument, a text, after fetching the second.
Slot WINAPI EchoFirst(void* record, Slot host) {
    Slot text = first(record, 1, host);
    next(record, host);
    return textResult(record, reinterpret_cast<const void*>(text));
}
Slot WINAPI OverFetch(void* record, Slot host) {
    first(record, 1, host);
    next(record, host);
    return 0;
}
Slot WINAPI WrongHostValue(void* record, Slot host) { return first(record, 1, host + 1); }
Slot WINAPI ReturnHostValue(void*, Slot host) { return host; }
Slot WINAPI NullText(void* record, Slot) { return textResult(record, nullptr); }
Slot WINAPI UnderrunBuffer(void* record, Slot) {
    auto* buffer = static_cast<uint8_t*>(borrow(record, 4));
    buffer[-1] = 0;
    buffer[0] = buffer[1] = 0;
    return textResult(record, buffer);
}

const void* const Conditions[] = {reinterpret_cast<const void*>(ReturnFirst),
                                  reinterpret_cast<const void*>(ReturnSecond),
                                  reinterpret_cast<const void*>(FetchCount),
                                  reinterpret_cast<const void*>(FlagFromCondition), nullptr};
const void* const Actions[] = {reinterpret_cast<const void*>(WriteRootParam),
                               reinterpret_cast<const void*>(WriteRecordTail),
                               reinterpret_cast<const void*>(ClearHeaderFlag),
                               reinterpret_cast<const void*>(WriteHeader),
                               reinterpret_cast<const void*>(WrongConstant),
                               reinterpret_cast<const void*>(ForeignRecord),
                               reinterpret_cast<const void*>(WriteTextParam),
                               reinterpret_cast<const void*>(ReturnMinusTwo),
                               nullptr};
const void* const Expressions[] = {reinterpret_cast<const void*>(OverrunBuffer),
                                   reinterpret_cast<const void*>(Unterminated),
                                   reinterpret_cast<const void*>(EchoFirst),
                                   reinterpret_cast<const void*>(OverFetch),
                                   reinterpret_cast<const void*>(WrongHostValue),
                                   reinterpret_cast<const void*>(ReturnHostValue),
                                   reinterpret_cast<const void*>(NullText),
                                   reinterpret_cast<const void*>(UnderrunBuffer),
                                   nullptr};

}  // namespace

FAKE_EXPORT short WINAPI GetRunObjectDataSize(Slot, Slot) { return RecordSize; }

FAKE_EXPORT short WINAPI CreateRunObject(void* record, Slot, Slot) {
    memset(static_cast<uint8_t*>(record) + 184, 0, RecordSize - 184);
    return 0;
}

FAKE_EXPORT short WINAPI DestroyRunObject(void*, Slot) { return 0; }

// The variant without GetRunObjectInfos offers its tables under a name the host never asks for.
#ifdef FAKE_WITHOUT_INFOS
#define FAKE_INFOS_ENTRY GetRoutineTables
#else
#define FAKE_INFOS_ENTRY GetRunObjectInfos
#endif

// Writes the three tables and their counts; the other fields do not matter here.
FAKE_EXPORT short WINAPI FAKE_INFOS_ENTRY(Slot, uint8_t* infos) {
    const void* tables[] = {Conditions, Actions, Expressions};
    memcpy(infos, tables, 3 * P);
    uint16_t counts[] = {4, 8, 8};
    memcpy(infos + 3 * P, counts, sizeof counts);
    return 1;
}
