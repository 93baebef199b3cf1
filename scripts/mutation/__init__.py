# SPDX-License-Identifier: Apache-2.0
"""What scripts/mutate is made of: the places where C++ can be changed, copies of the tree, and the tests that look."""
