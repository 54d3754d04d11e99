// The character-class errors and the thrower of the invalid-character error.
#include "frame/ctype_error.hpp"

#include <boost/exception/exception.hpp>

#include <utility>

namespace foundation::ustring {

CtypeExceptionBase::CtypeExceptionBase(std::string text, std::int32_t kind)
    : text_(std::move(text)), kind_(kind) {}

const char* CtypeExceptionBase::what() const noexcept { return text_.c_str(); }

CtypeInvalidCharacter::CtypeInvalidCharacter()
    : CtypeExceptionBase("Invalid character error.", 3) {}

void detail::throw_ctype_invalid_character_exception() {
    throw boost::exception_detail::clone_impl<CtypeInvalidCharacter>(CtypeInvalidCharacter());
}

}  // namespace foundation::ustring
