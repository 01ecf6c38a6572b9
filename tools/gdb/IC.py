"""Pretty-printers for GDB: they show the content of the library's values.

GDB loads this script with an installed libIC.so. With a static library, or a library that is not installed, use the
command `source tools/gdb/IC.py`. The C++ standard library's own printers show strings and containers.

A value may be damaged or not initialised yet. Its printer then shows that and raises nothing.
"""

import datetime
import functools
import itertools

import gdb
import gdb.printing
import gdb.types

# Reading a damaged value raises one of these, here or in the printers of the standard library.
UNREADABLE = (gdb.error, OverflowError, ValueError)


class Printer:
    """Shows `text(value)`, and `parts(value)`, pairs of a name and a value, as children."""

    def __init__(self, value, text=lambda value: None, parts=lambda value: (), hint=None):
        self.value, self.text, self.parts, self.hint = value, text, parts, hint

    def to_string(self):
        try:
            return self.text(self.value)
        except UNREADABLE as error:
            return unreadable(error)

    def children(self):
        try:
            yield from self.parts(self.value)
        except UNREADABLE as error:
            yield "error", unreadable(error)

    def display_hint(self):
        return self.hint


def unreadable(error):
    return f"<not readable: {error}>"


def enumerator(type_, code):
    """The name of a code, such as KIND_UINT32, or None."""
    for field in type_.unqualified().strip_typedefs().fields():
        if field.enumval == code:
            return field.name.rpartition("::")[2]
    return None


def elements(container):
    """The elements of a vector; of a map, its keys and values alternately."""
    printer = gdb.default_visualizer(container)
    for _, element in printer.children() if printer else [("", container)]:
        element.fetch_lazy()
        yield element


def quoted(string):
    """A std::string in quotes. Reads one byte first, so that unreadable memory raises an error here."""
    try:
        string.fetch_lazy()
        printer = gdb.default_visualizer(string)
        content = printer.to_string() if printer else None
        if hasattr(content, "address") and content.length != 0:  # GDB 16 refuses to read no byte
            gdb.selected_inferior().read_memory(content.address, 1)
        return string.format_string()
    except UNREADABLE as error:
        return unreadable(error)


def version(value):
    return f"{int(value['major'])}.{int(value['minor'])}"


def node_reference(value):
    try:
        sensor = enumerator(gdb.lookup_type("IC::Node::SensorType"), int(value["type"]))
    except gdb.error:  # a program without nodes lacks this type
        sensor = None
    return f"{sensor or int(value['type'])}:{int(value['id'])}"


def instant(seconds, milliseconds, scope):
    try:
        time = (datetime.datetime(1970, 1, 1) + datetime.timedelta(seconds=int(seconds))).isoformat()
        text = f"{time}.{int(milliseconds):03}Z"
    except OverflowError:  # outside the years 1 to 9999
        text = f"@{int(seconds)}.{int(milliseconds):03}"
    return f"{text}, scope {int(scope)}"


def number(value):
    code = int(value["kind_"])
    kind = enumerator(value["kind_"].type, code)
    if kind is None:
        return f"invalid kind {code}"
    content = value["value_"]  # bytes, which may be in registers and then have no address

    def read(name, offset=0):
        type_ = gdb.lookup_type(name)
        return gdb.Value(bytes(int(content[offset + i]) for i in range(type_.sizeof)), type_)

    def flag(byte):
        return ("false", "true")[byte] if byte < 2 else f"true ({byte})"

    def date_time():
        long = gdb.lookup_type("long").sizeof
        return instant(read("long"), read("unsigned short", long), content[long + 2])

    readers = {
        "KIND_BOOL": lambda: flag(int(content[0])),
        "KIND_INT": lambda: int(read("int")),
        "KIND_UINT32": lambda: int(read("unsigned int")),
        "KIND_UINT64": lambda: int(read("unsigned long long")),
        "KIND_REAL": lambda: float(read("double")),
        "KIND_VERSION": lambda: version({"major": content[0], "minor": content[1]}),
        "KIND_DATETIME": date_time,
        "KIND_NODEREF": lambda: node_reference(value["nodeRef_"]),
    }
    return f"{kind}: {readers[kind]()}" if kind in readers else kind


HELD = {
    "KIND_NUMBER": "IC::Number",
    "KIND_STRING": "std::string",
    "KIND_BUFFER": "IC::Buffer",
    "KIND_ENUMVALUE": "IC::EnumValue",
    "KIND_NUMBERARRAY": "IC::NumberArray",
    "KIND_STRINGARRAY": "IC::StringArray",
}
ARRAYS = ("KIND_NUMBERARRAY", "KIND_STRINGARRAY")
WITHOUT = 8  # a refused setKind deletes the object and adds this to the kind


def kind_and_object(value):
    """The kind and the object of a PropertyValue; each may be None."""
    code, pointer = int(value["kind_"]), value["value_"]
    kind = enumerator(value["kind_"].type, code & ~WITHOUT)
    if kind not in HELD or code & WITHOUT or int(pointer) == 0:
        return kind, None
    return kind, pointer.cast(gdb.lookup_type(HELD[kind]).pointer()).dereference()


def content_of(kind, held):
    held.fetch_lazy()
    if kind == "KIND_STRING":
        return quoted(held)
    if kind == "KIND_BUFFER" and gdb.default_visualizer(held):
        rest = elements(held)
        shown = "".join(f"{int(byte):02x}" for byte in itertools.islice(rest, gdb.parameter("print elements")))
        return shown + "..." if any(True for _ in rest) else shown or "empty"
    return held.format_string()


def property_value(value):
    kind, held = kind_and_object(value)
    if kind is None:
        return f"invalid kind {int(value['kind_'])}"
    head = kind + (" read-only" if int(value["readOnly_"]) else "")
    if held is None:
        return head if kind == "KIND_UNKNOWN" else f"{head} without an object"
    try:
        if kind not in ARRAYS:
            return f"{head}: {content_of(kind, held)}"
        return head if any(True for _ in elements(held)) else f"{head}: empty"
    except UNREADABLE as error:
        return head if kind in ARRAYS else f"{head}: {unreadable(error)}"


def property_parts(value):
    kind, held = kind_and_object(value)
    if kind in ARRAYS and held is not None:
        for i, element in enumerate(elements(held)):
            yield f"[{i}]", quoted(element) if kind == "KIND_STRINGARRAY" else element


def error_parts(value):
    status = int(value["status_"])
    yield "status", enumerator(value["status_"].type, status) or status
    yield "value", value["value_"]
    yield "message", quoted(value["message_"])


def alert_parts(value):
    yield "time", value["timeStamp_"]
    yield "severity", int(value["severity_"])
    yield "class", int(value["alertClass_"])
    yield "status", int(value["status_"])
    yield "message", quoted(value["message_"])
    for i, path in enumerate(elements(value["nodePaths_"])):
        yield f"node [{i}]", quoted(path)


def node(value):
    code = int(value["sensor_"])
    return enumerator(value["sensor_"].type, code) or f"invalid sensor {code}"


def node_parts(value):
    for name in ("path", "parent", "description"):
        yield name, quoted(value[name])
    yield "status", int(value["status"])
    properties = elements(value["properties"])
    for key, content in zip(properties, properties):
        yield f"[{int(key)}]", content


def exception_parts(value):
    yield "message", quoted(value["message"])


def date_time_printer(value):
    """None for the DateTime of the agent's own platform, which is another class."""
    if not gdb.types.has_field(value.type, "seconds_"):
        return None
    return Printer(value, lambda value: instant(value["seconds_"], value["millisecond_"], value["scope_"]))


printers = gdb.printing.RegexpCollectionPrettyPrinter("IC")
for name, what in {
    "IC::Version2": {"text": version},
    "IC::sNodeRef": {"text": node_reference},
    "IC::Number": {"text": number},
    "IC::EnumValue": {"text": lambda value: str(int(value["value_"]))},
    "IC::PropertyValue": {"text": property_value, "parts": property_parts, "hint": "array"},
    "IC::Error": {"parts": error_parts},
    "IC::Alert": {"parts": alert_parts},
    "IC::Node": {"text": node, "parts": node_parts},
    "IC::ICException": {"parts": exception_parts},
    "IC::PropertyValueInvalidKind": {"parts": exception_parts},
    "IC::NodeInvalidSensor": {"parts": exception_parts},
}.items():
    printers.add_printer(name, f"^{name}$", functools.partial(Printer, **what))
printers.add_printer("ZQ::DateTime", "^ZQ::DateTime$", date_time_printer)
gdb.printing.register_pretty_printer(gdb.current_objfile(), printers, replace=True)
