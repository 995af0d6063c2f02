#pragma once

#include <string>

namespace QLX {

/// The standard string with a virtual destructor and trimming: the text type of the panel's
/// screens.
template <typename Char> class String : public std::basic_string<Char> {
  public:
    using std::basic_string<Char>::basic_string;

    String() = default;
    String(const std::basic_string<Char> &text) : std::basic_string<Char>(text) {}
    String(const String &) = default;
    String(String &&) noexcept = default;
    String &operator=(const String &) = default;
    String &operator=(String &&) noexcept = default;
    virtual ~String() = default;

    /// Strips the characters of `set` from the end, in place, and returns a copy of what is left.
    String trimRight(const String &set) {
        while (!this->empty() && set.find(this->back()) != String::npos)
            this->pop_back();
        return *this;
    }

    /// Strips the characters of `set` from the start, in place, and returns a copy of what is left.
    /// Throws `std::out_of_range` when nothing is left: strip such a text from the right first.
    String trimLeft(const String &set) {
        if (this->empty())
            return *this;
        while (set.find(this->at(0)) != String::npos)
            this->erase(0, 1);
        return *this;
    }

    /// Strips the blanks at both ends, in place.
    String &trim() {
        const String blank(1, Char(' '));
        trimRight(blank);
        trimLeft(blank);
        return *this;
    }
};

} // namespace QLX
