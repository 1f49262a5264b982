// The editor structure handed to the module's edit-time entry points, with its two services.
#include "internal.h"

namespace hv {

namespace {

// GetHostVersion takes no arguments, so it answers for the editor in use.
Editor* activeEditor = nullptr;

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

void Editor::setWindow(HWND window) {
    writeAt(bytes_.data(), BuildLayout.editorWindow, window);
}

}  // namespace hv
