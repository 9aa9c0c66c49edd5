"""What the pages of all modules have in common."""
from __future__ import absolute_import, division, print_function

__metaclass__ = type


class ModuleDocFragment(object):
    DOCUMENTATION = r"""
options:
  executable:
    description: The path of C(zorvactl). By default it is looked for in the usual places.
    type: path
author: Zorva maintainers (@zorva)
"""
