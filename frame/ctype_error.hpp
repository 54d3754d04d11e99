// The character-class errors of text handling: a text that holds a code unit
// outside ASCII where only ASCII is understood.
#pragma once

#include <cstdint>
#include <exception>
#include <string>

namespace foundation::ustring {

// A character-class error: its text and its kind.
class CtypeExceptionBase : public std::exception {
public:
    CtypeExceptionBase(std::string text, std::int32_t kind);
    const char* what() const noexcept override;
    std::int32_t kind() const noexcept { return kind_; }

private:
    std::string text_;
    std::int32_t kind_;
};

// "Invalid character error.", kind 3.
class CtypeInvalidCharacter : public CtypeExceptionBase {
public:
    CtypeInvalidCharacter();
};

namespace detail {
// Throws CtypeInvalidCharacter, wrapped so that it can be cloned and rethrown
// like the host's own exceptions.
[[noreturn]] void throw_ctype_invalid_character_exception();
}  // namespace detail

}  // namespace foundation::ustring
