# enter.sh ROOT COMMAND...: in mount and process namespaces of its own, makes ROOT a small system and runs the command there.
set -eu
root=$1
shift
# The root of a mount namespace must be a mount.
mount --rbind "$root" "$root"
mount -t proc proc "$root/proc"
mount -t tmpfs -o mode=755 tmpfs "$root/run"
mount -t tmpfs -o mode=755 tmpfs "$root/dev"
for device in null zero full random urandom tty; do
  touch "$root/dev/$device"
  mount --bind "/dev/$device" "$root/dev/$device"
done
ln -s /proc/self/fd "$root/dev/fd"
mkdir "$root/dev/pts" "$root/dev/shm"
mount -t tmpfs -o mode=1777 tmpfs "$root/dev/shm"
mount -t devpts -o newinstance,ptmxmode=0666 devpts "$root/dev/pts"
ln -s pts/ptmx "$root/dev/ptmx"
# In a network of its own: loopback and one interface.
if [ "${ZORVA_OWN_NETWORK-}" = 1 ]; then
  ip link set lo up
  ip link add eth0 type veth peer name eth9
  ip link set eth0 up
  ip link set eth9 up
fi
if [ "${ZORVA_BOOT-}" = 1 ]; then
  mount -t sysfs sysfs "$root/sys"
  mount -t cgroup2 cgroup2 "$root/sys/fs/cgroup"
  set -- env -i container=zorva-test PATH=/usr/sbin:/usr/bin:/sbin:/bin /lib/systemd/systemd --system \
    --unit=zorva-test.target --show-status=0 --log-target=journal
fi
# Not only chroot: systemd makes namespaces for its services, and nothing of the machine stays in reach.
cd "$root"
pivot_root . mnt
umount -l /mnt
[ "${ZORVA_BOOT-}" != 1 ] || exec "$@"
exec env -i PATH=/usr/sbin:/usr/bin:/sbin:/bin HOME=/root LC_ALL=C.UTF-8 DEBIAN_FRONTEND=noninteractive \
  "$@"
