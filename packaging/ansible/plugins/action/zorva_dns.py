"""Runs the module zorva_dns on the host, and confirms what it has left on trial by a second call from the controller."""
from __future__ import absolute_import, division, print_function

__metaclass__ = type

from ansible.plugins.action import ActionBase


class ActionModule(ActionBase):
    def run(self, tmp=None, task_vars=None):
        result = super(ActionModule, self).run(tmp, task_vars)
        result.update(self._execute_module(module_name="zorva.dns.zorva_dns", task_vars=task_vars))
        if result.get("failed") or not result.get("trial"):
            return result
        # The way to the host may be broken now: a connection that is still open would not show that.
        if self._connection.transport != "local":
            self._connection.reset()
        arguments = {"executable": self._task.args.get("executable")}
        confirmed = self._execute_module(module_name="zorva.dns.zorva_dns_confirm", module_args=arguments, task_vars=task_vars)
        if confirmed.get("failed"):
            reason = confirmed.get("msg", "no reason is known")
            result.update(failed=True, msg="the settings are not confirmed, and the host takes them back: " + reason)
        else:
            result["trial"] = False
        return result
