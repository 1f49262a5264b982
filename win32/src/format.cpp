// wsprintfW of user32 for the one field the module's formats hold, %s (its argument a UTF-16
// text; "(null)" for a null address), with Windows' output limit of 1024 characters including
// the terminator. Any other character after a '%' stands for itself, as Windows treats an
// unknown type ("%%" gives "%").
#include "internal.h"

#include <stdarg.h>

#include <string>

namespace {

const size_t OutputLimit = 1024;  // characters, terminator included

}  // namespace

int wsprintfW(LPWSTR buffer, LPCWSTR form, ...) {
    va_list args;
    va_start(args, form);
    std::u16string out;
    for (const WCHAR* p = form; p && *p && out.size() < OutputLimit; ++p) {
        if (*p != u'%') {
            out += *p;
        } else if (*++p == u's') {
            const WCHAR* text = va_arg(args, const WCHAR*);
            out += text ? text : u"(null)";
        } else if (*p) {
            out += *p;
        } else {
            break;  // a '%' that ends the format is dropped
        }
    }
    va_end(args);
    size_t kept = out.size() < OutputLimit - 1 ? out.size() : OutputLimit - 1;
    out.copy(buffer, kept);
    buffer[kept] = 0;
    // Wine reports 1024 for an output that reached the limit, although 1023 were written.
    auto result = static_cast<int>(out.size() >= OutputLimit - 1 ? OutputLimit : kept);
    w32::record("wsprintfW", {w32::arg(buffer), w32::arg(form)}, result);
    return result;
}
