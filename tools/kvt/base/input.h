// What a command reads: files in order, "-" and no file at all being standard input. Nothing is read ahead of what
// is asked for, so that a pipe is passed on as it comes.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace host {

class Input {
public:
    /// Throws Failure when it cannot be opened.
    explicit Input(const std::string& path);
    Input(const Input&) = delete;
    Input& operator=(const Input&) = delete;
    ~Input();

    /// The next bytes, at most blockSize of them, or none at the end. They are valid until the next call.
    /// Throws Failure.
    std::string_view read();
    /// The same, but goes on before the end of the input for as long as what there is `isTooShort`.
    std::string_view readWhile(const std::function<bool(std::string_view)>& isTooShort);

    /// The name for messages: the path, or "standard input".
    const std::string& name() const { return name_; }
    int descriptor() const { return descriptor_; }
    /// Bytes still to read, where the system can tell.
    std::optional<std::uint64_t> remaining() const;

    static constexpr std::size_t blockSize = 128 * 1024;

private:
    std::size_t readInto(std::size_t offset);

    std::string name_;
    int descriptor_;
    bool owned_;
    std::vector<char> buffer_;
};

/// `paths`, or standard input where there are none.
std::vector<std::string> inputsOrStandardInput(std::vector<std::string> paths);

/// The bytes of all inputs together, where the system can tell.
std::optional<std::uint64_t> totalSize(const std::vector<std::string>& paths);

} // namespace host
