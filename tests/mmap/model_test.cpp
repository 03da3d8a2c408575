// Random sequences of everything that can be done with a file, side by side with the same in plain memory.
#include <mmap/segment_words.h>
#include <reference/mapped_file_reference.h>

#include <boost/interprocess/containers/vector.hpp>
#include <gtest/gtest.h>

#include <cstddef>
#include <cstdint>
#include <deque>
#include <filesystem>
#include <map>
#include <optional>
#include <random>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

namespace {

using namespace kvt::test;
using kvt::ex::mmap::k_no_index;
using kvt::ex::mmap::segment_allocator;
using Growing = boost::interprocess::vector<Word, segment_allocator<Word>>;

struct ModelSegment {
    std::int64_t offset = 0;
    Word size = 0;
    std::map<std::string, Words> arrays; // by name
    std::optional<Words> growing;        // the container that is there, if it is
    bool hasHeap = false;
};

// A segment in the hands of the host, and the state that it is in.
struct Held {
    std::size_t which;
    mapped_region_segment segment;
};

class Walk {
public:
    Walk(bool isPersistent, unsigned seed)
        : persistent_(isPersistent), path_(folder_.file("backing")), random_(seed) {
        open();
        fileSize_ = persistent_ ? headerSize : 0;
    }

    void run(int steps) {
        for (int i = 0; i < steps && !::testing::Test::HasFailure(); ++i) {
            step();
            if (i % 20 == 0) {
                checkBytes();
            }
        }
        checkBytes();
        drop();
        EXPECT_EQ(std::filesystem::exists(path_), persistent_);
    }

    const std::string& log() const { return log_; }

private:
    static constexpr Word headerSize = 262144;

    Word below(Word limit) { return random_() % limit; }

    void note(const std::string& what) { log_ += what + "\n"; }

    void open() {
        manager_.emplace(path_, persistent_ ? persistentOptions(headerSize) : temporaryOptions(headerSize));
    }

    // Segments that are not loaded must not outlive their manager, so all go before it.
    void drop() {
        held_.clear();
        manager_.reset();
    }

    void step() {
        switch (below(16)) {
        case 0:
        case 1:
            create();
            break;
        case 2:
        case 3:
            openOne();
            break;
        case 4:
        case 5:
        case 6:
        case 7:
            change();
            break;
        case 8:
            release();
            break;
        case 9:
            load();
            break;
        case 10:
            forget();
            break;
        case 11:
        case 12:
            save();
            break;
        case 13:
            restore();
            break;
        case 14:
            copyHandle();
            break;
        default:
            if (below(4) == 0) {
                reopen();
            } else {
                openBeyond();
            }
        }
    }

    void create() {
        const bool withSize = below(3) != 0;
        const Word size = withSize ? 1 + below(60000) : headerSize;
        const Word rounded = (size + 4095) / 4096 * 4096;
        note("create " + std::to_string(rounded));
        Held held{segments_.size(), withSize ? manager_->create_segment(size) : manager_->create_segment()};
        EXPECT_EQ(held.segment.offset(), static_cast<std::int64_t>(fileSize_));
        EXPECT_EQ(held.segment.size(), rounded);
        EXPECT_EQ(held.segment.index(), persistent_ ? segments_.size() : k_no_index);
        EXPECT_EQ(held.segment.segment_manager(), nullptr);
        EXPECT_EQ(held.segment.release(), 0U);
        ModelSegment model;
        model.offset = static_cast<std::int64_t>(fileSize_);
        model.size = rounded;
        segments_.push_back(model);
        fileSize_ += rounded;
        held_.push_back(std::move(held));
    }

    // A segment that has never been loaded holds no heap, and opening it would take its zeros for one.
    void openOne() {
        if (!persistent_ || segments_.empty()) {
            return;
        }
        const std::size_t which = below(segments_.size());
        if (!segments_[which].hasHeap || isHeld(which)) {
            return;
        }
        note("open " + std::to_string(which));
        Held held{which, manager_->open_segment(which)};
        EXPECT_EQ(held.segment.offset(), segments_[which].offset);
        EXPECT_EQ(held.segment.size(), segments_[which].size);
        EXPECT_EQ(held.segment.index(), which);
        held_.push_back(std::move(held));
        checkLoaded(held_.back());
    }

    bool isHeld(std::size_t which) const {
        for (const Held& held : held_) {
            if (held.which == which) {
                return true;
            }
        }
        return false;
    }

    Held* any() { return held_.empty() ? nullptr : &held_[below(held_.size())]; }

    void load() {
        Held* const held = any();
        if (held == nullptr) {
            return;
        }
        note("load " + std::to_string(held->which));
        ModelSegment& model = segments_[held->which];
        held->segment.load(model.hasHeap && below(2) == 0);
        model.hasHeap = true;
        checkLoaded(*held);
        held->segment.load(below(2) == 0);
        checkLoaded(*held);
    }

    void release() {
        Held* const held = any();
        if (held == nullptr) {
            return;
        }
        note("release " + std::to_string(held->which));
        const bool loaded = held->segment.segment_manager() != nullptr;
        EXPECT_EQ(held->segment.release(), loaded ? segments_[held->which].size : 0);
        EXPECT_EQ(held->segment.segment_manager(), nullptr);
        EXPECT_EQ(held->segment.release(), 0U);
    }

    // The segment goes in the state that it is in; those of a temporary file are lost with that.
    void forget() {
        if (held_.size() < 4) {
            return;
        }
        const std::size_t place = below(held_.size());
        note("forget " + std::to_string(held_[place].which));
        held_.erase(held_.begin() + static_cast<std::ptrdiff_t>(place));
    }

    void change() {
        Held* const held = any();
        if (held == nullptr || held->segment.segment_manager() == nullptr) {
            return;
        }
        ModelSegment& model = segments_[held->which];
        const std::string name = "array " + std::to_string(below(5));
        if (below(3) == 0) {
            append(*held, model);
        } else if (model.arrays.count(name) != 0) {
            note("destroy " + name + " in " + std::to_string(held->which));
            EXPECT_TRUE(held->segment.segment_manager()->destroy<Word>(name.c_str()));
            model.arrays.erase(name);
        } else {
            putArray(*held, model, name);
        }
        checkLoaded(*held);
    }

    void putArray(Held& held, ModelSegment& model, const std::string& name) {
        const Words words = wordsOf(random_(), 1 + below(700));
        note("put " + name + " of " + std::to_string(words.size()) + " in " + std::to_string(held.which));
        try {
            put(held.segment, name, words);
            model.arrays[name] = words;
        } catch (const boost::interprocess::bad_alloc&) {
            note("which is full");
        }
    }

    void append(Held& held, ModelSegment& model) {
        note("append in " + std::to_string(held.which));
        auto* const heap = held.segment.segment_manager();
        try {
            Growing* const growing =
                heap->find_or_construct<Growing>("growing")(segment_allocator<Word>(heap));
            if (!model.growing) {
                model.growing.emplace();
            }
            for (Word i = below(200); i > 0; --i) {
                const Word word = random_();
                growing->push_back(word);
                model.growing->push_back(word);
            }
        } catch (const boost::interprocess::bad_alloc&) {
            note("which is full");
        }
    }

    void save() {
        const Words words = wordsOf(random_(), below(5) == 0 ? 0 : below(300));
        if (!persistent_) {
            manager_->save(toSave(words));
            return;
        }
        if (saved_.size() >= 40) {
            return;
        }
        note("save " + std::to_string(words.size()));
        manager_->save(toSave(words));
        saved_.push_back(words);
    }

    void restore() {
        note("restore");
        const Words words = taken(manager_->restore());
        EXPECT_EQ(words, saved_.empty() ? Words() : saved_.front());
        if (!saved_.empty()) {
            saved_.pop_front();
        }
    }

    void copyHandle() {
        note("copy the handle");
        memory_manager copy = *manager_;
        manager_.reset();
        manager_.emplace(std::move(copy));
        EXPECT_EQ(manager_->persistent(), persistent_);
        EXPECT_EQ(manager_->options().segment_size, headerSize);
    }

    void openBeyond() {
        if (!persistent_) {
            return;
        }
        for (const Word index : {Word{segments_.size()}, Word{k_no_index - 1}, ~Word{0}}) {
            try {
                manager_->open_segment(index);
                ADD_FAILURE() << "opened " << index;
            } catch (const std::out_of_range& failure) {
                EXPECT_STREQ(failure.what(), "memory_manager: segment index out of range");
            }
        }
        EXPECT_EQ(std::filesystem::file_size(path_), fileSize_);
    }

    void reopen() {
        note("reopen");
        drop();
        if (!persistent_) {
            EXPECT_FALSE(std::filesystem::exists(path_));
            segments_.clear();
            fileSize_ = 0;
        }
        open();
        EXPECT_EQ(std::filesystem::file_size(path_), fileSize_);
    }

    void checkLoaded(Held& held) {
        const ModelSegment& model = segments_[held.which];
        auto* const heap = held.segment.segment_manager();
        ASSERT_NE(heap, nullptr);
        EXPECT_EQ(heap->get_size(), model.size);
        EXPECT_EQ(heap->get_num_named_objects(), model.arrays.size() + (model.growing ? 1U : 0U));
        for (const auto& [name, words] : model.arrays) {
            EXPECT_EQ(get(held.segment, name), words) << name << " in " << held.which;
        }
        if (model.growing) {
            const Growing* const growing = heap->find<Growing>("growing").first;
            ASSERT_NE(growing, nullptr);
            EXPECT_EQ(Words(growing->begin(), growing->end()), *model.growing);
        }
    }

    // What a reader of the file finds who knows neither the manager nor any segment.
    void checkBytes() {
        const reference::RawFile file(path_);
        ASSERT_EQ(file.size(), fileSize_);
        for (const ModelSegment& model : segments_) {
            const auto position = static_cast<reference::Position>(model.offset);
            if (!model.hasHeap) {
                EXPECT_TRUE(file.zero(position, model.size)) << model.offset;
                continue;
            }
            const reference::Heap heap = reference::readHeap(file, position);
            EXPECT_EQ(heap.size, model.size);
            for (const auto& [name, words] : model.arrays) {
                EXPECT_EQ(reference::readWords(file, heap.object(name)), words)
                    << name << " at " << model.offset;
            }
        }
        if (!persistent_ || file.zero(0, headerSize)) {
            EXPECT_TRUE(saved_.empty());
            return;
        }
        const reference::Header header = reference::readHeader(file);
        EXPECT_EQ(header.saved, std::vector<Words>(saved_.begin(), saved_.end()));
        ASSERT_EQ(header.rows.size(), segments_.size());
        for (std::size_t i = 0; i < segments_.size(); ++i) {
            EXPECT_EQ(header.rows[i], (reference::SegmentRow{segments_[i].offset, segments_[i].size})) << i;
        }
    }

    bool persistent_;
    ScratchFolder folder_;
    std::string path_;
    std::mt19937 random_;
    std::string log_;
    std::optional<memory_manager> manager_;
    std::vector<Held> held_;
    std::vector<ModelSegment> segments_; // by index, or for a temporary file in order of creation
    std::deque<Words> saved_;
    Word fileSize_ = 0;
};

class MatchesModel : public ::testing::TestWithParam<unsigned> {};

void walk(bool persistent, unsigned seed) {
    Walk walk(persistent, seed);
    walk.run(400);
    if (::testing::Test::HasFailure()) {
        ADD_FAILURE() << "seed " << seed << ":\n" << walk.log();
    }
}

TEST_P(MatchesModel, OverAPersistentFile) {
    for (unsigned i = 0; i < 5; ++i) {
        walk(true, GetParam() * 100 + i);
    }
}

TEST_P(MatchesModel, OverATemporaryFile) {
    for (unsigned i = 0; i < 5; ++i) {
        walk(false, GetParam() * 100 + 50 + i);
    }
}

INSTANTIATE_TEST_SUITE_P(Seeds, MatchesModel, ::testing::Range(1U, 5U));

} // namespace
