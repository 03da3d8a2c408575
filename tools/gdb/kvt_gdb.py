# Pretty-printers of gdb for the strings, arrays, views, failures and encodings of kvt.
#
# It is installed under the name by which gdb loads it together with libkvt.so; `source` on this file does the same by
# hand. Nothing here calls a function of the program, so that core dumps show as much as a living process. What user
# programs have no type information for, which is the inside of failures, is read by its place in memory; the places
# are those of the library that this file is installed with.

import codecs
import re

import gdb
import gdb.printing
import gdb.types

WORD = gdb.lookup_type("unsigned long").sizeof

FIXED_NAMES = (
    ["UTF-8", "US-ASCII", "UTF-16LE", "UTF-32LE", "UTF-16BE", "UTF-32BE"]
    + ["ISO-8859-%d" % part for part in range(1, 10)]
    + ["iso-8859-11-2001", "ISO-8859-13", "ISO-8859-15"]
    + ["windows-%d" % page for page in range(1250, 1259)]
    + ["zqt-system", "zqt-binary", "zqt-wwjd", "Unknown Encoding"]
)
UTF16, UTF32, SYSTEM, BINARY, WWJD, UNKNOWN = 2, 3, 27, 28, 29, 30

STRING_SIZE = 6 * WORD  # of a UString with a fixed encoding; behind it a UString<30> has its encoding, in a word


# ---- Memory

def read(address, size):
    return bytes(gdb.selected_inferior().read_memory(address, size))


def little_or_big():
    return "big" if "big endian" in gdb.execute("show endian", to_string=True) else "little"


def word(address):
    return int.from_bytes(read(address, WORD), little_or_big())


def number(address):
    """A 32-bit number."""
    return int.from_bytes(read(address, 4), little_or_big())


def address_of_symbol(name):
    try:
        return int(gdb.parse_and_eval("(unsigned long)&'%s'" % name))
    except gdb.error:
        return None


# ---- Encodings

def registered_name(encoding):
    """The name that the program's own registry holds, or None while there is no registry or no such name."""
    view = address_of_symbol("kvt::ex::detail::encodingNames")
    if view is None or word(view) == 0:
        return None
    if encoding < len(FIXED_NAMES):
        entry = word(view) + encoding * 2 * WORD  # of std::string_view: the count, then the pointer
        return read(word(entry + WORD), word(entry)).decode("ascii", "replace")
    return deque_of_strings(word(view + WORD), encoding - len(FIXED_NAMES))


def deque_of_strings(deque, index):
    """The element of a std::deque<std::string>, or None behind its end."""
    size, in_block = 4 * WORD, 512 // (4 * WORD)
    # After the map and its size come two iterators of four words: the element, its block's begin and end, the block.
    first, first_block_begin, first_node = (word(deque + at * WORD) for at in (2, 3, 5))
    last, last_block_begin, last_node = (word(deque + at * WORD) for at in (6, 7, 9))
    offset = (first - first_block_begin) // size + index
    block, at = divmod(offset, in_block)
    end = (last_node - first_node) // WORD * in_block + (last - last_block_begin) // size
    if offset >= end:
        return None
    string = word(first_node + block * WORD) + at * size
    return read(word(string), word(string + WORD)).decode("ascii", "replace")


def name_of(encoding):
    if encoding == SYSTEM:
        evaluated = registered_name(SYSTEM)
        return "zqt-system" if evaluated is None else "zqt-system (%s)" % evaluated
    if encoding < len(FIXED_NAMES):
        return FIXED_NAMES[encoding]
    return registered_name(encoding) or "encoding %d" % encoding


def codec_of(encoding):
    """The name of Python's codec for an encoding, or None."""
    if encoding == WWJD:
        return "ascii"
    name = registered_name(SYSTEM) if encoding == SYSTEM else name_of(encoding)
    if encoding in (BINARY, UNKNOWN) or not name:
        return None
    candidates = [name]
    # Names such as windows-874-2000, ibm-720_P100-1997, IBM852 and iso-8859-11-2001.
    page = re.match(r"(?:windows|ibm|cp)-?(\d+)", name, re.IGNORECASE)
    if page:
        candidates.append("cp" + page.group(1))
    part = re.match(r"iso-8859-(\d+)", name, re.IGNORECASE)
    if part:
        candidates.append("iso8859-" + part.group(1))
    for candidate in candidates:
        try:
            if codecs.lookup(candidate)._is_text_encoding:
                return candidate
        except LookupError:
            pass
    return None


# ---- Text

ESCAPES = {"\n": "\\n", "\r": "\\r", "\t": "\\t", "\0": "\\0"}


def escaped(character, quoted):
    """A character as it is shown; a lone surrogate stands for itself, or for a byte that is not text (see decoded)."""
    code = ord(character)
    if character in ESCAPES:
        return ESCAPES[character]
    if quoted and character in '"\\':
        return "\\" + character
    if code < 32 or 127 <= code < 160:
        return "\\x%02X" % code
    if 0xD800 <= code < 0xE000:
        return "\\u%04X" % code
    return character


def characters(data, codec, errors, cut):
    """Decodes. Where the bytes were cut off, an incomplete last character goes."""
    return codecs.getincrementaldecoder(codec)(errors).decode(data, not cut)


def decoded(data, encoding, quoted=True, cut=False):
    """The shown form of bytes in an encoding; what is not text in it is shown as numbers."""
    if encoding == UTF16:
        codec = "utf-16-" + {"little": "le", "big": "be"}[little_or_big()]
        text = characters(data, codec, "surrogatepass", cut)
        return "".join(escaped(character, quoted) for character in text)
    if encoding == UTF32:
        units = (data[at:at + 4] for at in range(0, len(data), 4))
        numbers = (int.from_bytes(unit, little_or_big()) for unit in units)
        return "".join(escaped(chr(n), quoted) if n < 0x110000 else "\\U%08X" % n for n in numbers)
    codec = codec_of(encoding)
    if codec is not None:
        try:
            return "".join(
                "\\x%02X" % (ord(character) - 0xDC00) if 0xDC80 <= ord(character) < 0xDD00
                else escaped(character, quoted)
                for character in characters(data, codec, "surrogateescape", cut))
        except UnicodeDecodeError:
            pass
    return "".join("\\x%02X" % byte if byte >= 128 else escaped(chr(byte), quoted) for byte in data)


def shown(text, charset):
    """`text` with what the charset cannot express as numbers."""
    try:
        return text.encode(charset, "backslashreplace").decode(charset)
    except LookupError:
        return text.encode("ascii", "backslashreplace").decode("ascii")


def for_value(text):
    return shown(text, gdb.target_charset())


def for_child(text):
    return shown(text, gdb.host_charset() if hasattr(gdb, "host_charset") else gdb.target_charset())


def limited(pointer, count, unit_size):
    """The bytes of at most as many units as `set print elements` allows, and what to write behind them."""
    limit = gdb.parameter("print elements") or count
    return read(pointer, min(count, limit) * unit_size) if count else b"", "..." if count > limit else ""


def plural(count, what):
    return "%d %s%s" % (count, what, "" if count == 1 else "s")


def text_of(pointer, count, encoding, unit_size, named):
    """A text with its encoding and size, as strings and views are shown."""
    try:
        data, more = limited(pointer, count, unit_size)
    except gdb.MemoryError:
        return "<%s at 0x%x, which cannot be read>" % (plural(count, "unit"), pointer)
    return '"%s"%s (%s, %s)' % (decoded(data, encoding, cut=bool(more)), more, named, plural(count, "unit"))


def unit_size_of(encoding):
    return {UTF16: 2, UTF32: 4}.get(encoding, 1)


def string_parts_at(address, kind):
    """Pointer, size and encoding of the UString<kind> at an address."""
    encoding = number(address + STRING_SIZE) if kind == UNKNOWN else kind
    return word(address), word(address + WORD), encoding


def text_of_string(parts, kind):
    pointer, size, encoding = parts
    return text_of(pointer, size, encoding, unit_size_of(kind), name_of(encoding))


def array_parts_at(address):
    """Size and data of the vector at an address: behind the table come size, capacity, deleter (four words) and data."""
    return word(address + WORD), word(address + 7 * WORD)


# ---- Strings, views, arrays, encodings

class StringPrinter:
    """UString<N>: "text" (encoding, n units)."""

    def __init__(self, value, encoding):
        self.value, self.encoding = value, encoding

    def to_string(self):
        return for_value(text_of_string(self.parts(), self.encoding))

    def parts(self):
        # By place, since a compiler may leave the type of standard strings out of a program's type information; by
        # name for what is not in memory, such as a copy that gdb holds.
        if self.value.address is not None:
            return string_parts_at(int(self.value.address), self.encoding)
        storage = self.value["storage_"]
        encoding = int(self.value["encoding_"]["id_"]) if self.encoding == UNKNOWN else self.encoding
        return int(storage["_M_dataplus"]["_M_p"]), int(storage["_M_string_length"]), encoding


class ViewPrinter:
    """UStringView<N>, shown as a string. That of N = 30 has no encoding, and its bytes are shown as bytes."""

    def __init__(self, value, encoding):
        self.value, self.encoding = value, encoding

    def to_string(self):
        named = "no encoding" if self.encoding == UNKNOWN else name_of(self.encoding)
        return for_value(text_of(int(self.value["data_"]), int(self.value["size_"]), self.encoding,
                                 unit_size_of(self.encoding), "view, " + named))


class ArrayPrinter:
    """vector<T>: the number of elements, and the elements."""

    def __init__(self, value, what):
        self.value, self.what = value, what

    def to_string(self):
        return "%s of %s" % (self.what, plural(int(self.value["size_"]), "element"))

    def children(self):
        data = self.value["data_"]
        for index in range(int(self.value["size_"])):
            yield "[%d]" % index, (data + index).dereference()

    def display_hint(self):
        return "array"


class StringArrayPrinter(ArrayPrinter):
    """UStringArray<N>, shown as a vector of its strings. Its type is described in the library alone, and in a
    stripped one nowhere, so it is read by place."""

    def __init__(self, value, encoding):
        super().__init__(value, "array" if encoding == UNKNOWN else "%s array" % FIXED_NAMES[encoding])
        self.encoding = encoding

    def to_string(self):
        if self.value.address is None:
            return super().to_string()
        return "%s of %s" % (self.what, plural(array_parts_at(int(self.value.address))[0], "element"))

    def children(self):
        if self.value.address is None:
            yield from super().children()
            return
        size, data = array_parts_at(int(self.value.address))
        step = STRING_SIZE + (WORD if self.encoding == UNKNOWN else 0)
        try:
            for index in range(size):
                parts = string_parts_at(data + index * step, self.encoding)
                yield "[%d]" % index, for_child(text_of_string(parts, self.encoding))
        except gdb.MemoryError:
            return


class EncodingPrinter:
    """Encoding: its name and number."""

    def __init__(self, value):
        self.value = value

    def to_string(self):
        encoding = int(self.value["id_"])
        return for_value("%s (%d)" % (name_of(encoding), encoding))


# ---- Failures

def class_at(address):
    """The name of the class of an object with virtual functions, from its run-time type: `Inner` of a::b::Inner."""
    name = word(word(word(address) - WORD) + WORD)
    mangled = b""
    while not mangled.endswith(b"\0") and len(mangled) < 1000:
        mangled += read(name + len(mangled), 1)
    return unmangled(mangled[:-1].decode("ascii", "replace"))


def unmangled(name):
    """The qualified name of a class from the ABI's name of it; other names are returned as they are."""
    nested = re.fullmatch(r"N(.*)E", name)
    rest, parts = (nested.group(1) if nested else name), []
    while rest:
        length = re.match(r"\d+", rest)
        if not length:
            return name
        end = length.end() + int(length.group())
        parts.append(rest[length.end():end])
        rest = rest[end:]
    return "::".join(parts)


def string_at(address):
    """The text of the UString<0> at an address, without quotes."""
    data, more = limited(word(address), word(address + WORD), 1)
    return decoded(data, 0, quoted=False, cut=bool(more)) + more


def array_at(address):
    """The texts of the UStringArray<0> at an address, without quotes."""
    size, data = array_parts_at(address)
    return [string_at(data + index * STRING_SIZE) for index in range(size)]


def item_at(address):
    """An item of a failure, as what() would show it. Behind the table come the item's fields in order."""
    kind, fields = class_at(address).rpartition("::")[2], address + WORD
    if kind == "ExceptionMessageString":
        return string_at(fields)
    if kind == "ExceptionNameValue":
        return "%s=%s" % (string_at(fields), string_at(fields + STRING_SIZE))
    if kind == "ExceptionStackFrame":
        line = int.from_bytes(read(fields + 2 * STRING_SIZE, 4), little_or_big(), signed=True)
        return "%s::%s::%d" % (string_at(fields), string_at(fields + STRING_SIZE), line)
    if kind == "ExceptionMessage":
        parameters = "".join(" %%%d=%s" % pair for pair in enumerate(array_at(fields + WORD)))
        return "msgnum=%d%s" % (number(fields), parameters)
    return "<an item of class %s>" % kind


class FailurePrinter:
    """A Throwable: its class, and the items of its list."""

    def __init__(self, value):
        self.address = int(value.address)

    def items(self):
        """The addresses of the items; None after a move."""
        # Behind the table is the pointer to the list, a vector of shared pointers.
        items = word(self.address + WORD)
        return range(word(items), word(items + WORD), 2 * WORD) if items else None

    def to_string(self):
        try:
            items, name = self.items(), class_at(self.address)
        except gdb.MemoryError:
            return "<a failure that cannot be read>"
        return for_value(name + (", moved from" if items is None else " with " + plural(len(items), "item")))

    def children(self):
        try:
            for index, item in enumerate(self.items() or ()):
                yield "[%d]" % index, for_child(item_at(word(item)))
        except gdb.MemoryError:
            return

    def display_hint(self):
        return "array"


# ---- Which printer for which type

TEMPLATE = re.compile(r"kvt::ex::(UString|UStringView|UStringArray)<\(?(\d+)[uUlL]*\)?>")


def is_failure(type_):
    if type_.name == "kvt::ex::Throwable":
        return True
    return any(field.is_base_class and is_failure(field.type) for field in type_.fields())


class Printers(gdb.printing.PrettyPrinter):
    """Finds the printer of a value by its type."""

    def __init__(self):
        super().__init__("kvt")

    def __call__(self, value):
        type_ = gdb.types.get_basic_type(value.type)
        if type_.code != gdb.TYPE_CODE_STRUCT or type_.name is None:
            return None
        template = TEMPLATE.fullmatch(type_.name)
        if template:
            kind, encoding = template.group(1), int(template.group(2))
            if kind == "UString":
                return StringPrinter(value, encoding)
            if kind == "UStringView":
                return ViewPrinter(value, encoding)
            return StringArrayPrinter(value, encoding)
        if type_.name == "kvt::ex::Encoding":
            return EncodingPrinter(value)
        if type_.name.startswith("kvt::ex::vector<"):
            return ArrayPrinter(value, "vector")
        if value.address is not None and is_failure(type_):
            return FailurePrinter(value)
        return None


gdb.printing.register_pretty_printer(gdb.current_objfile(), Printers(), replace=True)
