"""What the virtual machine boots: Debian's kernel, which is downloaded once and never installed, and a first program that
puts the host's files in place and runs one command."""
import lzma
import os
import re
import shutil
import subprocess
import sys
import tempfile

INIT = r"""#!/bin/busybox sh
# Mounts the host's files, runs /out/command with them, and ends the machine.
export PATH=/usr/local/sbin:/usr/local/bin:/usr/sbin:/usr/bin:/sbin:/bin
/bin/busybox mount -t proc proc /proc
/bin/busybox mount -t sysfs sys /sys
/bin/busybox mount -t devtmpfs dev /dev
/bin/busybox --install -s /bin
while read -r module options; do insmod /modules/$module $options || echo "@no-module $module"; done < /modules/order
mount -t 9p -o trans=virtio,version=9p2000.L,msize=512000,cache=loose,ro host /host || { echo "@no-files"; poweroff -f; }
mount -t 9p -o trans=virtio,version=9p2000.L,msize=512000,cache=none out /out
mount -t tmpfs layer /layer
mkdir /layer/above /layer/work
mount -t overlay -o lowerdir=/host,upperdir=/layer/above,workdir=/layer/work files /root
for own in tmp run var/tmp; do mount -t tmpfs own /root/$own; chmod 1777 /root/$own; done
mkdir -p /root/out
mount -t securityfs security /sys/kernel/security
for folder in proc sys dev out; do mount --move /$folder /root/$folder; done
mkdir -p /root/dev/pts /root/dev/shm
mount -t devpts devpts /root/dev/pts
mount -t tmpfs shm /root/dev/shm
while read -r seen; do mkdir -p "/root$seen"; mount --bind "/host$seen" "/root$seen"; done < /see
ifconfig lo 127.0.0.1
for link in /root/sys/class/net/*; do
    [ "$(cat $link/address)" = 52:54:00:00:60:00 ] && ifconfig ${link##*/} 10.0.2.15 netmask 255.255.255.0
done
echo "@start"
chroot /root /bin/sh -c "cd /; exec /bin/sh /out/command" </root/dev/null >/root/out/stdout 2>/root/out/stderr
echo $? > /root/out/rc
echo "@end"
poweroff -f
"""
BASE_MODULES = ["virtio_pci", "9pnet_virtio", "9p", "overlay"]
DISK_MODULES = {"ide": ["ata_piix", "sd_mod"], "ahci": ["ahci", "sd_mod"], "nvme": ["nvme"],
                "virtio-scsi": ["virtio_scsi", "sd_mod"], "megasas": ["megaraid_sas", "sd_mod"]}
NETWORK_MODULES = {"e1000": ["e1000"], "e1000e": ["e1000e"], "virtio-net-pci": ["virtio_net"]}
DISK_SIZE = 16 << 20

def read_bytes(path):
    with open(path, "rb") as f:
        return f.read()


def fetch_kernel(folder):
    """Downloads the kernel package that Debian's "linux-image-amd64" stands for and unpacks it below `folder`, unless
    it is there. Raises OSError or CalledProcessError when it cannot be had."""
    if os.path.isdir(folder + "/boot"):
        return
    with tempfile.TemporaryDirectory() as work:
        depends = subprocess.run(["apt-cache", "depends", "linux-image-amd64"], check=True, capture_output=True,
                                 text=True).stdout
        found = re.search(r"Depends: (linux-image-\S+)", depends)
        if not found:
            raise OSError("this system's package lists know no kernel (linux-image-amd64)")
        subprocess.run(["apt-get", "download", "-q", found[1]], check=True, cwd=work, stdout=subprocess.DEVNULL,
                       stderr=subprocess.DEVNULL)
        package = os.path.join(work, os.listdir(work)[0])
        os.makedirs(os.path.dirname(folder) or ".", exist_ok=True)
        unpacked = tempfile.mkdtemp(prefix="kernel.", dir=os.path.dirname(folder) or ".")
        subprocess.run(["dpkg-deb", "-x", package, unpacked], check=True)
        os.rename(unpacked, folder)


def find_kernel(folder):
    """The newest kernel below `folder`, and the folder of its modules."""
    images = sorted(n for n in os.listdir(folder + "/boot") if n.startswith("vmlinuz-"))
    if not images:
        sys.exit("tools/machine: no boot/vmlinuz-* in " + folder)
    release = images[-1][len("vmlinuz-"):]
    return folder + "/boot/" + images[-1], folder + "/lib/modules/" + release, release


def unpacked_kernel(image, release):
    """The kernel without its compression, kept for the next run: the guest would need 3.5 s to unpack it, this
    machine needs 1 s once. Falls back on the packed one."""
    kept = os.path.join(tempfile.gettempdir(), "panelglow-kernel-%s-%d" % (release, os.stat(image).st_mtime))
    if not os.path.exists(kept):
        data = read_bytes(image)
        start = data.find(b"\xfd7zXZ\x00")
        if start < 0:
            return image
        elf = lzma.LZMADecompressor().decompress(data[start:])
        if elf[:4] != b"\x7fELF":
            return image
        with open("%s.%d" % (kept, os.getpid()), "wb") as out:
            out.write(elf)
        os.rename("%s.%d" % (kept, os.getpid()), kept)
    return kept


def module_order(tree, wanted):
    """Paths of the modules and of all they need, in the order of loading. Reads "depends=" out of the files, so that
    neither depmod nor modprobe is needed."""
    where = {}
    for path, _, names in os.walk(tree + "/kernel"):
        for name in names:
            if name.endswith(".ko"):
                where[name[:-3].replace("-", "_")] = os.path.join(path, name)
    with open(tree + "/modules.builtin") as f:
        builtin = {os.path.basename(line.strip())[:-3].replace("-", "_") for line in f}
    order = []

    def add(name):
        name = name.replace("-", "_")
        if name in builtin or where.get(name) in order:
            return
        if name not in where:
            sys.exit("tools/machine: the kernel has no module " + name)
        needs = re.search(rb"\0depends=([^\0]*)\0", read_bytes(where[name]))
        for need in needs.group(1).decode().split(",") if needs else []:
            if need:
                add(need)
        order.append(where[name])

    for name in wanted:
        add(name)
    return order


def archive(files):
    """A cpio archive ("newc", what the kernel unpacks): name -> (mode, bytes)."""
    out = bytearray()
    for number, (name, (mode, data)) in enumerate(list(files.items()) + [("TRAILER!!!", (0, b""))], 1):
        raw = name.encode() + b"\0"
        out += ("070701" + "%08X" * 13 % (number, mode, 0, 0, 1, 0, len(data), 0, 0, 0, 0, len(raw), 0)).encode() + raw
        out += b"\0" * (-len(out) % 4) + data
        out += b"\0" * (-len(out) % 4)
    return bytes(out)


def first_files(busybox, modules, options, see):
    folders = ["bin", "dev", "proc", "sys", "modules", "host", "layer", "out", "root"]
    files = {name: (0o40755, b"") for name in folders}
    files["bin/busybox"] = (0o100755, read_bytes(busybox))
    files["init"] = (0o100755, INIT.encode())
    for path in modules:
        files["modules/" + os.path.basename(path)] = (0o100644, read_bytes(path))
    names = [os.path.basename(p) for p in modules]
    files["modules/order"] = (0o100644, "".join(
        n + " " + options.get(n[:-3].replace("-", "_"), "") + "\n" for n in names).encode())
    files["see"] = (0o100644, "".join(os.path.realpath(p) + "\n" for p in see).encode())
    return archive(files)
