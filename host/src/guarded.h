// Host memory that the module may touch only in agreed ways: a block with guard bytes on both
// sides, either lent for writing (only the guards are checked) or sealed (no byte may change).
#pragma once

#include <hivelet/host.h>

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace hv {

class Guarded {
public:
    // `guard` bytes of Fill::Guard before and after the block.
    Guarded(std::string name, size_t size, uint8_t content, size_t guard = Fill::GuardSize);
    uint8_t* data() { return bytes_.data() + guard_; }
    const uint8_t* data() const { return bytes_.data() + guard_; }
    size_t size() const { return size_; }
    bool contains(const void* address) const;
    // From now on every byte, the block's own included, must stay as it is.
    void seal() { sealed_ = bytes_; }
    // After its event: the block is the host's again, as the module left it, and damage
    // already reported is not reported twice.
    void retire(const std::string& owner);
    // What the module wrote where it must not, or "" when nothing.
    std::string damage() const;

private:
    std::string where(long index) const;
    std::string name_;
    size_t size_;
    size_t guard_;
    std::vector<uint8_t> bytes_;
    std::vector<uint8_t> sealed_;
};

}  // namespace hv
