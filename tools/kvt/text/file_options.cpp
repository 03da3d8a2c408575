#include "text/file_options.h"

#include "base/failure.h"
#include "base/output.h"
#include "cli/choices.h"
#include "cli/output_option.h"
#include "text/encoding_catalogue.h"

#include <unistd.h>

namespace host {

namespace {

const Choices<Progress::Show> progressChoices = {{"auto", Progress::Show::LongOnTerminal},
                                                 {"always", Progress::Show::Always},
                                                 {"never", Progress::Show::Never}};

} // namespace

void FileOptions::declare(Syntax& syntax, const std::string& meaning) {
    declareOutput(syntax);
    syntax.operand("FILE", inputs_, meaning);
}

void FileOptions::declareOutput(Syntax& syntax) {
    host::declareOutput(syntax, output_);
    syntax
        .flag("--progress", "always", progress_, "WHEN",
              "Say on standard error how far it is: 'auto' (default) on a terminal and for long inputs, "
              "'always', "
              "which is meant without WHEN, or 'never'")
        .takes(wordsOf(progressChoices));
}

void FileOptions::declareEncoding(Syntax& syntax) {
    syntax.option("--encoding", encoding_, "ENC", "Encoding of the text; UTF-8 without it");
}

std::vector<std::string> FileOptions::inputs() const {
    return inputsOrStandardInput(inputs_);
}

TextEncoding FileOptions::encoding() const {
    return inputEncoding(encoding_);
}

Progress::Show FileOptions::progress() const {
    const Progress::Show show = choose("--progress", progress_, progressChoices);
    const bool mayDraw = !isStandardOutput(output_) || ::isatty(STDOUT_FILENO) == 0;
    return show == Progress::Show::LongOnTerminal && !mayDraw ? Progress::Show::Never : show;
}

void refuseInPlace(const Output& output, const Input& input) {
    if (output.writesInPlaceTo(input.descriptor())) {
        throw Failure(input.name() + " is both input and output; use -o, which writes beside it");
    }
}

} // namespace host
