#include <storage/conformance/detail/describe.hpp>

#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/ChangeEventExceptions.hpp>
#include <storage/provider/Exception.hpp>

#include <sstream>

namespace foundation::storage::conformance::detail {

std::string describe(std::exception_ptr const& thrown)
{
    std::ostringstream text;
    try {
        std::rethrow_exception(thrown);
    } catch (provider::Exception const& error) {
        text << "Exception with " << error.getErrorCode() << " naming " << error.getStorageIRI();
    } catch (provider::ChangeEventsNotSupportedException const& error) {
        text << "ChangeEventsNotSupportedException naming " << error.getStorageIRI();
    } catch (provider::ByteStreamFailure const& error) {
        text << "ByteStreamFailure with " << error.getErrorCode() << ": " << error.what();
    } catch (std::exception const& error) {
        text << "a standard exception: " << error.what();
    } catch (...) {
        text << "something that is no exception";
    }
    return text.str();
}

} // namespace foundation::storage::conformance::detail
