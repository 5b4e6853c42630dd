"""From declarations to classes: resolves, checks, and lays out the records."""

import re
from dataclasses import dataclass, field

from .errors import SchemaError
from .mof_reader import TYPES, Method as MethodDeclaration

HEADER_SIZE = 24  # bytes of cimrt::Instance before the first property
TYPE_WIDTH = dict(zip(TYPES, (1, 1, 1, 2, 2, 4, 4, 8, 8, 4, 8, 2, 8, 8)))
INTEGER_RANGE = {f"{sign}int{bits}": ((0, 2**bits - 1) if sign == "u" else (-2**(bits - 1), 2**(bits - 1) - 1))
                 for sign in "us" for bits in (8, 16, 32, 64)}
DATETIME_TEXT = re.compile(r'"\d{14}\.\d{6}[-+:]\d{3}"')
RESERVED_NAMES = set("""alignas alignof and asm auto bool break case catch char class concept const constexpr continue
    default delete do double else enum explicit export extern false float for friend goto if inline int long mutable
    namespace new not operator or private protected public register requires return short signed sizeof static struct
    switch template this throw true try typedef typename union unsigned using virtual void volatile while
    create magic refs meta_class static_meta_class""".split())
# Class qualifiers that a subclass of a class that has them must repeat.
INHERITED_QUALIFIERS = ("Association", "Aggregation", "Composition", "Indication")


@dataclass(eq=False)
class Variable:
    """A property, reference or parameter with its place in a record.

    `target` is the class of a reference, None for a value; a reference to any object has the target ROOT.
    """
    name: str
    type: str
    is_array: bool
    qualifiers: dict
    default: str
    origin: str
    target: object = None
    embedded: bool = False
    offset: int = 0
    kind = "variable"

    @property
    def is_reference(self):
        return self.target is not None

    @property
    def is_key(self):
        return bool(self.qualifiers.get("Key"))

    def storage(self):
        """Size and alignment in the record."""
        if self.is_array:
            return 16, 8
        if self.is_reference:
            return 8, 8
        width = TYPE_WIDTH[self.type]
        return 2 * width, width


@dataclass(eq=False)
class Method:
    name: str
    type: str
    qualifiers: dict
    parameters: list
    origin: str
    size: int = 0
    kind = "method"


@dataclass(eq=False)
class Class:
    where: str
    name: str
    super_class: object
    qualifiers: dict
    features: list = field(default_factory=list)
    locals: list = field(default_factory=list)
    size: int = HEADER_SIZE
    filled: bool = False

    @property
    def variables(self):
        return [f for f in self.features if f.kind == "variable"]

    @property
    def properties(self):
        return [f for f in self.variables if not f.is_reference]

    @property
    def references(self):
        return [f for f in self.variables if f.is_reference]

    @property
    def methods(self):
        return [f for f in self.features if f.kind == "method"]

    @property
    def keys(self):
        return [f for f in self.variables if f.is_key]

    @property
    def is_association(self):
        return "Association" in self.qualifiers

    @property
    def is_aggregation(self):
        return "Aggregation" in self.qualifiers

    def descends_from(self, other):
        return self is other or (self.super_class is not None and self.super_class.descends_from(other))

    def find(self, name):
        for index, feature in enumerate(self.features):
            if feature.name.lower() == name.lower():
                return index
        return None


ROOT = Class("", "Instance", None, {})


def lay_out(variables):
    """Places the variables behind the header, in order, in natural alignment; answers the record's size."""
    position = HEADER_SIZE
    for variable in variables:
        size, alignment = variable.storage()
        position = -(-position // alignment) * alignment
        variable.offset = position
        position += size
    return -(-position // 8) * 8


class Builder:
    def __init__(self, declarations):
        self.declarations = {}
        for declaration in declarations:
            key = declaration.name.lower()
            if key in self.declarations:
                first = self.declarations[key].where
                raise SchemaError(declaration.where, f"class '{declaration.name}' is declared twice, first at {first}")
            self.declarations[key] = declaration
        self.classes = {}

    def build(self):
        """All classes in order of their names, resolved and laid out."""
        for declaration in self.declarations.values():
            self.shell(declaration, [])
        for declaration in self.declarations.values():
            self.fill(self.classes[declaration.name])
        return {name: self.classes[name] for name in sorted(self.classes)}

    def shell(self, declaration, descendants):
        """The class without its features, after its superclass."""
        if declaration.name in self.classes:
            return self.classes[declaration.name]
        if declaration.name in descendants:
            raise SchemaError(declaration.where, f"class '{declaration.name}' is its own ancestor")
        super_class = None
        if declaration.super_name:
            parent = self.declarations.get(declaration.super_name.lower())
            if parent is None or parent.name != declaration.super_name:
                raise SchemaError(declaration.where,
                                  f"missing superclass '{declaration.super_name}' of '{declaration.name}'")
            super_class = self.shell(parent, descendants + [declaration.name])
        result = Class(declaration.where, declaration.name, super_class, declaration.qualifiers)
        self.check_class_qualifiers(result)
        self.classes[declaration.name] = result
        return result

    def check_class_qualifiers(self, cls):
        for name in INHERITED_QUALIFIERS:
            if cls.super_class and name in cls.super_class.qualifiers and name not in cls.qualifiers:
                raise SchemaError(cls.where, f"'{cls.name}' must repeat [{name}] of '{cls.super_class.name}'")
        if not cls.is_association and ("Aggregation" in cls.qualifiers or "Composition" in cls.qualifiers):
            raise SchemaError(cls.where, f"'{cls.name}' is an aggregation and no association")

    def fill(self, cls):
        if cls.filled:
            return
        cls.filled = True
        if cls.super_class:
            self.fill(cls.super_class)
            cls.features = list(cls.super_class.features)
        cls.locals = [0] * len(cls.features)
        own = {}
        for declaration in self.declarations[cls.name.lower()].features:
            if declaration.name.lower() in own:
                raise SchemaError(declaration.where, f"'{declaration.name}' is declared twice in '{cls.name}'")
            own[declaration.name.lower()] = declaration
            self.add_feature(cls, declaration)
        cls.size = lay_out(cls.variables)
        self.check_class(cls)

    def add_feature(self, cls, declaration):
        is_method = isinstance(declaration, MethodDeclaration)
        feature = self.method(cls, declaration) if is_method else self.variable(cls, declaration)
        index = cls.find(declaration.name)
        if index is None:
            if "Override" in declaration.qualifiers:
                raise SchemaError(declaration.where, f"'{declaration.name}' overrides nothing")
            cls.features.append(feature)
            cls.locals.append(1)
            return
        self.override(declaration, cls.features[index], feature)
        cls.features[index] = feature
        cls.locals[index] = 1

    def override(self, declaration, inherited, feature):
        """Checks an override and takes over what it keeps: origin, Key and default."""
        if declaration.qualifiers.get("Override") != inherited.name:
            raise SchemaError(declaration.where, f"'{feature.name}' is inherited from '{inherited.origin}': "
                              f"it needs Override(\"{inherited.name}\")")
        if inherited.kind != feature.kind:
            raise SchemaError(declaration.where, f"'{feature.name}' overrides a feature of another kind")
        feature.origin = inherited.origin
        if feature.kind == "method":
            return
        if inherited.is_reference != feature.is_reference or inherited.is_array != feature.is_array or (
                not feature.is_reference and inherited.type != feature.type):
            raise SchemaError(declaration.where, f"'{feature.name}' overrides a feature of another type")
        if feature.is_reference and inherited.target is not ROOT and not feature.target.descends_from(inherited.target):
            raise SchemaError(declaration.where, f"'{feature.target.name}' of '{feature.name}' is no subclass of "
                              f"'{inherited.target.name}', which it overrides")
        if inherited.is_key:
            feature.qualifiers = {"Key": True, **feature.qualifiers}
        if feature.default is None:
            feature.default = inherited.default

    def variable(self, cls, declaration):
        if declaration.name in RESERVED_NAMES:
            raise SchemaError(declaration.where, f"'{declaration.name}' cannot be the name of a feature")
        result = Variable(declaration.name, declaration.type, declaration.is_array, declaration.qualifiers,
                          declaration.default, cls.name)
        qualifiers = declaration.qualifiers
        if declaration.is_reference:
            result.target = self.target(declaration.where, declaration.type)
        elif "EmbeddedInstance" in qualifiers or "EmbeddedObject" in qualifiers:
            if declaration.type != "string":
                raise SchemaError(declaration.where, f"embedded '{declaration.name}' must be a string")
            name = qualifiers.get("EmbeddedInstance")
            result.target = self.target(declaration.where, name) if name else ROOT
            result.embedded = True
        if declaration.default is not None:
            self.check_default(declaration, result)
        return result

    def target(self, where, name):
        if name not in self.classes:
            raise SchemaError(where, f"unknown class '{name}'")
        return self.classes[name]

    def check_default(self, declaration, variable):
        text, kind, good = declaration.default, variable.type, False
        if variable.is_reference or variable.is_array:
            good = False
        elif kind == "boolean":
            good = text in ("true", "false")
        elif kind == "string":
            good = text.startswith('"')
        elif kind == "datetime":
            good = DATETIME_TEXT.fullmatch(text) is not None
        elif kind in INTEGER_RANGE:
            low, high = INTEGER_RANGE[kind]
            good = re.fullmatch(r"[-+]?\d+", text) is not None and low <= int(text) <= high
        elif kind in ("real32", "real64"):
            good = re.fullmatch(r"[-+]?\d+(\.\d+)?", text) is not None
        if not good:
            raise SchemaError(declaration.where, f"bad default {text} of {kind} '{variable.name}'")

    def method(self, cls, declaration):
        names = set()
        parameters = []
        for parameter in declaration.parameters:
            if parameter.name.lower() in names:
                raise SchemaError(parameter.where, f"parameter '{parameter.name}' is declared twice")
            names.add(parameter.name.lower())
            parameters.append(self.variable(cls, parameter))
        parameters.append(Variable("return_value", declaration.type, False, {"Out": True}, None, cls.name))
        result = Method(declaration.name, declaration.type, declaration.qualifiers, parameters, cls.name)
        result.size = lay_out(parameters)
        return result

    def check_class(self, cls):
        needs_key = not any(q in cls.qualifiers for q in ("Abstract", "Indication"))
        if needs_key and not cls.keys:
            raise SchemaError(cls.where, f"class '{cls.name}' has no key")
        for reference in cls.references:
            if reference.is_array:
                raise SchemaError(cls.where, f"reference '{reference.name}' of '{cls.name}' is an array")
        if cls.is_association and len(cls.references) < 2:
            raise SchemaError(cls.where, f"association '{cls.name}' has fewer than two references")


def build(declarations):
    return Builder(declarations).build()
