# SPDX-License-Identifier: Apache-2.0
"""Fetches a Debian kernel and busybox and makes the files a guest boots from.

The result lies in the project's untracked build/guest/ARCH/:

    kernel       what QEMU boots
    initramfs    busybox, the kernel modules and handset/guest/init
    stamp        what both were made from; written last, so a directory without it is never used

Nothing is installed on the machine: packages are downloaded and unpacked in a scratch directory.
The unpacked kernel and busybox are kept in build/guest/ARCH.parts/, so that a change of init costs no
download. Runs at the same time wait for each other.
"""

import contextlib
import hashlib
import lzma
import os
import shutil
import struct
import subprocess
import sys
import tempfile

import debian_packages
import artifact_directory
from failure import Failure

PROJECT = os.path.dirname(os.path.dirname(os.path.dirname(os.path.realpath(__file__))))
INIT = os.path.join(PROJECT, "handset", "guest", "init")

ARCHITECTURES = ("amd64", "arm64")

# What the guest needs loaded; their dependencies are found with modprobe.
MODULES = ("virtio_pci", "virtio_console", "virtio_rng", "9p", "9pnet_virtio", "overlay", "fuse",
           "cuse", "uinput", "evdev", "binder_linux")

# Raised whenever _fetch_parts makes something else from the same packages.
PARTS_RECIPE = 1

# Runs busybox of an architecture on this machine, to ask for its applets.
EMULATORS = {"amd64": [], "arm64": ["qemu-aarch64-static"]}


def image_directory(arch):
    """The directory with the files that boot a guest of `arch`."""
    return os.path.join(PROJECT, "build", "guest", arch)


def prepare(arch, say):
    """Makes image_directory(arch) unless it is up to date. `say` is called with lines of
    progress."""
    wanted = _stamp()
    directory = image_directory(arch)
    if artifact_directory.read_stamp(directory) == wanted:
        return
    with artifact_directory.lock(directory + ".lock", f"the {arch} guest", say):
        if artifact_directory.read_stamp(directory) == wanted:
            return
        parts = _parts_directory(arch)
        if artifact_directory.read_stamp(parts) != _parts_stamp():
            with artifact_directory.replacing(parts) as scratch:
                _fetch_parts(arch, scratch, say)
                artifact_directory.write_stamp(scratch, _parts_stamp())
        with artifact_directory.replacing(directory) as scratch:
            _assemble(arch, parts, scratch)
            artifact_directory.write_stamp(scratch, wanted)
        say(f"the {arch} guest is ready")


def kernel_release(arch):
    """The release of a prepared guest's kernel, "6.1.0-13-amd64": its modules say it."""
    modules = os.path.join(_parts_directory(arch), "modules")
    module = os.path.join(modules, sorted(os.listdir(modules))[0])
    return debian_packages.run(["modinfo", "-F", "vermagic", module]).split()[0]


def _parts_directory(arch):
    return image_directory(arch) + ".parts"


# --- up to date or not ---------------------------------------------------------------------------

def _parts_stamp():
    return f"{PARTS_RECIPE} {' '.join(MODULES)}"


def _stamp():
    digest = hashlib.sha256(_parts_stamp().encode())
    for path in (INIT, os.path.realpath(__file__)):
        with open(path, "rb") as source:
            digest.update(source.read())
    return digest.hexdigest()


# --- fetching ------------------------------------------------------------------------------------

def _fetch_parts(arch, target, say):
    """Fills `target` with kernel, modules/ (named in load order) and busybox."""
    for tool, package in (("apt-get", "apt"), ("dpkg-deb", "dpkg"), ("depmod", "kmod"),
                          ("cpio", "cpio")):
        debian_packages.find_tool(tool, package)
    with tempfile.TemporaryDirectory(prefix="unpack.", dir=target) as unpacked:
        image = _kernel_package(arch, say)
        for package in (image, f"busybox-static:{arch}"):
            debian_packages.unpack(package, unpacked, say)
        release = os.listdir(os.path.join(unpacked, "lib", "modules"))[0]
        _take_kernel(os.path.join(unpacked, "boot", f"vmlinuz-{release}"),
                     os.path.join(target, "kernel"), arch)
        _take_modules(unpacked, release, os.path.join(target, "modules"))
        shutil.move(os.path.join(unpacked, "bin", "busybox"), os.path.join(target, "busybox"))


def _kernel_package(arch, say):
    """The numbered kernel package behind the metapackage: older numbers vanish from the archive."""
    meta = f"linux-image-{arch}:{arch}"
    for line in debian_packages.describe(meta, say).splitlines():
        if line.startswith("Depends: linux-image-"):
            return line.split()[1] + ":" + arch
    raise Failure(f"the package {meta} names no kernel")


def _take_kernel(vmlinuz, target, arch):
    """Copies the kernel in the form that boots quickest."""
    if arch != "amd64":
        shutil.move(vmlinuz, target)
        return
    # The ELF image within spares the guest its own decompression, which emulation makes slow.
    # Offsets are those of the x86 boot protocol.
    with open(vmlinuz, "rb") as file:
        image = file.read()
    setup_sectors = image[0x1F1] or 4
    offset, length = struct.unpack_from("<II", image, 0x248)
    start = (setup_sectors + 1) * 512 + offset
    with open(target, "wb") as file:
        file.write(lzma.LZMADecompressor(lzma.FORMAT_XZ).decompress(image[start:start + length]))


def _take_modules(root, release, target):
    """Copies MODULES and what they depend on, numbered in the order in which they load."""
    debian_packages.run(["depmod", "-b", root, release])
    os.mkdir(target)
    taken = []
    for module in MODULES:
        listing = debian_packages.run(["modprobe", "-d", root, "-S", release, "--show-depends", module])
        for line in listing.splitlines():
            action, path = line.split()[:2]
            if action == "insmod" and path not in taken:
                name = f"{len(taken):02}-{os.path.basename(path)}"
                shutil.copyfile(path, os.path.join(target, name))
                taken.append(path)


# --- assembling ----------------------------------------------------------------------------------

def _assemble(arch, parts, target):
    """Makes kernel and initramfs in `target` from `parts`."""
    os.link(os.path.join(parts, "kernel"), os.path.join(target, "kernel"))
    with tempfile.TemporaryDirectory(prefix="tree.", dir=target) as tree:
        os.chmod(tree, 0o755)
        shutil.copy(INIT, os.path.join(tree, "init"))
        shutil.copytree(os.path.join(parts, "modules"), os.path.join(tree, "modules"))
        _make_layer(os.path.join(parts, "busybox"), os.path.join(tree, "layer"), arch)
        names = "\n".join(sorted(_walk(tree)))
        with open(os.path.join(target, "initramfs"), "wb") as archive:
            done = subprocess.run(["cpio", "--create", "--format=newc", "--owner=0:0", "--quiet"],
                                  cwd=tree, input=names.encode(), stdout=archive,
                                  stderr=subprocess.PIPE, check=False)
        if done.returncode != 0:
            raise Failure(f"cpio: {done.stderr.decode(errors='replace').strip()}")


def _make_layer(busybox, layer, arch):
    """The directory that lies over the host's root. Its links are made here: making them at boot
    would take seconds. /bin and /sbin are links into /usr on a Debian system."""
    emulator = [debian_packages.find_tool(word, "qemu-user-static") for word in EMULATORS[arch]]
    os.makedirs(os.path.join(layer, "usr", "bin"))
    os.makedirs(os.path.join(layer, "usr", "sbin"))
    program = os.path.join(layer, "usr", "bin", "busybox")
    shutil.copy(busybox, program)
    for applet in debian_packages.run([*emulator, program, "--list-full"]).split():
        directory = "sbin" if os.path.dirname(applet).endswith("sbin") else "bin"
        link = os.path.join(layer, "usr", directory, os.path.basename(applet))
        with contextlib.suppress(FileExistsError):
            os.symlink("../bin/busybox" if directory == "sbin" else "busybox", link)


def _walk(tree):
    for directory, directories, files in os.walk(tree):
        for name in directories + files:
            yield os.path.relpath(os.path.join(directory, name), tree)


def say_on_stderr(line):
    """Progress as the launcher's commands print it."""
    print(f"handset: {line}", file=sys.stderr, flush=True)
