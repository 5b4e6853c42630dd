"""The one error that the generator reports to its user."""


class SchemaError(Exception):
    """A mistake in a description, with the place where it stands."""

    def __init__(self, where, message):
        super().__init__(f"{where}: {message}")
        self.where = where
        self.message = message
