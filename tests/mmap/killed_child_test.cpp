// A process that is killed while it works on a persistent file, hundreds of times, at random moments.
//
// What it wrote stands in the operating system's memory of the file, which outlives it. So a segment that it
// released is whole, whenever it is killed. The table of segments and the queue of saved vectors are whole unless the
// kill comes while one of them is being changed, and the file opens again; so there the worker asks before each such
// change, and is not killed before it has reported the end of it.
#include <mmap/segment_words.h>
#include <reference/mapped_file_reference.h>

#include <gtest/gtest.h>

#include <array>
#include <chrono>
#include <csignal>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <exception>
#include <map>
#include <optional>
#include <poll.h>
#include <random>
#include <stdexcept>
#include <string>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>
#include <utility>
#include <vector>

namespace {

using namespace kvt::test;
using Clock = std::chrono::steady_clock;

constexpr Word headerSize = 1 << 20;
constexpr std::size_t arraysInASegment = 6;

struct Report {
    enum Kind : Word { asks, created, released, saved, restored, wrong };
    Kind kind;
    Word tag = 0;
    Word index = 0;
    Word offset = 0;
};
static_assert(sizeof(Report) < 512, "a pipe takes it in one piece");

// What the test knows of the file, from the reports.
struct Segment {
    Word tag;
    Word offset;
    bool whole;
};

struct Model {
    std::map<Word, Segment> segments; // by index
    std::deque<Word> saved;           // tags
    Word nextTag = 1;
};

Words savedWords(Word tag) {
    return wordsOf(tag, tag % 150);
}

Words arrayOf(Word tag, std::size_t number) {
    return wordsOf(tag * arraysInASegment + number, 20 + (tag * 31 + number * 97) % 400);
}

std::string arrayName(std::size_t number) {
    return "array " + std::to_string(number);
}

// ---- The process that is killed ----

class Worker {
public:
    Worker(const std::string& path, const Model& model, unsigned seed, int in, int out)
        : manager_(path, persistentOptions(headerSize)), model_(model), random_(seed), in_(in), out_(out) {}

    /// Reaches the header, which makes its heap in a new file: not a moment to be killed at.
    void begin() {
        ask();
        took(taken(manager_.restore()));
    }

    void step() {
        switch (random_() % 5) {
        case 0:
        case 1:
            fillSegment();
            break;
        case 2:
            ask();
            save();
            break;
        case 3:
            ask();
            took(taken(manager_.restore()));
            break;
        default:
            readSegment();
        }
    }

private:
    void send(const Report& report) {
        if (::write(out_, &report, sizeof report) != sizeof report) {
            ::_exit(0);
        }
    }

    void ask() {
        send({Report::asks});
        char answer = 0;
        if (::read(in_, &answer, 1) != 1) {
            ::_exit(0);
        }
    }

    void save() {
        const Word tag = model_.nextTag++;
        manager_.save(toSave(savedWords(tag)));
        model_.saved.push_back(tag);
        send({Report::saved, tag});
    }

    void took(const Words& words) {
        const Words expected = model_.saved.empty() ? Words() : savedWords(model_.saved.front());
        if (words != expected) {
            send({Report::wrong, words.empty() ? 0 : words.front()});
        }
        if (model_.saved.empty()) {
            send({Report::restored, 0});
        } else {
            const Word tag = model_.saved.front();
            model_.saved.pop_front();
            send({Report::restored, tag});
        }
    }

    void fillSegment() {
        const Word tag = model_.nextTag++;
        ask();
        mapped_region_segment segment = manager_.create_segment(4096 * (8 + tag % 9));
        const auto offset = static_cast<Word>(segment.offset());
        send({Report::created, tag, segment.index(), offset});
        segment.load(false);
        for (std::size_t number = 0; number < arraysInASegment; ++number) {
            put(segment, arrayName(number), arrayOf(tag, number));
        }
        // What is freed in between leaves no trace in what stays.
        put(segment, "passing", wordsOf(tag, 200));
        segment.segment_manager()->destroy<Word>("passing");
        if (tag % 3 == 0) {
            segment.release();
            segment.load(false);
        }
        segment.release();
        model_.segments[segment.index()] = {tag, offset, true};
        send({Report::released, tag, segment.index(), offset});
    }

    void readSegment() {
        if (model_.segments.empty()) {
            return;
        }
        const Word index = random_() % model_.segments.size();
        if (!model_.segments.at(index).whole) {
            return;
        }
        mapped_region_segment segment = manager_.open_segment(index);
        for (std::size_t number = 0; number < arraysInASegment; ++number) {
            if (get(segment, arrayName(number)) != arrayOf(model_.segments.at(index).tag, number)) {
                send({Report::wrong, index});
            }
        }
    }

    memory_manager manager_;
    Model model_;
    std::mt19937 random_;
    int in_;
    int out_;
};

// ---- The test's side ----

enum class When { betweenChanges, anyMoment };

class Killing {
public:
    Killing(std::string path, When when, unsigned seed)
        : path_(std::move(path)), when_(when), random_(seed) {}

    const Model& model() const { return model_; }

    // One life of a worker: it ends a random time after a random number of reports, and in any case after the change
    // that is under way, if it has leave for one. The times reach from a microsecond to some milliseconds, each
    // length as often as any other, so that they suit slow machines and fast ones.
    void run() {
        std::array<int, 2> toWorker{};
        std::array<int, 2> fromWorker{};
        ASSERT_EQ(::pipe(toWorker.data()), 0);
        ASSERT_EQ(::pipe(fromWorker.data()), 0);
        const auto seed = static_cast<unsigned>(random_());
        const pid_t process = ::fork();
        ASSERT_GE(process, 0);
        if (process == 0) {
            ::close(toWorker[1]);
            ::close(fromWorker[0]);
            beWorker(seed, toWorker[0], fromWorker[1]);
        }
        ::close(toWorker[0]);
        ::close(fromWorker[1]);
        in_ = fromWorker[0];
        out_ = toWorker[1];
        changing_ = false;
        listen(3 + random_() % 12, std::chrono::microseconds((1U << random_() % 14) + random_() % 100));
        ::kill(process, SIGKILL);
        int status = 0;
        ASSERT_EQ(::waitpid(process, &status, 0), process);
        EXPECT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == SIGKILL) << "it ended by itself: " << status;
        while (const auto report = next(0)) {
            if (report->kind != Report::asks) { // an answer would have come too late
                note(*report);
            }
        }
        ::close(in_);
        ::close(out_);
    }

private:
    [[noreturn]] void beWorker(unsigned seed, int in, int out) const {
        ::prctl(PR_SET_PDEATHSIG, SIGKILL);
        try {
            Worker worker(path_, model_, seed, in, out);
            worker.begin();
            for (;;) {
                worker.step();
            }
        } catch (const std::exception&) {
            ::_exit(3);
        }
    }

    void listen(Word reports, std::chrono::microseconds time) {
        constexpr long long patience = 60'000'000'000; // a worker that says nothing for so long hangs
        for (; reports > 0; --reports) {
            const auto report = next(patience);
            ASSERT_TRUE(report) << "the worker reports nothing";
            note(*report);
        }
        const Clock::time_point end = Clock::now() + time;
        for (;;) {
            const auto left = std::chrono::nanoseconds(end - Clock::now()).count();
            if (left <= 0 && !changing_) {
                return;
            }
            if (const auto report = next(changing_ ? patience : left)) {
                note(*report);
            } else {
                ASSERT_FALSE(changing_) << "the worker does not report the end of a change";
            }
        }
    }

    // The next report within that many nanoseconds.
    std::optional<Report> next(long long nanoseconds) const {
        const timespec time = {nanoseconds / 1'000'000'000, nanoseconds % 1'000'000'000};
        pollfd waiting = {in_, POLLIN, 0};
        Report report{};
        if (::ppoll(&waiting, 1, &time, nullptr) <= 0 ||
            ::read(in_, &report, sizeof report) != sizeof report) {
            return {};
        }
        return report;
    }

    void note(const Report& report) {
        changing_ = false;
        switch (report.kind) {
        case Report::asks:
            changing_ = when_ == When::betweenChanges;
            EXPECT_EQ(::write(out_, "", 1), 1);
            break;
        case Report::created:
            model_.segments[report.index] = {report.tag, report.offset, false};
            model_.nextTag = report.tag + 1;
            break;
        case Report::released:
            model_.segments.at(report.index).whole = true;
            break;
        case Report::saved:
            model_.saved.push_back(report.tag);
            model_.nextTag = report.tag + 1;
            break;
        case Report::restored:
            EXPECT_EQ(report.tag, model_.saved.empty() ? 0 : model_.saved.front());
            if (!model_.saved.empty()) {
                model_.saved.pop_front();
            }
            break;
        case Report::wrong:
            ADD_FAILURE() << "the worker found something else: " << report.tag;
        }
    }

    std::string path_;
    When when_;
    std::mt19937 random_;
    Model model_;
    int in_ = -1;
    int out_ = -1;
    bool changing_ = false; // the worker has leave to change the header and has not reported the end of it
};

// Every segment of which the release was reported, as it stands in the bytes of the file.
std::size_t checkReleased(const std::string& path, const Model& model) {
    const reference::RawFile file(path);
    std::size_t whole = 0;
    for (const auto& [index, segment] : model.segments) {
        if (!segment.whole) {
            continue;
        }
        ++whole;
        const reference::Heap heap = reference::readHeap(file, segment.offset);
        EXPECT_EQ(heap.objects.size(), arraysInASegment);
        for (std::size_t number = 0; number < arraysInASegment; ++number) {
            EXPECT_EQ(reference::readWords(file, heap.object(arrayName(number))),
                      arrayOf(segment.tag, number))
                << "segment " << index;
        }
    }
    return whole;
}

void checkHeader(const std::string& path, const Model& model) {
    const reference::Header header = reference::readHeader(reference::RawFile(path));
    ASSERT_EQ(header.rows.size(), model.segments.size());
    for (const auto& [index, segment] : model.segments) {
        EXPECT_EQ(header.rows.at(index).offset, static_cast<std::int64_t>(segment.offset)) << index;
        EXPECT_EQ(header.rows.at(index).size, 4096 * (8 + segment.tag % 9)) << index;
    }
    std::vector<Words> saved;
    for (const Word tag : model.saved) {
        saved.push_back(savedWords(tag));
    }
    EXPECT_EQ(header.saved, saved);
}

// The library's own view, which takes the saved vectors out.
void checkOpened(const std::string& path, const Model& model) {
    memory_manager manager(path, persistentOptions(headerSize));
    for (const auto& [index, segment] : model.segments) {
        if (segment.whole) {
            mapped_region_segment opened = manager.open_segment(index);
            EXPECT_EQ(opened.offset(), static_cast<long long>(segment.offset));
            EXPECT_EQ(get(opened, arrayName(3)), arrayOf(segment.tag, 3)) << index;
        }
    }
    EXPECT_THROW(manager.open_segment(model.segments.size()), std::out_of_range);
    for (const Word tag : model.saved) {
        EXPECT_EQ(taken(manager.restore()), savedWords(tag));
    }
    EXPECT_TRUE(manager.restore().empty());
}

// Reached before any worker runs: the first access to a new header is a change of it.
void makeFile(const std::string& path) {
    memory_manager manager(path, persistentOptions(headerSize));
    manager.restore();
}

TEST(KilledChild, BetweenChangesOfTheHeaderNothingThatWasToldIsLost) {
    std::size_t segments = 0;
    std::size_t unfinished = 0;
    Word steps = 0;
    for (unsigned round = 0; round < 20; ++round) {
        const ScratchFolder folder;
        const std::string path = folder.file("backing");
        makeFile(path);
        Killing killing(path, When::betweenChanges, 1000 + round);
        std::size_t whole = 0;
        for (int life = 0; life < 20; ++life) {
            killing.run();
            whole = checkReleased(path, killing.model());
            checkHeader(path, killing.model());
            ASSERT_FALSE(HasFailure()) << "round " << round << ", life " << life;
        }
        checkOpened(path, killing.model());
        segments += whole;
        unfinished += killing.model().segments.size() - whole;
        steps += killing.model().nextTag;
    }
    // A worker that did nothing would prove nothing, and neither would one that is never caught at work.
    EXPECT_GT(segments, 300U);
    EXPECT_GT(unfinished, 50U);
    EXPECT_GT(steps, 700U);
}

TEST(KilledChild, AtAnyMomentASegmentThatWasReleasedIsWhole) {
    std::size_t segments = 0;
    std::size_t unfinished = 0;
    for (unsigned life = 0; life < 200; ++life) {
        const ScratchFolder folder;
        const std::string path = folder.file("backing");
        makeFile(path);
        Killing killing(path, When::anyMoment, 5000 + life);
        killing.run();
        const std::size_t whole = checkReleased(path, killing.model());
        ASSERT_FALSE(HasFailure()) << "life " << life;
        segments += whole;
        unfinished += killing.model().segments.size() - whole;
    }
    EXPECT_GT(segments, 130U);
    EXPECT_GT(unfinished, 40U);
}

// A worker that gets no further than to its first question.
TEST(KilledChild, AFileThatWasMadeAndNeverUsedOpensAsANewOne) {
    const ScratchFolder folder;
    const std::string path = folder.file("backing");
    const pid_t process = ::fork();
    ASSERT_GE(process, 0);
    if (process == 0) {
        const memory_manager manager(path, persistentOptions(headerSize));
        ::raise(SIGKILL);
    }
    int status = 0;
    ASSERT_EQ(::waitpid(process, &status, 0), process);
    ASSERT_TRUE(WIFSIGNALED(status));
    ASSERT_TRUE(reference::RawFile(path).zero(0, headerSize));
    memory_manager manager(path, persistentOptions(headerSize));
    EXPECT_TRUE(manager.restore().empty());
    manager.save(toSave(wordsOf(1, 100)));
    EXPECT_EQ(manager.create_segment(4096).index(), 0U);
    const reference::Header header = reference::readHeader(reference::RawFile(path));
    EXPECT_EQ(header.rows.size(), 1U);
    EXPECT_EQ(header.saved, std::vector<Words>{wordsOf(1, 100)});
}

} // namespace
