// The list of a failure, its renderings, and the classes that carry a fixed content.
#include <kvt/foundation/throwable.h>

#include <kvt/foundation/detail/escape.h>
#include <kvt/foundation/detail/exception_data.h>
#include <kvt/platform/type_name.h>

#include <string>
#include <string_view>
#include <typeinfo>

namespace kvt::ex {
namespace {

UString<0> utf8(std::string_view text) {
    return UString<0>(UStringView<0>(text));
}

std::string_view view(const UString<0>& string) {
    return {string.rawData(), string.size()};
}

// `text` with the first `placeholder` replaced.
std::string replacedFirst(std::string text, std::string_view placeholder, std::string_view value) {
    const std::size_t at = text.find(placeholder);
    return at == std::string::npos ? text : text.replace(at, placeholder.size(), value);
}

UString<0> escaped(const UString<28>& bytes) {
    return utf8(detail::escapeBytes({bytes.rawData(), bytes.size()}));
}

UString<0> nameOf(Encoding encoding) {
    return utf8(encoding.getName());
}

constexpr std::string_view substitutedConversion = "substituted_conversion";
constexpr std::string_view substitutionCharacters = "substitution_characters";

void addLoss(Throwable& failure, UString<0> lossy, UString<0> substitution) {
    failure.addNameValue(utf8(substitutedConversion), std::move(lossy));
    failure.addNameValue(utf8(substitutionCharacters), std::move(substitution));
}

} // namespace

namespace detail {

template class PimplBase<ExceptionImpl>;

UString<0> ExceptionStackFrame::toString() const {
    std::string text(view(file_));
    text.append("::").append(view(function_)).append("::").append(std::to_string(line_));
    return utf8(text);
}

UString<0> ExceptionNameValue::toString() const {
    std::string text(view(name_));
    text.append("=").append(view(value_));
    return utf8(text);
}

UString<0> ExceptionMessage::toString() const {
    std::string text = "msgnum=" + std::to_string(number_);
    for (std::size_t i = 0; i < parameters_.size(); ++i) {
        text.append(" %").append(std::to_string(i)).append("=").append(view(parameters_[i]));
    }
    return utf8(text);
}

} // namespace detail

Throwable::Throwable() = default;
Throwable::Throwable(const Throwable&) = default;
Throwable::Throwable(Throwable&&) noexcept = default;
Throwable& Throwable::operator=(const Throwable&) = default;
Throwable& Throwable::operator=(Throwable&&) noexcept = default;
Throwable::~Throwable() = default;

Throwable::Throwable(const UString<0>& message) {
    addMessageString(message);
}

Throwable::Throwable(UString<0> name, UString<0> value) {
    addNameValue(std::move(name), std::move(value));
}

Throwable::Throwable(UString<0> file, UString<0> function, int line) {
    addStackFrame(std::move(file), std::move(function), line);
}

Throwable::Throwable(unsigned long number, UStringArray<0> parameters) {
    addMessage(number, std::move(parameters));
}

// A buffer that the caller allocated may come from another module's allocator; a copy is the library's own.
UString<0> Throwable::make_string(const UString<0>& string) {
    return string;
}

UString<0> Throwable::make_string(UString<0>&& string) {
    return std::move(string);
}

void Throwable::addMessage(unsigned long number, UStringArray<0> parameters) {
    for (UString<0>& parameter : parameters) {
        parameter = make_string(std::move(parameter));
    }
    d().items.push_back(std::make_shared<detail::ExceptionMessage>(static_cast<std::uint32_t>(number),
                                                                   std::move(parameters)));
}

void Throwable::addMessageString(const UString<0>& message) {
    d().items.push_back(std::make_shared<detail::ExceptionMessageString>(make_string(message)));
}

void Throwable::addNameValue(UString<0> name, UString<0> value) {
    d().items.push_back(std::make_shared<detail::ExceptionNameValue>(make_string(std::move(name)),
                                                                     make_string(std::move(value))));
}

void Throwable::addStackFrame(UString<0> file, UString<0> function, int line) {
    d().items.push_back(std::make_shared<detail::ExceptionStackFrame>(
        make_string(std::move(file)), make_string(std::move(function)), line));
}

UString<0> Throwable::what() const {
    const auto& items = d().items;
    if (items.empty()) {
        return utf8("Exception thrown: " + std::string(view(className())));
    }
    std::string text;
    for (std::size_t i = 0; i < items.size(); ++i) {
        if (i > 0) {
            text += '\n';
        }
        if (items.size() > 1) {
            text.append("[").append(std::to_string(i)).append("] ");
        }
        text.append(view(items[i]->toString()));
    }
    return utf8(text);
}

UString<0> Throwable::className() const {
    return utf8(platform::typeName(typeid(*this)));
}

void Throwable::processInfo(
    const std::function<void(const UString<0>&)>& onMessageString,
    const std::function<void(const UString<0>&, const UString<0>&, int)>& onStackFrame,
    const std::function<void(const UString<0>&, const UString<0>&)>& onNameValue,
    const std::function<void(unsigned long, const UStringArray<0>&)>& onMessage) const {
    using namespace detail;
    for (const auto& item : d().items) {
        if (const auto* text = dynamic_cast<const ExceptionMessageString*>(item.get())) {
            if (onMessageString) {
                onMessageString(text->message());
            }
        } else if (const auto* frame = dynamic_cast<const ExceptionStackFrame*>(item.get())) {
            if (onStackFrame) {
                onStackFrame(frame->file(), frame->function(), frame->line());
            }
        } else if (const auto* pair = dynamic_cast<const ExceptionNameValue*>(item.get())) {
            if (onNameValue) {
                onNameValue(pair->name(), pair->value());
            }
        } else if (const auto* message = dynamic_cast<const ExceptionMessage*>(item.get())) {
            if (onMessage) {
                onMessage(message->number(), message->parameters());
            }
        }
    }
}

UString<0> Throwable::valueOf(const UString<0>& name) const {
    const UString<0>* found = nullptr;
    processInfo({}, {},
                [&](const UString<0>& itemName, const UString<0>& value) {
                    if (found == nullptr && itemName == name) {
                        found = &value;
                    }
                },
                {});
    return found != nullptr ? *found : UString<0>();
}

const std::uint32_t UStringBadEncodingException::badInputEncoding = 910002;
const std::uint32_t UStringTranscodingException::transcodingError = 910003;
const std::uint32_t UStringBinaryTranscodingException::binaryTranscoding = 910004;
const std::uint32_t InvalidEncodingException::badEncoding = 910005;

UStringBadEncodingException::UStringBadEncodingException(const UString<28>& bytes, Encoding from,
                                                         UString<0> lossy, UString<0> substitution)
    : UStringException(badInputEncoding, {escaped(bytes), nameOf(from)}) {
    addLoss(*this, std::move(lossy), std::move(substitution));
}

UString<0> UStringBadEncodingException::getLossyConversion() const {
    return valueOf(utf8(substitutedConversion));
}

UString<0> UStringBadEncodingException::getSubstitutionCharacters() const {
    return valueOf(utf8(substitutionCharacters));
}

UStringTranscodingException::UStringTranscodingException(UString<0> text, Encoding from, Encoding to,
                                                         UString<0> lossy, UString<0> substitution)
    : UStringException(transcodingError, {std::move(text), nameOf(from), nameOf(to)}) {
    addLoss(*this, std::move(lossy), std::move(substitution));
}

UString<0> UStringTranscodingException::getLossyConversion() const {
    return valueOf(utf8(substitutedConversion));
}

UString<0> UStringTranscodingException::getSubstitutionCharacters() const {
    return valueOf(utf8(substitutionCharacters));
}

UStringBinaryTranscodingException::UStringBinaryTranscodingException(const UString<28>& bytes)
    : UStringException(binaryTranscoding, {escaped(bytes)}) {}

UStringNotImplementedException::UStringNotImplementedException(const char* function)
    : UStringException(utf8(replacedFirst("The function %func% is not implemented.", "%func%", function))) {}

InvalidEncodingException::InvalidEncodingException(UString<0> name)
    : Exception(badEncoding, {std::move(name)}) {}

PythonVersionError::PythonVersionError(const UString<0>& required, const UString<0>& configured)
    : FatalError(utf8(replacedFirst(
          replacedFirst(
              "Workspace requiring Python %0 is requested to run on an ZQT Engine configured to use a "
              "Python %1 interpreter. ZQT cannot continue given the Python version mismatch",
              "%0", view(required)),
          "%1", view(configured)))) {}

} // namespace kvt::ex
