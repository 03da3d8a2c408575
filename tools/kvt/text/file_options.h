// What every command takes that reads files and writes one output: FILEs, -o, --progress and, where text may be in any
// encoding, --encoding.
#pragma once

#include "base/progress.h"
#include "cli/syntax.h"
#include "text/byte_order_mark.h"

#include <memory>
#include <string>
#include <vector>

namespace host {

class Diagnostics;
class Output;

class FileOptions {
public:
    static constexpr const char* filesMeaning = "Files to read; '-' is standard input, the default";

    /// Declares -o, --progress and, as what stands last, FILE.
    void declare(Syntax& syntax, const std::string& meaning = filesMeaning);
    void declareOutput(Syntax& syntax);
    void declareEncoding(Syntax& syntax);

    // Once the command line is read. All throw Failure for what is wrong with it.

    /// Standard input where no file is named.
    std::vector<std::string> inputs() const;
    const std::string& outputPath() const { return output_; }
    TextEncoding encoding() const;
    /// No bar is drawn over what is written to the same terminal.
    Progress::Show progress() const;

private:
    std::vector<std::string> inputs_;
    std::string output_;
    std::string encoding_ = "UTF-8";
    std::string progress_ = "auto";
};

/// Throws Failure where the output would overwrite the input while it is read.
void refuseInPlace(const Output& output, const Input& input);

} // namespace host
