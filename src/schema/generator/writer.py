"""Writing of the generated files."""

COMMAND = "src/schema/generate.py"


class Output:
    """The folder of generated files. A file is only touched when its text changes."""

    def __init__(self, folder):
        self.folder = folder

    def write(self, name, inputs, text, comment="//"):
        """`inputs` names the descriptions that the file is made from; it goes into its first line."""
        full = f"{comment} Generated from {inputs} by {COMMAND}; changes here are lost.\n{text}"
        path = self.folder / name
        if path.exists() and path.read_text(encoding="utf-8") == full:
            return
        path.parent.mkdir(parents=True, exist_ok=True)
        path.write_text(full, encoding="utf-8")


def braces(items, indent="    "):
    """One item a line."""
    return "".join(f"{indent}{item},\n" for item in items)


class Pool:
    """Lists laid one behind the other in one table; equal lists share their place."""

    def __init__(self):
        self.items = []
        self.starts = {}

    def place(self, items):
        """Index of the first item of the list in the table."""
        key = tuple(items)
        if not key:
            return 0
        if key not in self.starts:
            self.starts[key] = len(self.items)
            self.items.extend(items)
        return self.starts[key]
