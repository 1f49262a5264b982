// The editor structure handed to the module's edit-time entry points, with its two services,
// and the editor's side of the root-key parameter entry points.
#include <hivelet/param_editor.h>

#include "internal.h"

namespace hv {

namespace {

// GetHostVersion takes no arguments, so it answers for the editor in use.
Editor* activeEditor = nullptr;

typedef void(WINAPI* InitParameterFn)(void* editor, Slot unused, void* record);
typedef Slot(WINAPI* EditParameterFn)(void* editor, Slot unused, void* record);
typedef void(WINAPI* GetParameterStringFn)(void* editor, Slot unused, const void* record,
                                           LPWSTR buffer, Slot capacity);

// The dialog's list of root keys.
const int RootKeyList = 1001;

const char16_t BufferFill = static_cast<char16_t>(Fill::Buffer << 8 | Fill::Buffer);

}  // namespace

struct EditorServices {
    static DWORD WINAPI getHostVersion() {
        if (!activeEditor) return 0;
        ++activeEditor->hostVersionCalls_;
        return activeEditor->version_;
    }

    static void WINAPI insertProperties(Slot hostValue, int one, const void* properties, int one2,
                                        int one3) {
        if (activeEditor)
            activeEditor->inserts_.push_back(
                Editor::Insert{hostValue, one, one2, one3, properties});
    }
};

Editor::Editor()
    : bytes_(alignUp(BuildLayout.editorSize, 16) + Fill::GuardSize, Fill::EditorStructure) {
    setHostVersion(version_, true);
    writeAt(bytes_.data(), BuildLayout.insertProperties, &EditorServices::insertProperties);
    setWindow(nullptr);
    activeEditor = this;
}

Editor::~Editor() {
    if (activeEditor == this) activeEditor = nullptr;
}

void Editor::setHostVersion(uint32_t version, bool present) {
    version_ = version;
    auto service = present ? &EditorServices::getHostVersion : nullptr;
    writeAt(bytes_.data(), BuildLayout.getHostVersion, service);
}

void* Editor::structure() {
    activeEditor = this;
    return bytes_.data();
}

void Editor::setWindow(HWND window) { writeAt(bytes_.data(), BuildLayout.editorWindow, window); }

ParamEditor::ParamEditor(Module& module, Editor& editor)
    : module_(module),
      editor_(editor),
      bytes_(BuildLayout.rootParamSize + Fill::GuardSize, Fill::Guard) {
    setRecord(0);
}

std::vector<uint8_t> ParamEditor::recordBytes() const {
    return std::vector<uint8_t>(bytes_.begin(), bytes_.begin() + BuildLayout.rootParamSize);
}

uint32_t ParamEditor::rootIndex() const {
    return readAt<uint32_t>(bytes_.data(), BuildLayout.rootParamIndex);
}

void ParamEditor::fillRecord(uint8_t byte) {
    std::fill(bytes_.begin(), bytes_.begin() + BuildLayout.rootParamSize, byte);
}

void ParamEditor::setRecord(uint32_t index) {
    std::vector<uint8_t> fresh = rootKeyRecord(index);
    std::copy(fresh.begin(), fresh.end(), bytes_.begin());
}

bool ParamEditor::recordIntact() const {
    return firstNotPattern(bytes_.data() + BuildLayout.rootParamSize, Fill::Guard,
                           Fill::GuardSize) < 0;
}

void ParamEditor::init() {
    module_.entry<InitParameterFn>("InitParameter")(editor_.structure(), 0, record());
}

Slot ParamEditor::edit(const std::vector<UserStep>& steps, DialogSeen* seen) {
    auto edit = module_.entry<EditParameterFn>("EditParameter");
    DialogSeen ignored;
    return withUser(steps, RootKeyList, seen ? *seen : ignored,
                    [&] { return edit(editor_.structure(), 0, record()); });
}

ParamEditor::Text ParamEditor::string(Slot capacity) {
    auto count = static_cast<int16_t>(static_cast<uint16_t>(capacity));
    size_t room = count > 0 ? static_cast<size_t>(count) : 0;
    std::vector<char16_t> buffer(room + Fill::GuardSize, BufferFill);
    module_.entry<GetParameterStringFn>("GetParameterString")(
        editor_.structure(), 0, record(), reinterpret_cast<LPWSTR>(buffer.data()), capacity);
    Text out;
    out.written.assign(buffer.begin(), buffer.begin() + static_cast<long>(room));
    for (size_t i = 0; i < buffer.size(); ++i) {
        if (buffer[i] == BufferFill) continue;
        out.untouched = false;
        if (i >= room) out.intact = false;
    }
    size_t end = 0;
    while (end < room && buffer[end]) ++end;
    out.text.assign(buffer.begin(), buffer.begin() + static_cast<long>(end));
    return out;
}

}  // namespace hv
