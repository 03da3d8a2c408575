// The main of a fuzzer in builds without libFuzzer: NAME_fuzz [FILE-OR-FOLDER...] [--rounds N]
//
// Feeds each file, then N inputs (20000 by default) from a fixed seed: damaged copies of the files, and noise.
#include <fuzzing.h>

#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <random>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;

void feed(const std::string& input) {
    LLVMFuzzerTestOneInput(reinterpret_cast<const std::uint8_t*>(input.data()), input.size());
}

std::string contents(const fs::path& path) {
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

/// In the order of their names, so that a run is the same everywhere.
std::vector<std::string> readAll(const std::vector<fs::path>& paths) {
    std::vector<fs::path> files;
    for (const fs::path& path : paths) {
        if (fs::is_directory(path)) {
            for (const fs::directory_entry& entry : fs::directory_iterator(path)) {
                files.push_back(entry.path());
            }
        } else {
            files.push_back(path);
        }
    }
    std::sort(files.begin(), files.end());
    std::vector<std::string> inputs;
    inputs.reserve(files.size());
    for (const fs::path& file : files) {
        inputs.push_back(contents(file));
    }
    return inputs;
}

std::string noise(std::mt19937_64& random) {
    std::string input(random() % 64, '\0');
    for (char& byte : input) {
        byte = static_cast<char>(random());
    }
    return input;
}

std::string damaged(std::string input, const std::vector<std::string>& others, std::mt19937_64& random) {
    for (auto changes = 1 + random() % 4; changes > 0; --changes) {
        const std::size_t at = random() % (input.size() + 1);
        switch (random() % 5) {
        case 0:
            input.insert(at, 1, static_cast<char>(random()));
            break;
        case 1:
            input.erase(at, 1 + random() % 3);
            break;
        case 2:
            input.insert(at, others.empty() ? "" : others[random() % others.size()]);
            break;
        case 3:
            input.insert(at, std::string(random() % 40, 'a'));
            break;
        default:
            if (at < input.size()) {
                input[at] = random() % 2 == 0 ? static_cast<char>(random())
                                              : "\x00\x7F\x80\xC3\xFF<>\x1B"[random() % 8];
            }
            break;
        }
    }
    return input;
}

} // namespace

int main(int argc, char** argv) {
    std::vector<fs::path> paths;
    unsigned long rounds = 20000;
    for (int i = 1; i < argc; ++i) {
        if (std::string(argv[i]) == "--rounds" && i + 1 < argc) {
            rounds = std::stoul(argv[++i]);
        } else {
            paths.emplace_back(argv[i]);
        }
    }
    const std::vector<std::string> corpus = readAll(paths);
    if (!paths.empty() && corpus.empty()) {
        std::cerr << "no corpus in " << paths.front() << '\n';
        return 1;
    }
    for (const std::string& input : corpus) {
        feed(input);
    }
    std::mt19937_64 random(20240229);
    for (unsigned long round = 0; round < rounds; ++round) {
        const bool fresh = corpus.empty() || random() % 4 == 0;
        feed(fresh ? noise(random) : damaged(corpus[random() % corpus.size()], corpus, random));
    }
    std::cout << corpus.size() << " files, " << rounds << " more inputs\n";
    return 0;
}
