// The failures of the library.
//
// A Throwable is not a text but an ordered list of items: message numbers with parameters, plain strings, name and
// value pairs, stack frames. Code through which a failure travels adds to it. A host reads the list with
// processInfo() and looks the message numbers up in its own catalogue, or renders it for a log with what().
//
// Failures are thrown by value and do not derive from std::exception. A copy shares the items, which never change,
// so copies may travel to other threads; one object is used by one thread at a time. A moved-from object may only be
// destroyed or assigned to. Nothing here fails but for lack of memory.
//
//     Throwable
//       Exception                                recoverable
//         UStringException
//           UStringBadEncodingException          910002  bytes that are not text in their encoding
//           UStringTranscodingException          910003  characters without a form in the target encoding
//           UStringBinaryTranscodingException    910004  bytes without a text meaning where text is wanted
//           UStringNotImplementedException
//         InvalidEncodingException               910005  an encoding that nobody knows
//       FatalError                               not to be recovered from
//         PythonVersionError
#pragma once

#include <kvt/encoding/encoding.h>
#include <kvt/foundation/export.h>
#include <kvt/foundation/pimpl.h>
#include <kvt/string/ustring.h>
#include <kvt/string/ustring_array.h>

#include <cstdint>
#include <functional>

namespace kvt::ex {

class ExceptionImpl;

namespace detail {
extern template class KVT_EXPORT PimplBase<ExceptionImpl>;
}

class KVT_EXPORT Throwable : public detail::PimplBase<ExceptionImpl> {
public:
    /// An empty list.
    Throwable();
    /// A list of one plain string.
    Throwable(const UString<0>& message);
    /// A list of one name and value pair.
    Throwable(UString<0> name, UString<0> value);
    /// A list of one stack frame.
    Throwable(UString<0> file, UString<0> function, int line);
    /// A list of one message: a number of 32 bits, and its parameters from %0 on.
    Throwable(unsigned long number, UStringArray<0> parameters);
    Throwable(const Throwable&);
    Throwable(Throwable&&) noexcept;
    Throwable& operator=(const Throwable&);
    Throwable& operator=(Throwable&&) noexcept;
    virtual ~Throwable();

    /// Each appends one item to the list.
    void addMessage(unsigned long number, UStringArray<0> parameters);
    void addMessageString(const UString<0>& message);
    void addNameValue(UString<0> name, UString<0> value);
    void addStackFrame(UString<0> file, UString<0> function, int line);

    /// The items as text for a log, one on each line, with their indexes in brackets when there are several; for an
    /// empty list "Exception thrown: " and the class name. A message reads `msgnum=910003 %0=... %1=...`, a pair
    /// `name=value`, a stack frame `file::function::line`.
    UString<0> what() const;

    /// The qualified name of the object's class, as `kvt::ex::Exception`.
    UString<0> className() const;

    /// Calls the function of each item's kind, in the order of the list. An empty function skips its kind.
    void processInfo(
        const std::function<void(const UString<0>& message)>& onMessageString,
        const std::function<void(const UString<0>& file, const UString<0>& function, int line)>& onStackFrame,
        const std::function<void(const UString<0>& name, const UString<0>& value)>& onNameValue,
        const std::function<void(unsigned long number, const UStringArray<0>& parameters)>& onMessage) const;

protected:
    /// The value of the first pair of that name, or an empty string.
    UString<0> valueOf(const UString<0>& name) const;

private:
    static UString<0> make_string(const UString<0>& string);
    static UString<0> make_string(UString<0>&& string);
};

/// A failure from which the caller may recover.
class KVT_EXPORT Exception : public Throwable {
public:
    using Throwable::Throwable;
};

/// A failure from which the host is not to recover.
class KVT_EXPORT FatalError : public Throwable {
public:
    using Throwable::Throwable;
};

/// A failure of a string operation.
class KVT_EXPORT UStringException : public Exception {
public:
    using Exception::Exception;
};

/// Bytes that are not text in the encoding they are said to have. Message 910002: %0 the bytes, with everything but
/// printable ASCII as `\xHH`, %1 the encoding's name.
class KVT_EXPORT UStringBadEncodingException : public UStringException {
public:
    /// `lossy` is the whole text with `substitution` in place of what was bad.
    UStringBadEncodingException(const UString<28>& bytes, Encoding from, UString<0> lossy,
                                UString<0> substitution);

    /// The text with substitutions.
    UString<0> getLossyConversion() const;
    /// What was put in place of each loss.
    UString<0> getSubstitutionCharacters() const;

private:
    static const std::uint32_t badInputEncoding;
};

/// Characters that have no form in the target encoding. Message 910003: %0 the text, %1 and %2 the names of the
/// source and target encodings.
class KVT_EXPORT UStringTranscodingException : public UStringException {
public:
    /// `lossy` is the whole text with `substitution` in place of each character that was lost.
    UStringTranscodingException(UString<0> text, Encoding from, Encoding to, UString<0> lossy,
                                UString<0> substitution);

    /// The text with substitutions.
    UString<0> getLossyConversion() const;
    /// What was put in place of each loss.
    UString<0> getSubstitutionCharacters() const;

private:
    static const std::uint32_t transcodingError;
};

/// Bytes without a text meaning were to be converted to text. Message 910004: %0 the bytes, escaped as in 910002.
class KVT_EXPORT UStringBinaryTranscodingException : public UStringException {
public:
    explicit UStringBinaryTranscodingException(const UString<28>& bytes);

private:
    static const std::uint32_t binaryTranscoding;
};

/// An operation that the string type does not offer. One plain string that names it.
class KVT_EXPORT UStringNotImplementedException : public UStringException {
public:
    explicit UStringNotImplementedException(const char* function);
};

/// An encoding that nobody knows. Message 910005: %0 its name, or "unknown" where an encoding without a converter
/// was to convert.
class KVT_EXPORT InvalidEncodingException : public Exception {
public:
    explicit InvalidEncodingException(UString<0> name);

private:
    static const std::uint32_t badEncoding;
};

/// A workspace and the engine it runs on were made for different versions of Python. One plain string with both.
class KVT_EXPORT PythonVersionError : public FatalError {
public:
    PythonVersionError(const UString<0>& required, const UString<0>& configured);
};

} // namespace kvt::ex
