// Feeds arbitrary bytes to the event-script parser: every input parses or is refused with a
// "file:line: message" error, never a crash.
#include <hivelet/script.h>

#include <stddef.h>
#include <stdint.h>

#include <string>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    std::string text(reinterpret_cast<const char*>(data), size);
    hv::script::ParseResult result = hv::script::parse("fuzz.hvs", text);
    if (!result.ok() && result.error.rfind("fuzz.hvs:", 0) != 0) __builtin_trap();
    for (const hv::script::Step& step : result.script.steps)
        if (const auto* event = std::get_if<hv::script::Event>(&step.command))
            for (const hv::script::Argument& argument : event->arguments)
                (void)hv::script::quote(argument.value.text);
    return 0;
}
