#!/bin/sh
# Installs a build into its own folder, and runs it from there: the programs must find the libraries beside them.
#
#   install_test.sh BUILD-FOLDER
set -eu
prefix=$(mktemp -d)
trap 'rm -rf "$prefix"' EXIT
cmake --install "$1" --prefix "$prefix" >/dev/null

# What is commented in the configuration can be used as it stands, and the file is not replaced by the next installation.
grep -q '^apply = "host"' "$prefix/etc/zorvagent/agent.toml"
sed -E 's/^# ([a-z_]+ = )/\1/' "$prefix/etc/zorvagent/agent.toml" >"$prefix/all.toml"
"$prefix/bin/zorvactl" --config "$prefix/all.toml" tree >/dev/null
echo '# mine' >"$prefix/etc/zorvagent/agent.toml"
cmake --install "$1" --prefix "$prefix" >/dev/null
grep -q '^# mine' "$prefix/etc/zorvagent/agent.toml"

printf '[agent]\ndata_dir = "data/"\n[log]\ntarget = "off"\n' >"$prefix/agent.toml"
export ZORVAGENT_CONFIG="$prefix/agent.toml"
"$prefix/bin/zorvactl" enumerate ZORVA_ComputerSystem --output json >"$prefix/systems.json"
grep -q '"CreationClassName": *"ZORVA_ComputerSystem"' "$prefix/systems.json"
"$prefix/bin/zorvactl" names ZORVA_DNSGeneralSettingData >/dev/null
"$prefix/sbin/zorvacimd" --check-config --agent-config "$prefix/agent.toml" >/dev/null
