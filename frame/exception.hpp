// The exception that carries a message identifier, one instantiation per tag,
// and the routine through which the library raises every identified error.
#pragma once

#include "host/exceptions.hpp"

#include <exception>
#include <string>

namespace foundation::core::except {

template <class Tag, class StdBase, class Reserved>
class Exception;

// An identified error, catchable as the host's IMsgIDException and as
// std::exception. Copies share the boost error information and hold their
// own record and identifier.
template <class Tag>
class Exception<Tag, std::exception, void> final : public IMsgIDException, public std::exception {
public:
    explicit Exception(const Tag& tag) : message_(tag), identifier_(get_error_id(message_)) {}

    const boost::exception_detail::clone_base* clone() const override {
        return new Exception(*this);
    }
    void rethrow() const override { throw *this; }
    const char* what() const noexcept override { return IException::what(); }
    std::string GetID() const override { return identifier_; }
    const resource_core::BaseMsgID* GetBaseMsgIDObj() const override { return &message_; }

private:
    resource_core::BaseMsgID message_;
    std::string identifier_;
};

}  // namespace foundation::core::except

namespace bitfcns {

template <class Tag>
using ErrorOf = foundation::core::except::Exception<Tag, std::exception, void>;

// Hands the error for `message` to the host's legacy report, which may raise
// it itself; if the report comes back, throws it.
template <class Tag>
[[noreturn]] void zqErrMsgId(const Tag& message) {
    const ErrorOf<Tag> error(message);
    matrix::detail::do_legacy_zq_error(error);
    throw error;
}

// The usual raising site: raiseError<VESPRA::bitshift::sizeMismatch>().
template <class Tag>
[[noreturn]] void raiseError() {
    const Tag message;
    zqErrMsgId(message);
}

}  // namespace bitfcns
