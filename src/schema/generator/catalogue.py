"""The table of provider classes that the descriptions are compared with."""

from dataclasses import dataclass

from .errors import SchemaError


@dataclass
class Row:
    where: str
    name: str
    super_name: str
    kind: str
    counts: tuple
    provider: str


def read_lines(path):
    """(place, words) of every line that is neither empty nor a comment."""
    with open(path, encoding="utf-8") as stream:
        for number, line in enumerate(stream, 1):
            words = line.split("#")[0].split()
            if words:
                yield f"{path.name}:{number}", words


def read(path):
    rows = []
    for where, words in read_lines(path):
        if len(words) != 8 or words[2] not in ("I", "A", "G") or words[7] not in ("S", "H"):
            raise SchemaError(where, "expected: class superclass I|A|G keys properties references methods S|H")
        rows.append(Row(where, words[0], words[1], words[2], tuple(int(w) for w in words[3:7]), words[7]))
    return rows


def kind_of(cls):
    return "G" if cls.is_aggregation else "A" if cls.is_association else "I"


def counts_of(cls):
    return len(cls.keys), len(cls.properties), len(cls.references), len(cls.methods)


def check(rows, classes):
    """Every row must describe its class, and every class of the provider must have a row."""
    for row in rows:
        cls = classes.get(row.name)
        if cls is None:
            raise SchemaError(row.where, f"class '{row.name}' is not described")
        got = (cls.super_class.name if cls.super_class else None, kind_of(cls), counts_of(cls))
        want = (row.super_name, row.kind, row.counts)
        if got != want:
            raise SchemaError(row.where, f"class '{row.name}' differs from its row: described {got}, listed {want}")
    listed = {row.name for row in rows}
    for cls in classes.values():
        if cls.name.startswith("TVXHBA_") and cls.name not in listed:
            raise SchemaError(cls.where, f"class '{cls.name}' is not in the catalogue")
