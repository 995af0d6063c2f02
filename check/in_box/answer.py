#!/usr/bin/python3 -BIS
"""Answers one question about the appliance from inside the box: QUESTION DETAILS, both in JSON's terms.

The answer is the last line on standard output.
"""

import json
import os
import sys

sys.path.append(os.path.dirname(os.path.dirname(os.path.realpath(__file__))))

import live_checks
from in_box.meaning import complaint, meaning
from in_box.panel import pages, settings


def live(name, trial):
    """The faults that a live check finds, or why it has to be skipped."""
    check = next(check for check in live_checks.CHECKS if check.name == name)
    try:
        return {"faults": live_checks.faults_of(check, live_checks.Trial(**trial))}
    except live_checks.Skip as reason:
        return {"skip": str(reason)}


def read(port, address):
    """How the panel and ifupdown read a port's settings."""
    means = meaning(port)
    return {"panel": settings([(port, address)])[0], "meaning": means,
            "complaint": "" if means is None else complaint(port)}


QUESTIONS = {
    "pages": pages,
    "settings": read,
    "live": live,
}

answer = QUESTIONS[sys.argv[1]](**json.loads(sys.argv[2]))
print(json.dumps(answer), flush=True)
# What a script has left running ends with the box.
os._exit(0)
