#!/bin/sh
# Installs a build into a prefix of its own, runs it from there, and takes it away.
#
#   install_test.sh BUILD-FOLDER
set -eu
build=$1
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
prefix=$work/prefix
install() { cmake --install "$build" --prefix "$prefix" >/dev/null; }
die() {
  echo "$*" >&2
  exit 1
}
install
unset ZORVAGENT_CONFIG

# What is commented in the configuration can be used as it stands.
grep -q '^apply = "host"' "$prefix/etc/zorvagent/agent.toml"
sed -E '/^[a-z_]+ = /d; s/^#([a-z_]+ = )/\1/' "$prefix/etc/zorvagent/agent.toml" >"$work/all.toml"
"$prefix/bin/zorvactl" --config "$work/all.toml" tree >/dev/null

# The programs find the libraries beside them, and the configuration of their prefix.
"$prefix/sbin/zorvacimd" --check-config | grep -qx "$prefix/etc/zorvagent/zorvacimd.toml: good"
printf '[agent]\nsystem_name = "installed-here"\n' >"$prefix/etc/zorvagent/agent.toml"
"$prefix/bin/zorvactl" enumerate ZORVA_ComputerSystem --output json | grep -q installed-here

# Every command has its page, and the shells find their completion.
for page in man1/zorvactl.1 man1/zorvactl-show.1 man5/agent.toml.5 man5/zorvacimd.toml.5 man8/zorvacimd.8; do
  test -s "$prefix/share/man/$page"
done
for script in bash-completion/completions/zorvactl zsh/site-functions/_zorvactl fish/vendor_completions.d/zorvactl.fish; do
  test -s "$prefix/share/$script"
done
test -s "$prefix/share/zorvacimd/prometheus/zorva-alerts.yml"
test -s "$prefix/share/ansible/collections/ansible_collections/zorva/dns/plugins/modules/zorva_dns.py"
"$prefix/bin/zorvactl" names ZORVA_DNSGeneralSettingData >/dev/null
if "$prefix/bin/zorvactl" ifcfg remove none 2>"$work/error"; then die 'a file was removed that does not exist'; fi
grep -q "$prefix/var/lib/zorvagent" "$work/error" || die "another data directory: $(cat "$work/error")"

# A configuration that a person has changed is not replaced.
install
grep -q installed-here "$prefix/etc/zorvagent/agent.toml"

# No installed file names a template's variable or a path of another prefix.
units=$prefix/lib/systemd/system
grep -qx "ExecStart=$prefix/sbin/zorvacimd" "$units/zorvacimd.service"
grep -qx "ReadWritePaths=$prefix/var/lib/zorvagent" "$units/zorvacimd.service"
grep -qx "PathChanged=$prefix/var/lib/zorvagent" "$units/zorva-apply.path"
grep -qx "d $prefix/var/lib/zorvagent 0750 zorva zorva -" "$prefix/lib/tmpfiles.d/zorva.conf"
grep -q "$prefix/var/lib/zorvagent" "$prefix/lib/sysusers.d/zorva.conf"
libraries=$(dirname "$(find "$prefix" -name libzorvagent.so.1)")
for file in "$units"/* "$prefix"/lib/*.d/* "$libraries"/pkgconfig/* "$libraries"/cmake/zorvagent/*config.cmake; do
  if grep -E '@[A-Z_]+@|[ =:"](/usr|/var)/' "$file" | grep -v '^ExecReload=/bin'; then die "$file has other paths"; fi
done

# Other CIM servers find the providers by names without a version.
for name in zorvadnsclientprofileprovider zorvahostprofileprovider; do
  test -s "$libraries/cmpi/lib$name.so"
done

# It is taken away, but for the configuration that was changed.
cmake --build "$build" --target uninstall >"$work/log"
grep -q "Kept, because it was changed: $prefix/etc/zorvagent/agent.toml" "$work/log"
rm "$prefix/etc/zorvagent/agent.toml"
left=$(find "$prefix" ! -type d)
[ -z "$left" ] || die "uninstall leaves $left"
install
cmake --build "$build" --target uninstall >/dev/null
[ -z "$(ls "$prefix")" ] || die "uninstall leaves $(find "$prefix")"

# The prefix /usr has its configuration and data elsewhere. It is looked at in a directory of its own.
export DESTDIR=$work/system
cmake --install "$build" --prefix /usr >/dev/null
test -f "$DESTDIR/etc/zorvagent/agent.toml"
grep -qx 'ExecStart=/usr/sbin/zorvacimd' "$DESTDIR/usr/lib/systemd/system/zorvacimd.service"
grep -qx 'StateDirectory=zorvagent' "$DESTDIR/usr/lib/systemd/system/zorvacimd.service"
grep -qx 'd /var/lib/zorvagent 0750 zorva zorva -' "$DESTDIR/usr/lib/tmpfiles.d/zorva.conf"
cmake --build "$build" --target uninstall >/dev/null
left=$(find "$DESTDIR" ! -type d -o -name '*zorva*')
[ -z "$left" ] || die "uninstall leaves $left"
