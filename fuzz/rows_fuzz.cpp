// The row reader and the search for borders against a reader that goes byte by byte.
//
// Input: a byte for the form, a byte for the length of the pieces in which borders are sought, then the text.
#include <fuzzing.h>

#include <reference/row_reference.h>

#include <translate/cell_text.h>
#include <translate/row_borders.h>
#include <translate/row_reader.h>

#include <string>

using namespace kvt::fuzz;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    constexpr host::RowForm forms[] = {{',', '"'}, {';', '"'}, {'\t', '\''}, {'a', 'b'}};
    Input input(data, size);
    const host::RowForm form = input.pick(forms);
    const std::size_t pieceLength = 1 + input.byte();
    const std::string text(input.rest());

    host::RowReader reader(form, text);
    std::string scratch;
    for (const kvt::test::ReferenceRow& row : kvt::test::referenceRows(text, form.delimiter, form.quote)) {
        require(reader.next(), "there is another row");
        requireEqual(reader.cellCount(), row.cells.size(), "cells of a row");
        requireEqual(static_cast<int>(reader.fault()), static_cast<int>(row.fault), "the fault of a row");
        if (row.fault != kvt::test::ReferenceFault::None) {
            requireEqual(static_cast<std::size_t>(reader.faultPlace() - text.data()), row.faultPlace,
                         "the place of a fault");
        }
        requireEqual(reader.lineEnd(), row.lineEnd, "the end of a row");
        for (std::size_t index = 0; index < row.cells.size(); ++index) {
            requireEqual(reader.cell(index), row.cells[index].asItStands, "a cell");
            if (row.fault == kvt::test::ReferenceFault::None) {
                requireEqual(host::textOfCell(reader.cell(index), form, scratch), row.cells[index].text,
                             "the text of a cell");
            }
        }
    }
    require(!reader.next(), "there is no other row");

    host::RowBorders borders(form);
    for (std::size_t at = 0; at < text.size(); at += pieceLength) {
        borders.add(std::string_view(text).substr(at, pieceLength));
    }
    requireEqual(borders.border(), kvt::test::referenceBorder(text, form.delimiter, form.quote),
                 "the last border");
    return 0;
}
