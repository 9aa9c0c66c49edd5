# inside.sh STEP: what ./test package does inside the fresh system. /packages has the packages, /packages/next the same in the
# next version. Without a network but loopback and eth0; everything that apt installs was fetched before.
set -u

failed=0

# check SENTENCE COMMAND...: the sentence is true if the command succeeds.
check() {
  local sentence=$1 output
  shift
  if output=$("$@" 2>&1); then
    printf 'ok      %s\n' "$sentence"
  else
    printf 'FAILED  %s\n' "$sentence"
    printf '%s\n' "$output" | sed 's/^/          /'
    failed=1
  fi
}

quietly() { "$@" >/tmp/apt.log 2>&1 || { cat /tmp/apt.log; return 1; }; }
apt() { quietly apt-get -y -q --no-install-recommends -o Dpkg::Options::=--force-confold "$@"; }
ours='zorva zorvactl zorvacimd libzorvagent1 zorva-bmc zorva-providers libzorvagent-dev'

is() { [ "$1" = "$2" ] || { printf 'is "%s", not "%s"\n' "$1" "$2"; return 1; }; }
stat_is() { is "$(stat -c '%U:%G %a' "$1")" "$2"; }
gone() { [ ! -e "$1" ]; }
as() { setpriv --reuid "$1" --regid "$(id -g "$1")" --init-groups "${@:2}"; }
says() { local text=$1; shift; "$@" 2>&1 | tee /tmp/said | grep -q -e "$text" || { cat /tmp/said; return 1; }; }

all_files() {
  find / -xdev \( -path /proc -o -path /tmp -o -path /packages -o -path /var/cache -o -path /var/lib/apt -o -path /var/log/apt \
    -o -path /var/lib/dpkg/info -o -name '*-old' -o -name '.pwd.lock' -o -path '/etc/*-' \) -prune -o -print | sort
}

step_install() {
  # What others need is there before, so that the lists of files show only what these packages leave.
  local others
  others=$(apt-get -s --no-install-recommends install /packages/*.deb | awk '$1 == "Inst" { print $2 }' | grep -v zorva)
  # shellcheck disable=SC2086  # the list is words
  check 'what the packages need can be installed' apt install $others
  all_files >/packages/before
  check 'the packages can be installed' apt install /packages/*.deb
}

step_installed() {
  check 'there is a user zorva' id zorva
  check 'it cannot log in' is "$(getent passwd zorva | cut -d: -f6,7)" /var/lib/zorvagent:/usr/sbin/nologin
  check 'the data directory belongs to it' stat_is /var/lib/zorvagent 'zorva:zorva 750'
  check 'the configuration belongs to root' stat_is /etc/zorvagent 'root:root 755'
  check 'agent.toml is readable by all' stat_is /etc/zorvagent/agent.toml 'root:root 644'
  check 'zorvacimd.toml is readable by all' stat_is /etc/zorvagent/zorvacimd.toml 'root:root 644'
  check 'both are conffiles' is "$(dpkg-query -W -f '${Conffiles}\n' zorva-providers zorvacimd | awk '/toml/ { print $1 }' | sort | tr '\n' ' ')" \
    '/etc/zorvagent/agent.toml /etc/zorvagent/zorvacimd.toml '
  for unit in zorvacimd.service zorvacimd.socket zorva-apply.path; do
    check "$unit is enabled" is "$(systemctl --root=/ is-enabled $unit)" enabled
  done
  check 'the lines of the units are good' is \
    "$(systemd-analyze --man=no verify /lib/systemd/system/zorva*.* 2>&1)" ''
  for link in /usr/lib/*/cmpi/libzorva*.so; do
    check "$link leads to a library" test -f "$link"
  done
  check 'there are two such links' is "$(ls /usr/lib/*/cmpi | wc -l)" 2
  check 'the classes are there as MOF' test -s /usr/share/zorva-providers/mof/zorva.mof
  check 'bash completes zorvactl' test -s /usr/share/bash-completion/completions/zorvactl
}

step_show() {
  printf 'nameserver 192.0.2.53\nsearch example.org\n' >/etc/resolv.conf
  check 'root sees eth0' says 192.0.2.53 zorvactl show
  check 'so does any user' says 192.0.2.53 as nobody zorvactl show
  check 'with exit status 0' as nobody zorvactl --quiet show
  check 'with one warning, of what this user may not read' is "$(as nobody zorvactl show 2>&1 >/dev/null | wc -l)" 1
  check 'any user sees an interface' says example.org as nobody zorvactl show eth0
  check 'root can make a settings file' zorvactl --quiet ifcfg init eth0
  check 'and change it' zorvactl --quiet dns set eth0 192.0.2.1
  check 'any user still sees the host' as nobody zorvactl --quiet show
}

# The server as its unit starts it, without systemd.
step_serve() {
  local server
  install -d -o zorva -g zorva /run/zorvacimd
  check 'the installed configuration of the server is good' as zorva zorvacimd --check-config
  setpriv --reuid zorva --regid zorva --init-groups zorvacimd >/tmp/server.log 2>&1 &
  server=$!
  for _ in $(seq 50); do
    [ ! -S /run/zorvacimd/cim.sock ] || break
    sleep 0.1
  done
  check 'zorvactl asks it over HTTP' says eth0 as nobody zorvactl --url http://localhost:5988/root/cimv2 show
  check 'wbemcli asks it' says 'Name="eth0"' wbemcli ein http://localhost:5988/root/cimv2:ZORVA_DNSProtocolEndPoint
  check 'any user sees what is stored, through the server' says 192.0.2.1 as nobody zorvactl show
  check 'no other user can change it' says ACCESS_DENIED as nobody zorvactl --url unix: dns set eth0 192.0.2.2
  kill "$server"
  wait "$server"
  check 'it ends well' is "$?" 0
}

step_upgrade() {
  local before=/tmp/ifcfg-before
  cp /var/lib/zorvagent/ifcfg-eth0 "$before"
  check 'the same packages can be installed again' apt install --reinstall /packages/*.deb
  sed -i 's/^#port = 5988/port = 5999/' /etc/zorvagent/zorvacimd.toml
  echo '# mine' >>/etc/zorvagent/agent.toml
  check 'the next version can be installed' apt install /packages/next/*.deb
  check 'it is installed' is "$(dpkg-query -W -f '${Version}' zorvactl)" "$(dpkg-deb -f /packages/next/zorvactl_*.deb Version)"
  check 'a configuration that was changed is kept' grep -q '^port = 5999' /etc/zorvagent/zorvacimd.toml
  check 'also if the new package has another' grep -q '^# mine' /etc/zorvagent/agent.toml
  check 'the data is kept' cmp "$before" /var/lib/zorvagent/ifcfg-eth0
  check 'so are its owner and rights' stat_is /var/lib/zorvagent 'zorva:zorva 750'
  check 'zorvactl works' as nobody zorvactl --quiet show
}

step_remove() {
  zorvactl --quiet user add someone --password-stdin <<<'a long password' 2>/dev/null
  # shellcheck disable=SC2086
  check 'the packages can be removed' apt remove $ours
  check 'no program is left' gone /usr/bin/zorvactl
  check 'the configuration is left' grep -q '^port = 5999' /etc/zorvagent/zorvacimd.toml
  check 'the data is left' test -f /var/lib/zorvagent/ifcfg-eth0
  # shellcheck disable=SC2086
  check 'the packages can be purged' quietly dpkg --purge $ours
  all_files >/packages/after
  check 'the purge leaves no file' diff /packages/before /packages/after
}

active() { is "$(systemctl is-active "$@" | sort -u)" active; }

# As a service of systemd.
step_boot() {
  check 'the packages can be installed where systemd runs' apt install /packages/*.deb
  check 'the server runs' active zorvacimd.service zorvacimd.socket
  check 'changes are waited for' active zorva-apply.path
  check 'any user sees the host' as nobody zorvactl --quiet show
  check 'any user is answered by the server' says eth0 as nobody zorvactl --url unix: show
  check 'root can make a settings file' zorvactl --quiet ifcfg init eth0
  useradd -G zorva someone
  check 'a member of the group can change it through the server' as someone zorvactl --url unix: --quiet dns set eth0 192.0.2.7
  check 'the change reaches the host' grep -q 192.0.2.7 /etc/resolv.conf
  check 'the service of root did that' differ "$(systemctl show -p ExecMainPID zorva-apply.service)" ExecMainPID=0
  check 'the data directory still belongs to the user of the server' stat_is /var/lib/zorvagent 'zorva:zorva 750'
  check 'a second change works' as someone zorvactl --url unix: --quiet dns set eth0 192.0.2.8
  local socket
  socket=$(systemctl show -p ActiveEnterTimestampMonotonic zorvacimd.socket)
  server=$(systemctl show -p MainPID zorvacimd.service)
  check 'the next version can be installed' apt install /packages/next/*.deb
  check 'the sockets stayed open' is "$(systemctl show -p ActiveEnterTimestampMonotonic zorvacimd.socket)" "$socket"
  check 'the server was started again' active zorvacimd.service
  check 'it is another process' differ "$(systemctl show -p MainPID zorvacimd.service)" "$server"
  check 'the data is kept' grep -q 192.0.2.8 /var/lib/zorvagent/ifcfg-eth0
  # shellcheck disable=SC2086
  check 'the packages can be removed' apt remove $ours
  check 'nothing of them runs' is "$(systemctl list-units --no-legend --state=active 'zorva*' | grep -v zorva-test)" ''
  # shellcheck disable=SC2086
  check 'and purged' quietly dpkg --purge $ours
  echo 'all of it was run'
}

differ() { [ "$1" != "$2" ]; }

# For developers: with the compiler, after everything else.
step_develop() {
  local example=/tmp/provider
  check 'the packages can be installed after a purge' apt install /packages/*.deb g++ cmake make pkg-config
  cp -r /usr/share/doc/libzorvagent-dev/examples/provider "$example"
  cd "$example" || return
  check 'the example compiles with pkg-config' make
  check 'it serves the test agent' says 'Name="eth1"' as nobody zorvactl --config test-agent/agent.toml --providers . ein EXAMPLE_Interface
  check 'and has its property' says 'IsUp' zorvactl --config test-agent/agent.toml --providers . gi 'EXAMPLE_Interface.Name="eth0"'
  check 'it compiles with CMake' sh -c 'cmake -B build && cmake --build build'
  check 'it serves this host' says 'Name="eth0"' zorvactl --providers build ein EXAMPLE_Interface
  mkdir -p /etc/zorvagent/providers.d
  cp build/interface.mof build/interface.reg build/libexampleinterface.so /etc/zorvagent/providers.d/
  check 'installed, it needs no option' says 'Name="eth0"' zorvactl ein EXAMPLE_Interface
  check 'the server loads it' zorvacimd --check-config
  zorvacimd --port 5990 >/tmp/server.log 2>&1 &
  sleep 2
  check 'the server serves it' says 'Name="eth0"' wbemcli ein http://localhost:5990/root/cimv2:EXAMPLE_Interface
  kill %1
}

"step_$1"
exit "$failed"
