"""What both tables of checks are made of."""

from typing import Callable, NamedTuple


class Check(NamedTuple):
    """A row: a check has a name, a function that yields what is wrong, and says what to do then."""
    name: str
    function: Callable
    advice: str


class Skip(Exception):
    """The reason why a check says nothing about this appliance."""
