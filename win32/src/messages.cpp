// FormatMessageW for system messages: the English texts Windows gives for the codes that the
// registry functions, the module and this layer produce.
#include "internal.h"

#include <string>

namespace {

// The one way the module and the host call it: a system message, inserts left as they are, in
// the default language, into the caller's buffer.
constexpr DWORD ServedFlags = FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS;

struct SystemMessage {
    DWORD code;
    const char16_t* text;  // as Windows prints it, without the CR LF every message ends with
};

// Texts of Windows 7 (code 8 was reworded in later versions).
constexpr SystemMessage SystemMessages[] = {
    {0, u"The operation completed successfully."},
    {2, u"The system cannot find the file specified."},
    {3, u"The system cannot find the path specified."},
    {5, u"Access is denied."},
    {6, u"The handle is invalid."},
    {8, u"Not enough storage is available to process this command."},
    {14, u"Not enough storage is available to complete this operation."},
    {87, u"The parameter is incorrect."},
    {120, u"This function is not supported on this system."},
    {122, u"The data area passed to a system call is too small."},
    {126, u"The specified module could not be found."},
    {127, u"The specified procedure could not be found."},
    {161, u"The specified path is invalid."},
    {234, u"More data is available."},
    {259, u"No more data is available."},
    {317,
     u"The system cannot find message text for message number 0x%1 in the message file for "
     u"%2."},
    {998, u"Invalid access to memory location."},
    {1009, u"The configuration registry database is corrupt."},
    {1010, u"The configuration registry key is invalid."},
    {1011, u"The configuration registry key could not be opened."},
    {1012, u"The configuration registry key could not be read."},
    {1013, u"The configuration registry key could not be written."},
    {1014,
     u"One of the files in the registry database had to be recovered by use of a log or "
     u"alternate copy. The recovery was successful."},
    {1015,
     u"The registry is corrupted. The structure of one of the files containing registry "
     u"data is corrupted, or the system's memory image of the file is corrupted, or the "
     u"file could not be recovered because the alternate copy or log was absent or "
     u"corrupted."},
    {1016,
     u"An I/O operation initiated by the registry failed unrecoverably. The registry "
     u"could not read in, or write out, or flush, one of the files that contain the "
     u"system's image of the registry."},
    {1017,
     u"The system has attempted to load or restore a file into the registry, but the "
     u"specified file is not in a registry file format."},
    {1018, u"Illegal operation attempted on a registry key that has been marked for deletion."},
    {1019, u"System could not allocate the required space in a registry log."},
    {1020, u"Cannot create a symbolic link in a registry key that already has subkeys or values."},
    {1021, u"Cannot create a stable subkey under a volatile parent key."},
    {1114, u"A dynamic link library (DLL) initialization routine failed."},
    {1400, u"Invalid window handle."},
    {1812, u"The specified image file did not contain a resource section."},
    {1813, u"The specified resource type cannot be found in the image file."},
    {1814, u"The specified resource name cannot be found in the image file."},
    {1815, u"The specified resource language ID cannot be found in the image file."},
};

const char16_t* systemText(DWORD code) {
    // HRESULTs of the Win32 facility carry a system code in their low word.
    if ((code & 0xFFFF0000) == 0x80070000) code &= 0xFFFF;
    for (const SystemMessage& message : SystemMessages)
        if (message.code == code) return message.text;
    return nullptr;
}

// Fails the call with `code`; returns FormatMessageW's failure result.
DWORD failWith(DWORD code) {
    SetLastError(code);
    return 0;
}

// Copies the message into the caller's buffer; a short buffer gets a truncated, terminated copy
// and the call still fails, as on Windows.
DWORD store(const std::u16string& text, LPWSTR buffer, DWORD size) {
    if (size == 0) return failWith(ERROR_INSUFFICIENT_BUFFER);
    size_t copied = text.size() < size ? text.size() : size - 1;
    text.copy(buffer, copied);
    buffer[copied] = 0;
    if (copied < text.size()) return failWith(ERROR_INSUFFICIENT_BUFFER);
    return static_cast<DWORD>(copied);
}

DWORD formatMessage(DWORD flags, DWORD messageId, DWORD languageId, LPWSTR buffer, DWORD size) {
    if (auto code = w32::takeFault("FormatMessageW")) return failWith(static_cast<DWORD>(*code));
    if (flags != ServedFlags || languageId != 0 || !buffer)
        return failWith(ERROR_INVALID_PARAMETER);
    const char16_t* text = systemText(messageId);
    if (!text) return failWith(ERROR_MR_MID_NOT_FOUND);
    // Every message ends in CR LF.
    return store(std::u16string(text) + u"\r\n", buffer, size);
}

}  // namespace

DWORD WINAPI FormatMessageW(DWORD flags, LPCVOID source, DWORD messageId, DWORD languageId,
                            LPWSTR buffer, DWORD size, void* arguments) {
    DWORD result = formatMessage(flags, messageId, languageId, buffer, size);
    w32::record("FormatMessageW",
                {flags, w32::arg(source), messageId, languageId, w32::arg(buffer), size,
                 w32::arg(arguments)},
                result);
    return result;
}
