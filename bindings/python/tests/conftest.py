# SPDX-License-Identifier: Apache-2.0
import os

from hypothesis import settings

# The same examples every time; OVRIN_TEST_DIVISOR cuts their number where everything is slow.
settings.register_profile(
    "repeatable",
    derandomize=True,
    deadline=None,
    max_examples=max(5, 200 // int(os.environ.get("OVRIN_TEST_DIVISOR", "1"))),
)
settings.load_profile("repeatable")
