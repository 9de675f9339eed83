import json
import os

DATA = os.path.join(os.path.dirname(__file__), "..", "data")


def reference(name):
    with open(os.path.join(DATA, name)) as f:
        return json.load(f)
