#pragma once

#include <string>

namespace QLX {

/// The standard string with a virtual destructor: the text type of the panel's screens.
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
};

} // namespace QLX
