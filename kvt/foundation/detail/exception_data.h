// The items of a Throwable's list. An item never changes once it is made, so the copies of a failure share it.
#pragma once

#include <kvt/string/ustring.h>
#include <kvt/string/ustring_array.h>

#include <cstdint>
#include <memory>
#include <utility>
#include <vector>

namespace kvt::ex {
namespace detail {

class IExceptionData {
public:
    IExceptionData() = default;
    IExceptionData(const IExceptionData&) = delete;
    IExceptionData& operator=(const IExceptionData&) = delete;
    virtual ~IExceptionData() = default;

    /// The item as text for a log.
    virtual UString<0> toString() const = 0;
};

class ExceptionMessageString final : public IExceptionData {
public:
    explicit ExceptionMessageString(UString<0> message) : message_(std::move(message)) {}
    UString<0> toString() const override { return message_; }
    const UString<0>& message() const { return message_; }

private:
    UString<0> message_;
};

class ExceptionStackFrame final : public IExceptionData {
public:
    ExceptionStackFrame(UString<0> file, UString<0> function, std::int32_t line)
        : file_(std::move(file)), function_(std::move(function)), line_(line) {}
    UString<0> toString() const override;
    const UString<0>& file() const { return file_; }
    const UString<0>& function() const { return function_; }
    std::int32_t line() const { return line_; }

private:
    UString<0> file_;
    UString<0> function_;
    std::int32_t line_;
};

class ExceptionNameValue final : public IExceptionData {
public:
    ExceptionNameValue(UString<0> name, UString<0> value)
        : name_(std::move(name)), value_(std::move(value)) {}
    UString<0> toString() const override;
    const UString<0>& name() const { return name_; }
    const UString<0>& value() const { return value_; }

private:
    UString<0> name_;
    UString<0> value_;
};

class ExceptionMessage final : public IExceptionData {
public:
    ExceptionMessage(std::uint32_t number, UStringArray<0> parameters)
        : number_(number), parameters_(std::move(parameters)) {}
    UString<0> toString() const override;
    std::uint32_t number() const { return number_; }
    const UStringArray<0>& parameters() const { return parameters_; }

private:
    std::uint32_t number_;
    UStringArray<0> parameters_;
};

} // namespace detail

/// The list of a Throwable, in the order of addition.
class ExceptionImpl {
public:
    std::vector<std::shared_ptr<const detail::IExceptionData>> items;
};

} // namespace kvt::ex
