// A folder of its own for each test, and looks at the files in it that owe nothing to the library.
#pragma once

#include <gtest/gtest.h>

#include <boost/interprocess/exceptions.hpp>

#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <sys/stat.h>
#include <unistd.h>

namespace kvt::test {

class Scratch {
public:
    Scratch() {
        std::string name = (std::filesystem::temp_directory_path() / "kvt_mmap_XXXXXX").string();
        folder_ = ::mkdtemp(name.data());
    }
    Scratch(const Scratch&) = delete;
    Scratch& operator=(const Scratch&) = delete;
    ~Scratch() {
        std::error_code ignored;
        std::filesystem::remove_all(folder_, ignored);
    }

    std::string folder() const { return folder_; }
    std::string file(const std::string& name = "file") const { return folder_ + "/" + name; }
    bool isEmpty() const { return std::filesystem::is_empty(folder_); }

private:
    std::string folder_;
};

inline std::uint64_t page() {
    return static_cast<std::uint64_t>(::sysconf(_SC_PAGESIZE));
}

inline std::uint64_t lengthOf(const std::string& path) {
    return std::filesystem::file_size(path);
}

/// Bytes that the file takes on the disk.
inline std::uint64_t roomOf(const std::string& path) {
    struct stat status {};
    EXPECT_EQ(::stat(path.c_str(), &status), 0);
    return static_cast<std::uint64_t>(status.st_blocks) * 512;
}

inline std::string contentsOf(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), {}};
}

inline void write(const std::string& path, const std::string& contents) {
    std::ofstream(path, std::ios::binary) << contents;
}

/// What a call threw: "none", or the failure's text. The code of a mapping failure goes to `code`.
template <typename Call>
std::string mappingFailure(Call call, boost::interprocess::error_code_t* code = nullptr) {
    try {
        call();
    } catch (const boost::interprocess::interprocess_exception& failure) {
        if (code != nullptr) {
            *code = failure.get_error_code();
        }
        return failure.what();
    }
    return "none";
}

/// The text of a mapping failure that no system call is behind.
inline const std::string outsideTheFile = "boost::interprocess_exception::library_error";

/// `call` finds a stretch that does not lie in its file.
template <typename Call>
void expectOutsideTheFile(Call call) {
    boost::interprocess::error_code_t code = boost::interprocess::no_error;
    EXPECT_EQ(mappingFailure(call, &code), outsideTheFile);
    EXPECT_EQ(code, boost::interprocess::size_error);
}

} // namespace kvt::test
