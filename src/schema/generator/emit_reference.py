"""The class reference: a page for people, of the same descriptions."""

from .class_model import ROOT
from .emit_host import name_space
from .errors import SchemaError


def read_descriptions(path, served):
    """Text by class name; every class that is no association needs one."""
    texts = {}
    for number, line in enumerate(path.read_text(encoding="utf-8").splitlines(), 1):
        if not line.strip() or line.startswith("#"):
            continue
        name, _, text = line.partition(" ")
        if name not in served:
            raise SchemaError(f"{path.name}:{number}", f"'{name}' is no class of the provider")
        if name in texts or not text.strip():
            raise SchemaError(f"{path.name}:{number}", f"'{name}' has no text, or a second one")
        texts[name] = text.strip()
    return texts


def kind(cls):
    for word in ("Aggregation", "Association"):
        if word in cls.qualifiers:
            return word.lower()
    return "instance"


def type_text(variable):
    if variable.is_reference and not variable.embedded:
        target = "any class" if variable.target is ROOT else variable.target.name
        return f"reference to {target}" + ("[]" if variable.is_array else "")
    if variable.embedded:
        return "embedded instance"
    return variable.type + ("[]" if variable.is_array else "")


def sentence(cls, texts):
    if cls.name in texts:
        return texts[cls.name]
    ends = [v for v in cls.variables if v.is_reference]
    return "Ties " + " to ".join(f"{type_text(v)[len('reference to '):]} (`{v.name}`)" for v in ends) + "."


def parameter_text(parameter):
    ways = [word.lower() for word in ("In", "Out") if parameter.qualifiers.get(word)]
    return f"{' and '.join(ways)} {type_text(parameter)} `{parameter.name}`"


def own_methods(cls, served):
    """Methods that a class of the provider declares; the inherited ones answer "not supported"."""
    return [m for m in cls.methods if m.origin in served]


def section(cls, texts, served, servings):
    lines = [f"### {cls.name}", "", sentence(cls, texts), "",
             f"An {kind(cls)} of `{cls.super_class.name}` in `{name_space(cls, served, servings)}`. Keys: "
             + ", ".join(f"`{v.name}`" for v in cls.variables if v.is_key) + ".", ""]
    own = [v for v in cls.variables if v.origin == cls.name and not v.is_reference]
    if own:
        lines += ["| Property of its own | Type |", "|---|---|"]
        lines += [f"| `{v.name}` | {type_text(v)} |" for v in own] + [""]
    inherited = [v.name for v in cls.variables if v.origin != cls.name and not v.is_reference]
    if inherited:
        lines += ["Inherited: " + ", ".join(f"`{name}`" for name in inherited) + ".", ""]
    for method in own_methods(cls, served):
        parameters = "; ".join(parameter_text(p) for p in method.parameters[:-1]) or "no parameters"
        lines += [f"Method `{method.name}`, {method.type}: {parameters}.", ""]
    return lines


def reference(classes, served, servings, texts):
    """The whole page."""
    missing = [name for name in served if kind(classes[name]) == "instance" and name not in texts]
    if missing:
        raise SchemaError("descriptions.txt", f"no text for {', '.join(missing)}")
    names = set(served)
    lines = ["# Class reference", "",
             "Made by `python3 src/schema/generate.py --reference docs/class-reference.md` from the class descriptions;",
             "changes here are lost. A property that the hardware does not tell is null.", ""]
    for title, wanted in (("Classes", ("instance",)), ("Associations", ("association", "aggregation"))):
        lines += [f"## {title}", ""]
        for name in sorted(served):
            if kind(classes[name]) in wanted:
                lines += section(classes[name], texts, names, servings)
    return "\n".join(lines).rstrip() + "\n"
