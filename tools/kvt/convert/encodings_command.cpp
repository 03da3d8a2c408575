// `kvt encodings`: which encodings there are, and all their names.

#include "base/output.h"
#include "base/table.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "cli/output_option.h"
#include "text/encoding_catalogue.h"

#include <nlohmann/json.hpp>

namespace host {

namespace {

constexpr const char* examples = R"(kvt encodings
kvt encodings latin1 KOI8-R
kvt encodings --json | jq '.[].name')";

constexpr const char* notes = R"(For each encoding: its canonical name, its id in the library, whether every
character takes one byte, whether the library knows that ASCII characters are
their own bytes in it, and the other names that are understood. Ids from 31 on
are given out in the order of use and hold for one run of the program only.

Exit status:
  0  done
  2  not done, or a NAME is not known; the others are listed all the same)";

std::string yesOrNo(bool value) {
    return value ? "yes" : "no";
}

std::string asTable(const std::vector<EncodingEntry>& entries) {
    std::vector<std::vector<std::string>> rows = {{"name", "id", "single byte", "ASCII", "aliases"}};
    for (const EncodingEntry& entry : entries) {
        std::string aliases;
        for (const std::string& alias : entry.aliases) {
            // Some aliases contain commas but none a blank.
            aliases += (aliases.empty() ? "" : " ") + alias;
        }
        rows.push_back({entry.name, std::to_string(entry.id), yesOrNo(entry.singleByte),
                        yesOrNo(entry.asciiCompatible), aliases});
    }
    return formatTable({Align::Left, Align::Right, Align::Left, Align::Left, Align::Left}, rows);
}

std::string asJson(const std::vector<EncodingEntry>& entries) {
    nlohmann::ordered_json list = nlohmann::ordered_json::array();
    for (const EncodingEntry& entry : entries) {
        nlohmann::ordered_json object;
        object["name"] = entry.name;
        object["id"] = entry.id;
        object["singleByte"] = entry.singleByte;
        object["asciiCompatible"] = entry.asciiCompatible;
        object["aliases"] = entry.aliases;
        list.push_back(object);
    }
    return list.dump(2) + "\n";
}

class EncodingsCommand : public Command {
public:
    void declare(Syntax& syntax) override {
        syntax.operand("NAME", names_, "Encodings to list, by any of their names; all without one");
        syntax.flag("--json", json_, "Print a JSON array of objects");
        declareOutput(syntax, output_);
    }

    int run(Diagnostics& diagnostics) override {
        const EncodingCatalogue catalogue;
        std::vector<EncodingEntry> entries;
        int status = Done;
        for (const std::string& name : names_) {
            const kvt::ex::Encoding encoding = namedEncoding(name);
            if (encoding.id() == kvt::ex::Encoding::Unknown) {
                diagnostics.fail(unknownEncoding(name, catalogue));
                status = NotDone;
            } else {
                entries.push_back(catalogue.entry(encoding));
            }
        }
        if (names_.empty()) {
            entries = catalogue.all();
        }
        if (json_) {
            print(asJson(entries), output_);
        } else if (!entries.empty()) {
            print(asTable(entries), output_);
        }
        return status;
    }

private:
    std::vector<std::string> names_;
    bool json_ = false;
    std::string output_;
};

} // namespace

CommandInfo encodingsCommand() {
    return {"encodings", "List encodings and their names", examples, notes,
            std::make_unique<EncodingsCommand>()};
}

} // namespace host
