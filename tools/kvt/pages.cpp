// Writes the manual pages and the completions of kvt, when it is built: kvt_pages FOLDER VERSION DATE.

#include "base/output.h"
#include "cli/command_line.h"
#include "cli/completions.h"
#include "cli/manual_page.h"

#include <cstdio>
#include <exception>
#include <filesystem>
#include <string>

namespace {

namespace fs = std::filesystem;

void write(const fs::path& file, const std::string& text) {
    fs::create_directories(file.parent_path());
    host::print(text, file.string());
}

void writeManualPages(const fs::path& folder, const host::SyntaxPage& page, const host::SyntaxPage* parent,
                      const host::PageFoot& foot) {
    write(folder / (host::manualPageName(page) + ".1"), host::manualPage(page, parent, foot));
    for (const host::SyntaxPage& command : page.commands) {
        writeManualPages(folder, command, &page, foot);
    }
}

} // namespace

int main(int argc, char** argv) {
    if (argc != 4) {
        std::fputs("usage: kvt_pages FOLDER VERSION DATE\n", stderr);
        return 2;
    }
    try {
        const fs::path folder = argv[1];
        const host::SyntaxPage program = host::describeCommandLine();
        writeManualPages(folder / "man1", program, nullptr, {std::string("kvt ") + argv[2], argv[3]});
        write(folder / "bash" / "kvt", host::bashCompletion(program));
        write(folder / "zsh" / "_kvt", host::zshCompletion(program));
        write(folder / "fish" / "kvt.fish", host::fishCompletion(program));
    } catch (const std::exception& failure) {
        std::fprintf(stderr, "kvt_pages: %s\n", failure.what());
        return 2;
    }
    return 0;
}
