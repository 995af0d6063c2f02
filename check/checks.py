"""What both tables of checks are made of."""

from typing import Callable, NamedTuple


class Check(NamedTuple):
    """A row: a check has a name, a function that yields what is wrong, and says what to do then."""
    name: str
    function: Callable
    advice: str


OWN_ADVICE = "\n-> "  # stands in a fault before what is to be done, if that is not the check's advice


class Skip(Exception):
    """The reason why a check says nothing about this appliance."""
