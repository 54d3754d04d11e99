// Reports of errors: the evaluator's, the library's and the host's.
#include "calc/errors.hpp"

#include "calc/unicode_text.hpp"
#include "host/exceptions.hpp"
#include "host/message_catalogue.hpp"

#include <exception>

namespace bitcalc {

ErrorReport reportCurrentException() {
    try {
        throw;
    } catch (const CalcError& error) {
        return {error.identifier(), error.what()};
    } catch (const foundation::core::except::IMsgIDException& error) {
        // Identified errors of the library and the host: the catalogue's sentence.
        std::string identifier = error.GetID();
        const std::string_view sentence = host::catalogueSentence(identifier);
        std::string message =
            sentence.empty() ? toUtf8(error.GetUnicodeMessageTxt()) : std::string(sentence);
        return {std::move(identifier), std::move(message)};
    } catch (const std::exception& error) {
        return {"", error.what()};
    } catch (const foundation::core::except::IException& error) {
        return {"", error.what()};
    } catch (...) {
        return {"", "Unknown error."};
    }
}

void raiseTooManyOutputs() { host::raiseHostError("VESPRA", "maxlhs"); }
void raiseTooManyInputs() { host::raiseHostError("VESPRA", "maxrhs"); }
void raiseTooFewInputs() { host::raiseHostError("VESPRA", "minrhs"); }

}  // namespace bitcalc
