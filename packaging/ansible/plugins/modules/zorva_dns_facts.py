#!/usr/bin/python
from __future__ import absolute_import, division, print_function

__metaclass__ = type

DOCUMENTATION = r"""
---
module: zorva_dns_facts
short_description: Facts about the DNS settings of a host
description:
  - Sets the fact C(zorva_dns), the document that C(zorvactl show --output json) writes.
  - It has the interfaces with their servers in search order, domain, suffixes, state and owner, and what belongs to the host.
extends_documentation_fragment: zorva.dns.zorvactl
attributes:
  check_mode:
    description: It changes nothing.
    support: full
"""

EXAMPLES = r"""
- name: Read the DNS settings
  zorva.dns.zorva_dns_facts:

- name: Show the servers of each interface
  ansible.builtin.debug:
    msg: "{{ item.name }}: {{ item.servers | join(', ') }}"
  loop: "{{ ansible_facts.zorva_dns.interfaces }}"
"""

RETURN = r"""
ansible_facts:
  description: The document, as the JSON Schema of zorvactl describes it.
  returned: always
  type: dict
  contains:
    zorva_dns:
      description: The document.
      type: dict
      sample: {"version": 1, "system": "host1", "interfaces": [{"name": "eth0", "servers": ["192.0.2.53"]}]}
"""

from ansible.module_utils.basic import AnsibleModule
from ansible_collections.zorva.dns.plugins.module_utils.zorvactl import ARGUMENTS, Zorvactl


def main():
    module = AnsibleModule(argument_spec=dict(ARGUMENTS), supports_check_mode=True)
    module.exit_json(changed=False, ansible_facts={"zorva_dns": Zorvactl(module).json("show", "--all")})


if __name__ == "__main__":
    main()
