#!/usr/bin/python
from __future__ import absolute_import, division, print_function

__metaclass__ = type

DOCUMENTATION = r"""
---
module: zorva_dns_confirm
short_description: Keep DNS settings that are on trial
description:
  - Confirms the settings that C(zorvactl apply --confirm) has on trial on the host. Fails if there are none, because they were taken back.
  - M(zorva.dns.zorva_dns) calls this by itself.
extends_documentation_fragment: zorva.dns.zorvactl
attributes:
  check_mode:
    description: It confirms nothing then.
    support: full
"""

EXAMPLES = r"""
- name: Keep the settings after another test
  zorva.dns.zorva_dns_confirm:
"""

RETURN = r""" # """

from ansible.module_utils.basic import AnsibleModule
from ansible_collections.zorva.dns.plugins.module_utils.zorvactl import ARGUMENTS, Zorvactl


def main():
    module = AnsibleModule(argument_spec=dict(ARGUMENTS), supports_check_mode=True)
    if not module.check_mode:
        code, out, err = module.run_command(Zorvactl(module).words("confirm"))
        if code != 0:
            module.fail_json(msg="the settings are not confirmed: " + (err or out).strip(), rc=code)
    module.exit_json(changed=True)


if __name__ == "__main__":
    main()
