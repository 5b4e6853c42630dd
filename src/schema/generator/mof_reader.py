"""Strict reader of the MOF subset that the class descriptions use.

One file holds comments and class declarations. A class has qualifiers, a superclass and features;
a feature is a property, a reference or a method. Everything else is an error with file and line.
"""

import re
from dataclasses import dataclass, field

from .errors import SchemaError

TYPES = ("boolean", "uint8", "sint8", "uint16", "sint16", "uint32", "sint32", "uint64", "sint64",
         "real32", "real64", "char16", "string", "datetime")

# Qualifiers by what they may stand on. A value of True means that one takes a text in brackets.
CLASS_QUALIFIERS = {"Abstract": False, "Association": False, "Aggregation": False, "Composition": False,
                    "Indication": False, "Exception": False, "Experimental": False, "Terminal": False}
FEATURE_QUALIFIERS = {"Key": False, "Override": True, "Write": False, "Required": False, "Experimental": False,
                      "Counter": False, "Gauge": False, "Weak": False, "Aggregate": False, "EmbeddedObject": False,
                      "EmbeddedInstance": True, "OctetString": False, "DN": False, "Static": False,
                      "Expensive": False, "Large": False, "Invisible": False, "Delete": False, "IfDeleted": False}
PARAMETER_QUALIFIERS = {"In": False, "Out": False, "EmbeddedObject": False, "EmbeddedInstance": True,
                        "Required": False, "OctetString": False, "DN": False}

TOKEN = re.compile(r"""
    (?P<space>[ \t\r]+|//[^\n]*)
  | (?P<newline>\n)
  | (?P<comment>/\*.*?\*/)
  | (?P<text>"(?:[^"\\\n]|\\.)*")
  | (?P<number>[-+]?\d+(?:\.\d+)?)
  | (?P<name>[A-Za-z_]\w*)
  | (?P<sign>[\[\](){};:,=])
""", re.VERBOSE | re.DOTALL)


@dataclass
class Token:
    kind: str
    text: str
    where: str


@dataclass
class Parameter:
    """A parameter, property or reference. `type` is a type name, or the class of a reference."""
    where: str
    name: str
    type: str
    is_array: bool
    is_reference: bool
    qualifiers: dict
    default: str = None


@dataclass
class Method:
    where: str
    name: str
    type: str
    qualifiers: dict
    parameters: list


@dataclass
class ClassDeclaration:
    where: str
    name: str
    super_name: str
    qualifiers: dict
    features: list = field(default_factory=list)


def tokenize(text, file_name):
    tokens, position, line = [], 0, 1
    while position < len(text):
        match = TOKEN.match(text, position)
        if not match:
            raise SchemaError(f"{file_name}:{line}", f"unexpected character {text[position]!r}")
        kind = match.lastgroup
        if kind in ("text", "number", "name", "sign"):
            tokens.append(Token(kind, match.group(), f"{file_name}:{line}"))
        line += match.group().count("\n")
        position = match.end()
    tokens.append(Token("end", "end of file", f"{file_name}:{line}"))
    return tokens


class Reader:
    def __init__(self, text, file_name):
        self.tokens = tokenize(text, file_name)
        self.position = 0

    @property
    def next(self):
        return self.tokens[self.position]

    def take(self):
        token = self.next
        self.position += 1
        return token

    def accept(self, text):
        if self.next.text == text and self.next.kind != "text":
            return self.take()
        return None

    def expect(self, text):
        token = self.accept(text)
        if not token:
            raise SchemaError(self.next.where, f"expected '{text}', found '{self.next.text}'")
        return token

    def name(self, what):
        if self.next.kind != "name":
            raise SchemaError(self.next.where, f"expected {what}, found '{self.next.text}'")
        return self.take().text

    def declarations(self):
        result = []
        while self.next.kind != "end":
            result.append(self.class_declaration())
        return result

    def qualifiers(self, allowed, what):
        result = {}
        if not self.accept("["):
            return result
        while True:
            where = self.next.where
            name = self.name("a qualifier")
            if name not in allowed:
                raise SchemaError(where, f"unknown qualifier '{name}' on a {what}")
            if name in result:
                raise SchemaError(where, f"qualifier '{name}' stands twice")
            result[name] = self.qualifier_value(name, allowed[name])
            if not self.accept(","):
                break
        self.expect("]")
        return result

    def qualifier_value(self, name, takes_text):
        where = self.next.where
        if not self.accept("("):
            if takes_text:
                raise SchemaError(where, f"qualifier '{name}' needs a text in brackets")
            return True
        token = self.take()
        self.expect(")")
        if takes_text and token.kind == "text":
            return token.text[1:-1]
        if not takes_text and token.text.lower() in ("true", "false"):
            return token.text.lower() == "true"
        raise SchemaError(where, f"bad value of qualifier '{name}': {token.text}")

    def class_declaration(self):
        qualifiers = self.qualifiers(CLASS_QUALIFIERS, "class")
        where = self.expect("class").where
        name = self.name("a class name")
        super_name = self.name("a superclass name") if self.accept(":") else None
        result = ClassDeclaration(where, name, super_name, qualifiers)
        self.expect("{")
        while not self.accept("}"):
            result.features.append(self.feature())
        self.expect(";")
        return result

    def feature(self):
        qualifiers = self.qualifiers(FEATURE_QUALIFIERS, "feature")
        where = self.next.where
        type_name = self.name("a type")
        is_reference = self.accept("REF") is not None
        name = self.name("a feature name")
        if self.next.text == "(" and not is_reference:
            return self.method(where, name, type_name, qualifiers)
        result = self.variable(where, name, type_name, is_reference, qualifiers)
        if self.accept("="):
            result.default = self.take().text
        self.expect(";")
        return result

    def variable(self, where, name, type_name, is_reference, qualifiers):
        is_array = False
        if self.accept("["):
            self.expect("]")
            is_array = True
        if not is_reference and type_name not in TYPES:
            raise SchemaError(where, f"unknown type '{type_name}' of '{name}'")
        return Parameter(where, name, type_name, is_array, is_reference, qualifiers)

    def method(self, where, name, type_name, qualifiers):
        if type_name not in TYPES:
            raise SchemaError(where, f"unknown result type '{type_name}' of method '{name}'")
        parameters = []
        self.expect("(")
        while not self.accept(")"):
            if parameters:
                self.expect(",")
            parameters.append(self.parameter())
        self.expect(";")
        return Method(where, name, type_name, qualifiers, parameters)

    def parameter(self):
        qualifiers = self.qualifiers(PARAMETER_QUALIFIERS, "parameter")
        where = self.next.where
        type_name = self.name("a type")
        is_reference = self.accept("REF") is not None
        name = self.name("a parameter name")
        if not (qualifiers.get("In") or qualifiers.get("Out")):
            raise SchemaError(where, f"parameter '{name}' is neither In nor Out")
        return self.variable(where, name, type_name, is_reference, qualifiers)


def read_file(path):
    """The class declarations of one file."""
    with open(path, encoding="utf-8") as stream:
        return Reader(stream.read(), path.name).declarations()
