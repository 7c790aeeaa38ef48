# SPDX-License-Identifier: Apache-2.0
"""Fetches a Debian kernel and busybox and makes the files a guest boots from.

The result lies in the project's untracked build/guest/ARCH/:

    kernel       what QEMU boots
    initramfs    busybox, the kernel modules and handset/guest/init
    stamp        what both were made from; written last, so a folder without it is never used

Nothing is installed on the machine: packages are downloaded and unpacked in a scratch folder. The
unpacked kernel and busybox are kept in build/guest/ARCH.parts/, so that a change of init costs no
download. Runs at the same time wait for each other.
"""

import contextlib
import fcntl
import hashlib
import lzma
import os
import shutil
import struct
import subprocess
import sys
import tempfile

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


def image_folder(arch):
    """The folder with the files that boot a guest of `arch`."""
    return os.path.join(PROJECT, "build", "guest", arch)


def prepare(arch, say):
    """Makes image_folder(arch) unless it is up to date. `say` is called with lines of progress."""
    wanted = _stamp()
    folder = image_folder(arch)
    if _read_stamp(folder) == wanted:
        return
    os.makedirs(os.path.dirname(folder), exist_ok=True)
    with _lock(folder + ".lock", arch, say):
        if _read_stamp(folder) == wanted:
            return
        parts = folder + ".parts"
        if _read_stamp(parts) != _parts_stamp():
            with _replacing(parts) as scratch:
                _fetch_parts(arch, scratch, say)
                _write(os.path.join(scratch, "stamp"), _parts_stamp())
        with _replacing(folder) as scratch:
            _assemble(arch, parts, scratch)
            _write(os.path.join(scratch, "stamp"), wanted)
        say(f"the {arch} guest is ready")


# --- up to date or not ---------------------------------------------------------------------------

def _parts_stamp():
    return f"{PARTS_RECIPE} {' '.join(MODULES)}"


def _stamp():
    digest = hashlib.sha256(_parts_stamp().encode())
    for path in (INIT, os.path.realpath(__file__)):
        with open(path, "rb") as source:
            digest.update(source.read())
    return digest.hexdigest()


def _read_stamp(folder):
    try:
        with open(os.path.join(folder, "stamp"), encoding="ascii") as stamp:
            return stamp.read()
    except FileNotFoundError:
        return None


def _write(path, text):
    with open(path, "w", encoding="ascii") as file:
        file.write(text)


@contextlib.contextmanager
def _lock(path, arch, say):
    """Holds the lock for one architecture's folders; the kernel drops it when the holder dies."""
    with open(path, "w", encoding="ascii") as lock:
        try:
            fcntl.flock(lock, fcntl.LOCK_EX | fcntl.LOCK_NB)
        except BlockingIOError:
            say(f"another run is preparing the {arch} guest, waiting for it")
            fcntl.flock(lock, fcntl.LOCK_EX)
        yield


@contextlib.contextmanager
def _replacing(folder):
    """A scratch folder that takes the place of `folder` when all went well, else disappears."""
    for stale in (folder + ".new", folder + ".old"):
        shutil.rmtree(stale, ignore_errors=True)
    scratch = folder + ".new"
    os.mkdir(scratch)
    try:
        yield scratch
    except BaseException:
        shutil.rmtree(scratch, ignore_errors=True)
        raise
    with contextlib.suppress(FileNotFoundError):
        os.rename(folder, folder + ".old")
    os.rename(scratch, folder)
    shutil.rmtree(folder + ".old", ignore_errors=True)


# --- fetching ------------------------------------------------------------------------------------

def _fetch_parts(arch, target, say):
    """Fills `target` with kernel, modules/ (named in load order) and busybox."""
    for tool, package in (("apt-get", "apt"), ("dpkg-deb", "dpkg"), ("depmod", "kmod"),
                          ("cpio", "cpio")):
        _find_tool(tool, package)
    with tempfile.TemporaryDirectory(prefix="unpack.", dir=target) as unpacked:
        image = _kernel_package(arch, say)
        for package in (image, f"busybox-static:{arch}"):
            _download(package, unpacked, say)
        say("unpacking")
        for deb in [name for name in os.listdir(unpacked) if name.endswith(".deb")]:
            _run(["dpkg-deb", "-x", deb, "."], unpacked)
            os.unlink(os.path.join(unpacked, deb))
        release = os.listdir(os.path.join(unpacked, "lib", "modules"))[0]
        _take_kernel(os.path.join(unpacked, "boot", f"vmlinuz-{release}"),
                     os.path.join(target, "kernel"), arch)
        _take_modules(unpacked, release, os.path.join(target, "modules"))
        shutil.move(os.path.join(unpacked, "bin", "busybox"), os.path.join(target, "busybox"))


def _find_tool(tool, package):
    """The path of a program, which on Debian may lie outside a plain user's PATH."""
    path = shutil.which(tool, path=os.environ.get("PATH", "") + ":/usr/sbin:/sbin")
    if path is None:
        raise Failure(f"{tool} is not installed: scripts/install-packages installs {package}")
    return path


def _run(command, folder=None):
    """Runs a program and returns its output; a failure is reported with its last line."""
    command = [_find_tool(command[0], command[0])] + command[1:]
    done = subprocess.run(command, cwd=folder, stdin=subprocess.DEVNULL, capture_output=True,
                          text=True, errors="replace", check=False)
    if done.returncode != 0:
        last = (done.stderr.strip().splitlines() or [f"exit status {done.returncode}"])[-1]
        raise Failure(f"{' '.join(command)}: {last}")
    return done.stdout


def _kernel_package(arch, say):
    """The numbered kernel package behind the metapackage: older numbers vanish from the archive."""
    meta = f"linux-image-{arch}:{arch}"
    text = _with_fresh_lists(lambda: _run(["apt-cache", "show", "--no-all-versions", meta]), say)
    for line in text.splitlines():
        if line.startswith("Depends: linux-image-"):
            return line.split()[1] + ":" + arch
    raise Failure(f"the package {meta} names no kernel")


def _download(package, folder, say):
    size = ""
    for line in _run(["apt-cache", "show", "--no-all-versions", package]).splitlines():
        if line.startswith("Size: "):
            size = f" ({int(line.split()[1]) / 1e6:.0f} MB)"
    say(f"downloading {package}{size}")
    # apt's own download user cannot write here; as root it needs telling.
    options = ["-o", "APT::Sandbox::User=root"] if os.geteuid() == 0 else []
    _with_fresh_lists(lambda: _run(["apt-get", *options, "download", package], folder), say)


def _with_fresh_lists(action, say):
    """Runs `action` again after apt-get update when it fails, where that may be run."""
    try:
        return action()
    except Failure as failure:
        if os.geteuid() != 0:
            raise Failure(f"{failure}; 'apt-get update' may help") from None
        say("updating the package lists")
        _run(["apt-get", "update"])
        return action()


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
    _run(["depmod", "-b", root, release])
    os.mkdir(target)
    taken = []
    for module in MODULES:
        listing = _run(["modprobe", "-d", root, "-S", release, "--show-depends", module])
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
    """The folder that lies over the host's root. Its links are made here: making them at boot
    would take seconds. /bin and /sbin are links into /usr on a Debian system."""
    emulator = [_find_tool(word, "qemu-user-static") for word in EMULATORS[arch]]
    os.makedirs(os.path.join(layer, "usr", "bin"))
    os.makedirs(os.path.join(layer, "usr", "sbin"))
    program = os.path.join(layer, "usr", "bin", "busybox")
    shutil.copy(busybox, program)
    for applet in _run([*emulator, program, "--list-full"]).split():
        folder = "sbin" if os.path.dirname(applet).endswith("sbin") else "bin"
        link = os.path.join(layer, "usr", folder, os.path.basename(applet))
        with contextlib.suppress(FileExistsError):
            os.symlink("../bin/busybox" if folder == "sbin" else "busybox", link)


def _walk(tree):
    for folder, folders, files in os.walk(tree):
        for name in folders + files:
            yield os.path.relpath(os.path.join(folder, name), tree)


def say_on_stderr(line):
    """Progress as the launcher's commands print it."""
    print(f"handset: {line}", file=sys.stderr, flush=True)
