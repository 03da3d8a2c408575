// One process of many on the same file: does what its arguments say, in order, and prints what came of it.
//
//     segment_child FILE SEGMENT_SIZE (save TAG COUNT | restore | create SIZE TAG COUNT | read INDEX)...
//
// `create` fills a segment with an array and releases it, `read` prints the first word and the number of words.
#include <mmap/segment_words.h>

#include <cstddef>
#include <exception>
#include <iostream>
#include <string>
#include <vector>

namespace {

using namespace kvt::test;

class Arguments {
public:
    Arguments(int count, char** values) : values_(values + 1, values + count) {}
    bool empty() const { return next_ == values_.size(); }
    std::string text() { return values_.at(next_++); }
    Word number() { return std::stoull(text()); }

private:
    std::vector<std::string> values_;
    std::size_t next_ = 0;
};

void print(const Words& words) {
    std::cout << words.size() << ' ' << (words.empty() ? 0 : words.front()) << ' '
              << (words.empty() ? 0 : words.back()) << '\n';
}

void create(memory_manager& manager, Arguments& arguments) {
    mapped_region_segment segment = manager.create_segment(arguments.number());
    segment.load(false);
    const Word tag = arguments.number();
    put(segment, "words", wordsOf(tag, arguments.number()));
    std::cout << segment.index() << ' ' << segment.release() << '\n';
}

int run(Arguments& arguments) {
    const std::string path = arguments.text();
    memory_manager manager(path, persistentOptions(arguments.number()));
    while (!arguments.empty()) {
        const std::string what = arguments.text();
        if (what == "save") {
            const Word tag = arguments.number();
            manager.save(toSave(wordsOf(tag, arguments.number())));
        } else if (what == "restore") {
            print(taken(manager.restore()));
        } else if (what == "create") {
            create(manager, arguments);
        } else if (what == "read") {
            mapped_region_segment segment = manager.open_segment(arguments.number());
            print(get(segment, "words"));
        } else {
            return 2;
        }
    }
    return 0;
}

} // namespace

int main(int count, char** values) {
    try {
        Arguments arguments(count, values);
        return run(arguments);
    } catch (const std::exception& failure) {
        std::cout << "threw " << failure.what() << '\n';
        return 1;
    }
}
