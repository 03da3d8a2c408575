#include <boost/container/deque.hpp>
#include <iostream>
#include <kvt/kvt.h>

using namespace kvt::ex::mmap;
using Numbers = boost::container::deque<int, segment_allocator<int>>;

int main() {
    const manager_options options{manager_options::k_default_segment_size, true};
    {
        memory_manager manager("numbers.kvt", options); // makes the file
        mapped_region_segment segment = manager.create_segment(1 << 30);
        segment.load(false);
        auto* numbers = segment.segment_manager()->construct<Numbers>("numbers")(segment.segment_manager());
        for (int i = 0; i < 1000000; ++i) {
            numbers->push_back(i);
        }
        manager.save({segment.index()});
        segment.release(); // all of it is on the disk, and none in memory
    }
    memory_manager manager("numbers.kvt", options); // as another process would, later
    mapped_region_segment segment = manager.open_segment(manager.restore()[0]);
    std::cout << segment.segment_manager()->find<Numbers>("numbers").first->back() << "\n";
}
