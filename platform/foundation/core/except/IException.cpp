#include <foundation/core/except/IException.hpp>

#include <boost/core/demangle.hpp>

#include <exception>
#include <stdexcept>
#include <typeinfo>
#include <utility>

#include <fl/i18n/utf8.hpp>
#include <foundation/core/except/AnonymousInternalException.hpp>
#include <foundation/core/except/IInternalException.hpp>

namespace foundation::core::except {

namespace {

// The exception whose standard base is being asked for its text, in this thread.
thread_local IException const* beingAsked = nullptr;

class AskingScope
{
public:
    explicit AskingScope(IException const* exception) : previous_(std::exchange(beingAsked, exception)) {}
    AskingScope(AskingScope const&) = delete;
    AskingScope& operator=(AskingScope const&) = delete;
    ~AskingScope() { beingAsked = previous_; }

private:
    IException const* previous_;
};

// What a standard exception says when no override of `what` is asked.
std::string textOfStandardClass(std::exception const& exception)
{
    if (auto const* runtimeError = dynamic_cast<std::runtime_error const*>(&exception)) {
        return runtimeError->std::runtime_error::what();
    }
    if (auto const* logicError = dynamic_cast<std::logic_error const*>(&exception)) {
        return logicError->std::logic_error::what();
    }
    return exception.std::exception::what();
}

} // namespace

namespace detail {

OwnText& OwnText::operator=(OwnText const& /*other*/) noexcept
{
    delete text_.exchange(nullptr, std::memory_order_acq_rel);
    return *this;
}

OwnText::~OwnText()
{
    delete text_.load(std::memory_order_acquire);
}

std::string const& OwnText::keepFirst(std::string text)
{
    auto const* fresh = new std::string(std::move(text));
    std::string const* kept = nullptr;
    if (text_.compare_exchange_strong(kept, fresh, std::memory_order_acq_rel, std::memory_order_acquire)) {
        return *fresh;
    }
    delete fresh;
    return *kept;
}

template class AnonymousInternalException<std::logic_error>;
template class AnonymousInternalException<std::runtime_error>;

} // namespace detail

IException::~IException() noexcept = default;

IInternalException::~IInternalException() noexcept = default;

char const* IException::what() const noexcept
{
    if (auto const* text = what_.get()) {
        return text->c_str();
    }
    try {
        return what_.keepFirst(fl::i18n::to_utf8(ToUstringImpl(), fl::i18n::Malformed::Replace)).c_str();
    } catch (...) {
        return "foundation::core::except::IException (its text could not be made)";
    }
}

std::u16string IException::convert_str(std::u16string const& text) const
{
    return text;
}

std::u16string IException::convert_str(std::string const& text) const
{
    return fl::i18n::from_utf8(text, fl::i18n::Malformed::Replace);
}

std::u16string IException::ToUstringImpl() const
{
    auto const* standard = dynamic_cast<std::exception const*>(this);
    if (standard == nullptr) {
        return convert_str(boost::core::demangle(typeid(*this).name()));
    }
    // An override of what() that forwards to IException::what() leads back here.
    if (beingAsked == this) {
        return convert_str(textOfStandardClass(*standard));
    }
    AskingScope const scope(this);
    return convert_str(std::string(standard->what()));
}

} // namespace foundation::core::except
