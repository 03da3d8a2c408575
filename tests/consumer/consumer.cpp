// What an outside program does first: include everything, convert, keep data in a file, and catch what the
// library throws by the class that its own copy of the headers declares.

#include <kvt/kvt.h>

#include <cstdint>
#include <cstdio>
#include <iostream>
#include <stdexcept>
#include <string>

namespace {

void expect(bool holds, const char* what) {
    if (!holds) {
        throw std::runtime_error(what);
    }
}

void converts() {
    const kvt::ex::AnyString cyrillic("\xeb\xc9\xc5\xd7", 4, kvt::ex::Encoding("KOI8-R"));
    expect(cyrillic.getAsUtf8() == kvt::ex::Utf8String("\xd0\x9a\xd0\xb8\xd0\xb5\xd0\xb2"),
           "KOI8-R to UTF-8");
    expect(kvt::ex::Utf16String(cyrillic).size() == 4, "KOI8-R to UTF-16");
}

void failsByClass() {
    try {
        kvt::ex::AsciiString narrow(kvt::ex::Utf8String("na\xc3\xafve"));
        throw std::runtime_error("a loss went unnoticed: " + narrow.toStdString());
    } catch (const kvt::ex::UStringTranscodingException& failure) {
        expect(failure.className() == kvt::ex::Utf8String("kvt::ex::UStringTranscodingException"),
               "the class's name");
    }
    try {
        kvt::ex::Encoding nobody("no such encoding");
        throw std::runtime_error("an unknown name went unnoticed: " + std::to_string(nobody.id()));
    } catch (const kvt::ex::Throwable& failure) {
        expect(dynamic_cast<const kvt::ex::InvalidEncodingException*>(&failure) != nullptr,
               "a cast to the class");
    }
}

void keepsDataInAFile() {
    const std::string path = "consumer.kvt";
    {
        kvt::ex::mmap::memory_manager manager(path, {65536, true});
        kvt::ex::mmap::mapped_region_segment segment = manager.create_segment(1);
        segment.load(false);
        segment.segment_manager()->construct<int>("number")(42);
        manager.save({segment.index()});
        try {
            segment.segment_manager()->allocate(std::size_t(1) << 40);
            throw std::runtime_error("a full heap went unnoticed");
        } catch (const boost::interprocess::bad_alloc&) {
        }
    }
    try {
        const kvt::ex::mmap::memory_manager manager(path, {std::uint64_t(1) << 30, true});
        throw std::runtime_error("a file that is too short went unnoticed");
    } catch (const boost::interprocess::interprocess_exception& failure) {
        expect(failure.get_error_code() == boost::interprocess::size_error, "the code of a short file");
    }
    kvt::ex::mmap::memory_manager manager(path, {65536, true});
    const kvt::ex::mmap::mapped_region_segment segment = manager.open_segment(manager.restore().front());
    expect(*segment.segment_manager()->find<int>("number").first == 42, "an object in a file");
    std::remove(path.c_str());
}

} // namespace

int main() {
    try {
        converts();
        failsByClass();
        keepsDataInAFile();
    } catch (const std::runtime_error& failure) {
        std::cerr << "consumer: " << failure.what() << "\n";
        return 1;
    } catch (const kvt::ex::Throwable& failure) {
        std::cerr << "consumer: " << failure.what() << "\n";
        return 1;
    }
    std::cout << "consumer: all well\n";
}
