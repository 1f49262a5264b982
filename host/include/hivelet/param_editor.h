// The root-key parameter as the editor handles it: a 16-byte RootKeyParam record in its event
// data, initialised, edited in the module's dialog and shown by name through the module's
// InitParameter, EditParameter and GetParameterString.
#pragma once

#include <hivelet/dialog_user.h>
#include <hivelet/host.h>

#include <cstdint>
#include <string>
#include <vector>

namespace hv {

class ParamEditor {
public:
    // `editor` is the editor structure passed to the entry points; its window owns the dialog.
    ParamEditor(Module& module, Editor& editor);

    // The record's 16 bytes, then Fill::GuardSize sentinel bytes.
    uint8_t* record() { return bytes_.data(); }
    std::vector<uint8_t> recordBytes() const;
    uint32_t rootIndex() const;
    void fillRecord(uint8_t byte);
    void setRecord(uint32_t rootIndex);  // as rootKeyRecord(rootIndex)
    // Nothing was written past the record's 16 bytes.
    bool recordIntact() const;

    void init();
    // EditParameter with a scripted user performing `steps`; returns its result.
    Slot edit(const std::vector<UserStep>& steps, DialogSeen* seen = nullptr);

    // GetParameterString with this capacity (passed as is: the module looks at its low 16
    // bits) into a buffer of that many characters, if positive, followed by sentinels.
    struct Text {
        std::u16string text;            // up to the first zero within the capacity, or all of it
        std::vector<char16_t> written;  // the whole capacity as the module left it
        bool intact = true;             // no sentinel after the capacity changed
        bool untouched = true;          // not one character changed
    };
    Text string(Slot capacity);

private:
    Module& module_;
    Editor& editor_;
    std::vector<uint8_t> bytes_;
};

}  // namespace hv
