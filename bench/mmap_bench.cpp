// What it costs to keep data in a file of segments: allocations in a segment's heap, containers in it, and making
// segments. Each stands beside what else there is to use: the heap of the process, and a mapped file of
// Boost.Interprocess with its own heap, whose locks are shared between processes.

#include <kvt/mmap/memory_manager.h>

#include <boost/container/deque.hpp>
#include <boost/interprocess/managed_mapped_file.hpp>

#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <deque>
#include <filesystem>
#include <memory>
#include <random>
#include <string>
#include <unistd.h>
#include <vector>

namespace {

namespace ipc = boost::interprocess;
using kvt::ex::mmap::mapped_region_segment;
using kvt::ex::mmap::memory_manager;
using kvt::ex::mmap::segment_allocator;
using kvt::ex::mmap::segment_heap;

constexpr std::uint64_t segmentSize = 16777216;

std::string scratchFile() {
    return (std::filesystem::temp_directory_path() / ("kvt_mmap_bench_" + std::to_string(::getpid())))
        .string();
}

struct Malloc {
    void* allocate(std::size_t bytes) { return std::malloc(bytes); }
    void deallocate(void* block) { std::free(block); }
};

struct Segment {
    Segment() { segment.load(false); }
    void* allocate(std::size_t bytes) { return segment.segment_manager()->allocate(bytes); }
    void deallocate(void* block) { segment.segment_manager()->deallocate(block); }

    memory_manager manager{scratchFile(), {}};
    mapped_region_segment segment = manager.create_segment();
};

struct MappedFile {
    ~MappedFile() { std::remove(path.c_str()); }
    void* allocate(std::size_t bytes) { return file.allocate(bytes); }
    void deallocate(void* block) { file.deallocate(block); }

    std::string path = scratchFile();
    // With the algorithm of segments, so that the files are compared and not the locks of the heaps.
    ipc::basic_managed_mapped_file<char, segment_heap::memory_algorithm, ipc::iset_index> file{
        ipc::create_only, path.c_str(), segmentSize};
};

// Blocks of 16 to 512 bytes come and go in a random order, some thousand at a time.
template <typename Heap>
void allocate(benchmark::State& state) {
    Heap heap;
    std::mt19937 random(7);
    std::vector<std::size_t> sizes(4096);
    std::generate(sizes.begin(), sizes.end(), [&] { return 16 + random() % 497; });
    std::vector<void*> blocks(sizes.size(), nullptr);
    for (std::size_t i = 0; i < blocks.size(); ++i) {
        blocks[i] = heap.allocate(sizes[i]);
    }
    for (auto _ : state) {
        const std::size_t at = random() % blocks.size();
        heap.deallocate(blocks[at]);
        blocks[at] = heap.allocate(sizes[random() % sizes.size()]);
        benchmark::DoNotOptimize(blocks[at]);
    }
    for (void* const block : blocks) {
        heap.deallocate(block);
    }
}
BENCHMARK_TEMPLATE(allocate, Segment);
BENCHMARK_TEMPLATE(allocate, Malloc);
BENCHMARK_TEMPLATE(allocate, MappedFile);

constexpr std::uint64_t words = 100000;

template <typename Deque>
void fillAndSum(benchmark::State& state, Deque& deque) {
    for (auto _ : state) {
        for (std::uint64_t i = 0; i < words; ++i) {
            deque.push_back(i);
        }
        std::uint64_t sum = 0;
        for (const std::uint64_t word : deque) {
            sum += word;
        }
        benchmark::DoNotOptimize(sum);
        deque.clear();
    }
    state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(words));
}

void dequeInSegment(benchmark::State& state) {
    Segment heap;
    boost::container::deque<std::uint64_t, segment_allocator<std::uint64_t>> deque(
        heap.segment.segment_manager());
    fillAndSum(state, deque);
}
BENCHMARK(dequeInSegment);

void dequeOnTheHeap(benchmark::State& state) {
    boost::container::deque<std::uint64_t> deque;
    fillAndSum(state, deque);
}
BENCHMARK(dequeOnTheHeap);

// A new segment with its heap, of 16 MiB of which little is ever written to. The file begins anew now and then.
void createSegment(benchmark::State& state) {
    std::unique_ptr<memory_manager> manager;
    int made = 0;
    for (auto _ : state) {
        if (made++ % 256 == 0) {
            state.PauseTiming();
            manager.reset();
            manager = std::make_unique<memory_manager>(scratchFile(), kvt::ex::mmap::manager_options{});
            state.ResumeTiming();
        }
        mapped_region_segment segment = manager->create_segment();
        segment.load(false);
        benchmark::DoNotOptimize(segment.segment_manager()->allocate(100));
    }
}
BENCHMARK(createSegment)->Unit(benchmark::kMicrosecond);

void createMappedFile(benchmark::State& state) {
    for (auto _ : state) {
        {
            ipc::managed_mapped_file file(ipc::create_only, scratchFile().c_str(), segmentSize);
            benchmark::DoNotOptimize(file.allocate(100));
        }
        state.PauseTiming();
        std::remove(scratchFile().c_str());
        state.ResumeTiming();
    }
}
BENCHMARK(createMappedFile)->Unit(benchmark::kMicrosecond);

// A segment that holds something is unmapped and mapped again, without a flush: what working on many in turn costs.
void reopenSegment(benchmark::State& state) {
    const std::string path = scratchFile();
    {
        memory_manager manager(path, {segmentSize, true});
        mapped_region_segment made = manager.create_segment();
        made.load(false);
        made.segment_manager()->allocate(100);
        made = mapped_region_segment();
        for (auto _ : state) {
            mapped_region_segment segment = manager.open_segment(0);
            benchmark::DoNotOptimize(segment.segment_manager()->get_free_memory());
        }
    }
    std::remove(path.c_str());
}
BENCHMARK(reopenSegment)->Unit(benchmark::kMicrosecond);

void saveAndRestore(benchmark::State& state) {
    const std::string path = scratchFile();
    {
        memory_manager manager(path, {segmentSize, true});
        const kvt::ex::vector<unsigned long long> root(static_cast<std::uint64_t>(state.range(0)), 7);
        for (auto _ : state) {
            manager.save(root);
            benchmark::DoNotOptimize(manager.restore().size());
        }
    }
    std::remove(path.c_str());
}
BENCHMARK(saveAndRestore)->Arg(1)->Arg(1000);

} // namespace
