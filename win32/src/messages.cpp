// FormatMessageW for system messages: the English texts Windows gives for the codes that the
// registry functions, the module and this layer produce.
#include "internal.h"

#include <algorithm>
#include <string>
#include <string_view>

namespace {

constexpr DWORD sourceFlags =
    FORMAT_MESSAGE_FROM_STRING | FORMAT_MESSAGE_FROM_HMODULE | FORMAT_MESSAGE_FROM_SYSTEM;
constexpr DWORD lineBreaksDropped = FORMAT_MESSAGE_MAX_WIDTH_MASK;
// What Windows reports for a language whose message file is not installed; only English is.
constexpr DWORD errorMuiFileNotFound = 15100;

struct SystemMessage {
    DWORD code;
    const char16_t* text;  // as Windows prints it, without the CR LF every message ends with
};

// Texts of Windows 7 (code 8 was reworded in later versions).
constexpr SystemMessage systemMessages[] = {
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
    {317, u"The system cannot find message text for message number 0x%1 in the message file for "
          u"%2."},
    {998, u"Invalid access to memory location."},
    {1009, u"The configuration registry database is corrupt."},
    {1010, u"The configuration registry key is invalid."},
    {1011, u"The configuration registry key could not be opened."},
    {1012, u"The configuration registry key could not be read."},
    {1013, u"The configuration registry key could not be written."},
    {1014, u"One of the files in the registry database had to be recovered by use of a log or "
           u"alternate copy. The recovery was successful."},
    {1015, u"The registry is corrupted. The structure of one of the files containing registry "
           u"data is corrupted, or the system's memory image of the file is corrupted, or the "
           u"file could not be recovered because the alternate copy or log was absent or "
           u"corrupted."},
    {1016, u"An I/O operation initiated by the registry failed unrecoverably. The registry "
           u"could not read in, or write out, or flush, one of the files that contain the "
           u"system's image of the registry."},
    {1017, u"The system has attempted to load or restore a file into the registry, but the "
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
    {errorMuiFileNotFound, u"The resource loader failed to find MUI file."},
};

const char16_t* systemText(DWORD code) {
    // HRESULTs of the Win32 facility carry a system code in their low word.
    if ((code & 0xFFFF0000) == 0x80070000) code &= 0xFFFF;
    for (const SystemMessage& message : systemMessages)
        if (message.code == code) return message.text;
    return nullptr;
}

// Language 0 lets the system choose; the user and system defaults are English here too.
bool isEnglish(DWORD language) {
    return language == 0 || language == 0x0409 || language == 0x0400 || language == 0x0800;
}

bool hasInserts(const char16_t* text) {
    for (; *text; ++text)
        if (*text == u'%') return true;
    return false;
}

// The message as stored, ending in CR LF. A maximum width turns that line break into a space
// and breaks the lines at spaces so that none is longer than the width; 0xFF sets no width.
std::u16string messageText(const char16_t* text, DWORD flags) {
    DWORD width = flags & FORMAT_MESSAGE_MAX_WIDTH_MASK;
    if (width == 0) return std::u16string(text) + u"\r\n";
    std::u16string out;
    size_t line = 0;  // characters on the output line so far
    for (std::u16string_view rest = text; !rest.empty();) {
        std::u16string_view word = rest.substr(0, rest.find(u' '));
        rest.remove_prefix(std::min(rest.size(), word.size() + 1));
        bool wrap = line > 0 && width != lineBreaksDropped && line + 1 + word.size() > width;
        out += line == 0 ? u"" : wrap ? u"\r\n" : u" ";
        line = (wrap ? 0 : line + (line > 0)) + word.size();
        out += word;
    }
    return out + u" ";
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
    // Only system messages are served; an allocated buffer would need LocalFree, which the
    // layer does not offer.
    if ((flags & sourceFlags) != FORMAT_MESSAGE_FROM_SYSTEM ||
        (flags & FORMAT_MESSAGE_ALLOCATE_BUFFER) || !buffer)
        return failWith(ERROR_INVALID_PARAMETER);
    if (!isEnglish(languageId)) return failWith(errorMuiFileNotFound);
    const char16_t* text = systemText(messageId);
    if (!text) return failWith(ERROR_MR_MID_NOT_FOUND);
    // Inserts are only passed through; filling them in from arguments is not supported.
    if (!(flags & FORMAT_MESSAGE_IGNORE_INSERTS) && hasInserts(text))
        return failWith(ERROR_INVALID_PARAMETER);
    return store(messageText(text, flags), buffer, size);
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
