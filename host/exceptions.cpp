// The host's exception library: message records, the exception interfaces,
// the allocation failure, the legacy reporting call and the host's own
// identified errors.
#include "host/exceptions.hpp"

#include "host/host_control.hpp"
#include "host/message_catalogue.hpp"
#include "host/zq_array.hpp"

#include <atomic>
#include <utility>

namespace resource_core {

BaseMsgID::BaseMsgID(std::string groupName, std::string leafName, std::size_t argumentCount)
    : arguments(argumentCount, Argument(0L)),
      group(std::move(groupName)),
      leaf(std::move(leafName)) {}

}  // namespace resource_core

namespace foundation::core::except {

namespace {
std::u16string widen(std::string_view text) { return {text.begin(), text.end()}; }

std::string narrow(std::u16string_view text) {
    std::string out;
    out.reserve(text.size());
    for (char16_t unit : text) out.push_back(unit < 0x80 ? static_cast<char>(unit) : '?');
    return out;
}
}  // namespace

// The text is made on the first call and kept, so that every pointer handed
// out stays valid for the life of the exception.
const char* IException::what() const noexcept {
    if (!whatText_.empty()) return whatText_.c_str();
    try {
        if (auto* identified = dynamic_cast<const IMsgIDException*>(this)) {
            whatText_ = narrow(identified->GetUnicodeMessageTxt());
        } else if (auto* user = dynamic_cast<const IUserException*>(this)) {
            whatText_ = narrow(user->ToUstringImpl());
        } else {
            whatText_ = "Unknown error.";
        }
        return whatText_.c_str();
    } catch (...) {
        return "Unknown error.";
    }
}

IException::~IException() noexcept = default;

std::u16string IUserException::convert_str(const std::u16string& text) const { return text; }

std::u16string IUserException::convert_str(const std::string& text) const { return widen(text); }

std::u16string IUserException::ToUstringImpl() const {
    if (auto* identified = dynamic_cast<const IMsgIDException*>(this)) {
        return identified->GetUnicodeMessageTxt();
    }
    return u"Unknown error.";
}

std::string IMsgIDException::get_error_id(const resource_core::BaseMsgID& message) const {
    return message.group + ':' + message.leaf;
}

std::u16string IMsgIDException::GetUnicodeMessageTxt() const {
    const std::string id = GetID();
    const std::string_view sentence = host::catalogueSentence(id);
    return widen(sentence.empty() ? std::string_view(id) : sentence);
}

const char* detail::bad_alloc_impl::what() const noexcept {
    return "Out of memory. The array is too large for the memory available.";
}

boost::exception_detail::clone_impl<detail::bad_alloc_impl> bad_alloc() {
    return boost::exception_detail::clone_impl<detail::bad_alloc_impl>(detail::bad_alloc_impl());
}

}  // namespace foundation::core::except

namespace host {

namespace {

using foundation::core::except::IMsgIDException;

// The host's own identified error. Its identifier is carried in the record.
class HostError final : public IMsgIDException, public std::exception {
public:
    explicit HostError(resource_core::BaseMsgID message)
        : message_(std::move(message)), id_(get_error_id(message_)) {}

    const clone_base* clone() const override { return new HostError(*this); }
    void rethrow() const override { throw *this; }
    const char* what() const noexcept override { return IMsgIDException::what(); }
    std::string GetID() const override { return id_; }
    const resource_core::BaseMsgID* GetBaseMsgIDObj() const override { return &message_; }

private:
    resource_core::BaseMsgID message_;
    std::string id_;
};

// Errors may be raised on several threads at once (a host that calls
// libraries without a global lock); the switch and the count are atomic. The
// last identifier is only kept while the legacy call comes back, a setting
// for single-threaded tests.
struct LegacyErrorState {
    std::atomic<bool> raises{true};
    std::string lastId;
    std::atomic<std::size_t> count{0};
};

LegacyErrorState& legacyState() {
    static LegacyErrorState state;
    return state;
}

}  // namespace

void raiseHostError(const std::string& group, const std::string& leaf) {
    HostError error(resource_core::BaseMsgID(group, leaf, 0));
    matrix::detail::do_legacy_zq_error(error);
    throw error;
}

void setLegacyErrorRaises(bool raises) { legacyState().raises = raises; }
bool legacyErrorRaises() { return legacyState().raises; }
std::string lastLegacyErrorId() { return legacyState().lastId; }
std::size_t legacyErrorCount() { return legacyState().count; }

void resetLegacyErrors() {
    legacyState().lastId.clear();
    legacyState().count = 0;
}

}  // namespace host

namespace matrix::detail {

void do_legacy_zq_error(const foundation::core::except::IUserException& error) {
    auto& state = host::legacyState();
    ++state.count;
    if (state.raises) error.rethrow();
    auto* identified = dynamic_cast<const foundation::core::except::IMsgIDException*>(&error);
    state.lastId = identified ? identified->GetID() : std::string();
}

void error_maxlhs() { host::raiseHostError("VESPRA", "maxlhs"); }
void error_maxrhs() { host::raiseHostError("VESPRA", "maxrhs"); }
void error_minrhs() { host::raiseHostError("VESPRA", "minrhs"); }

}  // namespace matrix::detail
