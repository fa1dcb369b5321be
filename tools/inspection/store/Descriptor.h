// A file descriptor that is closed at its end.
#pragma once

#include <utility>

namespace inspection {

class Descriptor {
public:
    /// -1: none.
    explicit Descriptor(int number = -1) : number_(number) {}
    Descriptor(Descriptor&& other) noexcept : number_(std::exchange(other.number_, -1)) {}
    Descriptor& operator=(Descriptor&& other) noexcept {
        std::swap(number_, other.number_);
        return *this;
    }
    ~Descriptor() { close(); }

    int number() const { return number_; }
    bool isOpen() const { return number_ >= 0; }

    /// Closes it now. Returns 0 or the errno value.
    int close() noexcept;

private:
    int number_;
};

}  // namespace inspection
