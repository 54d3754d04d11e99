// The host's exception library: the message-identifier record, the exception
// interfaces every error of a library derives from, the allocation failure,
// and the legacy reporting call through which a library hands the host an
// error before throwing it.
#pragma once

#include <boost/exception/exception.hpp>
#include <boost/variant.hpp>

#include <cstddef>
#include <new>
#include <string>
#include <vector>

namespace resource_core {

// A message identifier: group and leaf ("VESPRA:Bitand", "sparseArgs") and
// the message's arguments.
struct BaseMsgID {
    using Argument = boost::variant<long, std::string, std::u16string>;

    // `argumentCount` slots, each the integer 0.
    BaseMsgID(std::string group, std::string leaf, std::size_t argumentCount);

    std::vector<Argument> arguments;
    std::string group;
    std::string leaf;
};

}  // namespace resource_core

namespace foundation::core::except {

// Root of the host's exceptions. A new one has an empty error-information
// container, no throw function or file, and the throw line -1.
class IException : public virtual boost::exception,
                   public virtual boost::exception_detail::clone_base {
public:
    // A readable sentence for the error: for an identified error, the
    // catalogue's sentence for its identifier.
    virtual const char* what() const noexcept;
    ~IException() noexcept override;

private:
    mutable std::string whatText_;
};

// An error meant for the user of the host.
class IUserException : public IException {
public:
    virtual std::u16string convert_str(const std::u16string& text) const;
    virtual std::u16string convert_str(const std::string& text) const;
    // The message as 16-bit text.
    virtual std::u16string ToUstringImpl() const;
};

// An error known by a message identifier.
class IMsgIDException : public IUserException {
public:
    // The full identifier of `message`: group and leaf joined by a colon.
    std::string get_error_id(const resource_core::BaseMsgID& message) const;

    virtual std::string GetID() const = 0;
    // The catalogue's sentence for GetID(), as 16-bit text.
    virtual std::u16string GetUnicodeMessageTxt() const;
    virtual const resource_core::BaseMsgID* GetBaseMsgIDObj() const = 0;
};

namespace detail {
class bad_alloc_impl : public std::bad_alloc {
public:
    const char* what() const noexcept override;
};
}  // namespace detail

// The host's allocation failure, ready to be thrown.
boost::exception_detail::clone_impl<detail::bad_alloc_impl> bad_alloc();

}  // namespace foundation::core::except

namespace host {
// Raises the host's own identified error "group:leaf" (argument counts, bad
// operands of a math routine), after giving it to do_legacy_zq_error.
[[noreturn]] void raiseHostError(const std::string& group, const std::string& leaf);
}  // namespace host

namespace matrix::detail {
// Gives the host the chance to report `error` by its own means. Depending on
// the host's setting it raises a copy of `error` at once or comes back.
void do_legacy_zq_error(const foundation::core::except::IUserException& error);
}  // namespace matrix::detail
