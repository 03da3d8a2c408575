// The host's table of operations on an array of strings.
#pragma once

#include <kvt/codec/string_adaptors.h>
#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring_array.h>

#include <algorithm>
#include <cstdint>
#include <string>
#include <string_view>

namespace kvt::ex::detail {

/// Stands for the array it is constructed with, of which it owns nothing. Texts are compared and copied as the bytes
/// of their units; an array of wide units takes no zero-terminated bytes.
template <std::uint32_t N>
class IZQTUStringArrayAdaptor final : public IZQTStringArray {
    static constexpr bool isWide = sizeof(CodeUnit<N>) != 1;

public:
    explicit IZQTUStringArrayAdaptor(UStringArray<N>& owner) noexcept : owner_(&owner) {}
    IZQTUStringArrayAdaptor(const IZQTUStringArrayAdaptor&) = delete;
    IZQTUStringArrayAdaptor& operator=(const IZQTUStringArrayAdaptor&) = delete;

    void append(const IZQTString& string) override { appendBytes(bytesOf(string)); }
    void append(const char* text) override { appendBytes(narrow(text, "append")); }
    const char* elementText(std::uint32_t index) const override {
        return (*owner_)[index].getAsIZQTString().data();
    }
    int getElement(std::uint32_t index, IZQTString& target) const override {
        if (index >= owner_->size()) {
            return 1;
        }
        const IZQTString& element = (*owner_)[index].getAsIZQTString();
        target.assignBytes(element.data(), element.byteLength());
        return 0;
    }
    int setElement(std::uint32_t index, const IZQTString& source) override {
        if (index >= owner_->size()) {
            return 1;
        }
        (*owner_)[index].getAsIZQTString().assignBytes(source.data(), source.byteLength());
        return 0;
    }
    std::uint32_t entries() const override { return static_cast<std::uint32_t>(owner_->size()); }
    void clear() override { owner_->clear(); }
    bool contains(const IZQTString& string) const override { return containsBytes(bytesOf(string)); }
    bool contains(const char* text) const override { return containsBytes(narrow(text, "contains")); }
    void appendCSVString(const char*) override { throw UStringNotImplementedException("appendCSVString"); }
    void appendTokenizeString(const char*, const char*) override {
        throw UStringNotImplementedException("appendTokenizeString");
    }
    std::uint32_t removeAll(const IZQTString& string) override { return removeBytes(bytesOf(string)); }
    std::uint32_t removeAll(const char* text) override { return removeBytes(narrow(text, "removeAll")); }
    IZQTString& element(std::uint32_t index) override { return (*owner_)[index].getAsIZQTString(); }

private:
    static std::string_view bytesOf(const IZQTString& string) { return {string.data(), string.byteLength()}; }

    static std::string_view narrow(const char* text, const char* function) {
        if (isWide) {
            throw UStringNotImplementedException(function);
        }
        return text;
    }

    // Whether the element holds just these bytes; an incomplete last unit of them does not count.
    static auto equals(std::string_view bytes) {
        return [bytes = bytes.substr(0, bytes.size() - bytes.size() % sizeof(CodeUnit<N>))](
                   const UString<N>& element) { return bytesOf(element.getAsIZQTString()) == bytes; };
    }

    void appendBytes(std::string_view bytes) {
        owner_->push_back(UString<N>(bytes.data(), bytes.size(), static_cast<Encoding::Type>(N)));
    }
    bool containsBytes(std::string_view bytes) const {
        return std::any_of(owner_->begin(), owner_->end(), equals(bytes));
    }
    std::uint32_t removeBytes(std::string_view bytes) {
        const std::string copy(bytes); // They may be those of an element, which is about to move.
        auto* const kept = std::remove_if(owner_->begin(), owner_->end(), equals(copy));
        const auto removed = static_cast<std::uint32_t>(owner_->end() - kept);
        owner_->erase(kept, owner_->end());
        return removed;
    }

    UStringArray<N>* owner_;
};

} // namespace kvt::ex::detail
