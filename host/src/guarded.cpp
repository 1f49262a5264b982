// Guarded host memory.
#include "guarded.h"

#include "internal.h"

namespace hv {

Guarded::Guarded(std::string name, size_t size, uint8_t content, size_t guard)
    : name_(std::move(name)), size_(size), guard_(guard), bytes_(size + 2 * guard, Fill::Guard) {
    std::memset(data(), content, size_);
}

bool Guarded::contains(const void* address) const {
    auto* p = static_cast<const uint8_t*>(address);
    return p >= data() && p < data() + size_;
}

void Guarded::retire(const std::string& owner) {
    if (name_.compare(0, owner.size(), owner) != 0) name_ = owner + name_;
    seal();
}

// Names a byte of the whole area by its position relative to the block.
std::string Guarded::where(long index) const {
    long offset = index - static_cast<long>(guard_);
    if (offset < 0) return "byte " + std::to_string(-offset) + " before its start was written";
    if (static_cast<size_t>(offset) >= size_)
        return "byte " + std::to_string(offset) + ", past its " + std::to_string(size_) +
               " bytes, was written";
    return "byte " + std::to_string(offset) + " was written";
}

// Sealed blocks compare every byte; lent ones only their guards.
std::string Guarded::damage() const {
    long index = -1;
    if (!sealed_.empty()) {
        index = firstDifference(bytes_.data(), sealed_.data(), bytes_.size());
    } else if ((index = firstNotPattern(bytes_.data(), Fill::Guard, guard_)) < 0) {
        long after = firstNotPattern(data() + size_, Fill::Guard, guard_);
        if (after >= 0) index = static_cast<long>(guard_ + size_) + after;
    }
    return index < 0 ? std::string() : name_ + ": " + where(index);
}

}  // namespace hv
