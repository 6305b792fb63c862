"""Shows the library's values in gdb: texts, byte buffers, unknown fields and messages, these by their fields.

Loaded of itself with the shared library; otherwise by "source orv.py". See docs/how-to.md.
"""

import gdb
import gdb.printing


def bytes_of(inline_bytes):
    """Where an InlineBytes has its bytes, and how many they are."""
    raw = inline_bytes["raw_"]
    capacity = raw.type.range()[1]
    tag = int(raw[capacity])
    if tag != 0xFF:
        return raw[0].address, tag
    pointer = raw[0].type.pointer()
    block = raw[0].address.cast(pointer.pointer())
    return block[0], int(block[1].cast(gdb.lookup_type("unsigned long")))


def memory(pointer, size):
    return bytes(gdb.selected_inferior().read_memory(int(pointer), size)) if size else b""


def shown(data):
    """Bytes in hexadecimal digits, the first ones of many."""
    limit = gdb.parameter("print elements") or len(data)
    return f"{len(data)} bytes: {data[:limit].hex(' ')}{'...' if len(data) > limit else ''}" if data else "no bytes"


class TextPrinter:
    def __init__(self, value):
        self.value = value

    def to_string(self):
        pointer, size = bytes_of(self.value["bytes_"])
        return pointer.cast(gdb.lookup_type("char").pointer()).lazy_string("utf-8", length=size)

    def display_hint(self):
        return "string"


class ByteBufferPrinter:
    def __init__(self, value):
        self.value = value

    def to_string(self):
        return "{" + shown(memory(*bytes_of(self.value["bytes_"]))) + "}"


class UnknownStoragePrinter:
    def __init__(self, value):
        self.value = value

    def to_string(self):
        block = self.value["block_"]
        return "{" + shown(memory(block + 1, int(block["size"])) if block else b"") + "}"


class MessagePrinter:
    """The fields that a message holds; what is absent, empty or at its default of zero is left out."""

    def __init__(self, value):
        self.value = value

    def to_string(self):
        return str(self.value.type.unqualified().strip_typedefs())

    def children(self):
        return list(self.fields(self.value))

    def fields(self, value):
        unknown = []
        for field in value.type.strip_typedefs().fields():
            if not hasattr(field, "bitpos"):  # static
                continue
            held = value[field]
            if field.is_base_class:
                found = list(self.fields(held))
                unknown += [child for child in found if child[0] == "unknownFields"]
                yield from (child for child in found if child[0] != "unknownFields")
            elif field.name == "unknownFields_":
                if held["block_"] and int(held["block_"]["size"]):
                    unknown.append(("unknownFields", held))
            elif not is_default(held):
                yield field.name.rstrip("_"), contained(held)
        yield from unknown


def name_of(type):
    return type.unqualified().strip_typedefs().name or ""


def contained(value):
    """What an optional or a variant of libstdc++'s holds."""
    name = name_of(value.type)
    if name.startswith("std::optional<"):
        return contained(value["_M_payload"]["_M_payload"]["_M_value"])
    if name.startswith("std::variant<"):
        held = value.type.strip_typedefs().template_argument(int(value["_M_index"]))
        return value.address.cast(held.pointer()).dereference()
    return value


def is_default(value):
    type = value.type.strip_typedefs()
    name = name_of(type)
    if name.startswith("std::optional<"):
        return not value["_M_payload"]["_M_engaged"]
    if name.startswith("std::vector<"):
        return value["_M_impl"]["_M_start"] == value["_M_impl"]["_M_finish"]
    if name in ("orv::v0::Text", "orv::v0::ByteBuffer"):
        return bytes_of(value["bytes_"])[1] == 0
    return type.code == gdb.TYPE_CODE_BOOL and not value


def is_message(type):
    for field in type.strip_typedefs().fields():
        if field.is_base_class and (field.name.startswith("orv::v0::Message<") or is_message(field.type)):
            return True
    return False


class Printers(gdb.printing.PrettyPrinter):
    BY_NAME = {
        "orv::v0::Text": TextPrinter,
        "orv::v0::ByteBuffer": ByteBufferPrinter,
        "orv::v0::UnknownStorage": UnknownStoragePrinter,
    }

    def __init__(self):
        super().__init__("orv")

    def __call__(self, value):
        type = value.type.unqualified().strip_typedefs()
        if type.code != gdb.TYPE_CODE_STRUCT:
            return None
        printer = self.BY_NAME.get(type.name) or (MessagePrinter if is_message(type) else None)
        return printer(value) if printer else None


gdb.printing.register_pretty_printer(gdb.current_objfile(), Printers(), replace=True)
