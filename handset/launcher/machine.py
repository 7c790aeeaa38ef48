# SPDX-License-Identifier: Apache-2.0
"""The virtual machine as a QEMU process: its command line, its console, its end."""

import collections
import os
import re
import shutil
import signal
import socket
import subprocess

import debian_packages
import guest_image
from failure import Failure

# Emulation is asked for by name: where /dev/kvm exists it may still be unusable. The processor of
# the arm64 guest has no pointer authentication, which costs most of the time under emulation.
# The x86 kernel measures its time stamp counter at boot and, on a busy machine, may be many times
# wrong; it finds that out by itself as long as nothing tells it that the counter is reliable.
_Target = collections.namedtuple("_Target", "program package machine console parameters")
TARGETS = {
    "amd64": _Target("qemu-system-x86_64", "qemu-system-x86", ["-machine", "q35"], "ttyS0",
                     "no_timer_check"),
    "arm64": _Target("qemu-system-aarch64", "qemu-system-arm",
                     ["-machine", "virt", "-cpu", "cortex-a72"], "ttyAMA0", ""),
}

# What the kernel need not do for a guest like this: defend itself, and test its ciphers, which is a
# third of an emulated boot.
_UNGUARDED = "mitigations=off rodata=off cryptomgr.notests"

_LONGEST_COMMAND_LINE = 2047  # bytes of kernel parameters either architecture takes
_FAULT = re.compile(r"\] (BUG|Oops|general protection fault|Internal error|INFO: task )")

_CONSOLE_KEPT = 256 * 1024    # bytes of console output kept to be shown


def find_emulator(arch):
    """The path of the program that runs guests of `arch`."""
    target = TARGETS[arch]
    program = shutil.which(target.program)
    if program is None:
        raise debian_packages.is_missing(target.program, target.package)
    return program


class Machine:
    """One running QEMU. It has no file anywhere: agent and console are connected sockets, and the
    kernel kills it when this process dies, however that happens."""

    def __init__(self, options, join_socket=None):
        """Starts the guest that `options` (see options.py) asks for. `join_socket`: where others can
        join it, or None."""
        target = TARGETS[options.arch]
        image = guest_image.image_directory(options.arch)
        self.agent, agent_end = socket.socketpair()
        self.console, console_end = socket.socketpair()
        self._console_text = bytearray()
        with agent_end, console_end:
            command = [
                "setpriv", "--pdeathsig", "KILL", find_emulator(options.arch),
                *target.machine, "-accel", "tcg", "-m", str(options.memory),
                "-smp", str(options.smp),
                "-nodefaults", "-no-user-config", "-nic", "none", "-display", "none", "-no-reboot",
                "-kernel", os.path.join(image, "kernel"),
                "-initrd", os.path.join(image, "initramfs"),
                "-append", _kernel_parameters(target, options, join_socket),
                "-chardev", f"socket,id=console,fd={console_end.fileno()}",
                "-serial", "chardev:console",
                "-device", "virtio-serial-pci",
                "-chardev", f"socket,id=agent,fd={agent_end.fileno()}",
                "-device", "virtserialport,nr=1,chardev=agent,name=handset",
                "-device", "virtio-rng-pci",
                *_export("host", "/", "readonly=on"),
            ]
            if options.counted:
                command += ["-icount", "shift=0,sleep=on"]
            if options.out is not None:
                command += _export("out", options.out, "readonly=off")
            if join_socket is not None:
                command += ["-chardev", f"socket,id=join,path={join_socket},server=on,wait=off",
                            "-device", "virtserialport,nr=2,chardev=join,name=join"]
            self._process = subprocess.Popen(
                command, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL,
                stderr=console_end, pass_fds=(agent_end.fileno(), console_end.fileno()),
                start_new_session=True)

    @property
    def pid(self):
        """QEMU's process id."""
        return self._process.pid

    def read_console(self):
        """Keeps what the console has said. False when QEMU has closed it."""
        try:
            chunk = self.console.recv(64 * 1024)
        except ConnectionError:
            return False
        self._console_text += chunk
        del self._console_text[:-_CONSOLE_KEPT]
        return bool(chunk)

    def drain_console(self):
        """Keeps what is left after QEMU's end."""
        self.console.settimeout(0.2)
        try:
            while self.read_console():
                pass
        except TimeoutError:
            pass

    def last_words(self, count):
        """The last `count` lines (None for all) that console and QEMU have said, empty ones
        aside. Of a kernel panic those up to its message: the stack below it tells less than what led there."""
        lines = self._console_text.decode(errors="replace").replace("\r", "").split("\n")
        lines = [line for line in lines if line.strip()]
        count = len(lines) if count is None else count
        panics = [number for number, line in enumerate(lines) if "Kernel panic" in line]
        return lines[:panics[0] + 1][-count:] if panics else lines[-count:]

    def complaints(self):
        """The console's first line of each kernel fault that the guest has survived."""
        self.drain_console()
        return [line for line in self.last_words(None) if _FAULT.search(line)]

    def wait(self, seconds):
        """Waits for QEMU to end by itself, and ends it when it does not."""
        try:
            self._process.wait(seconds)
        except subprocess.TimeoutExpired:
            self.kill()

    def kill(self):
        """Ends QEMU at once; harmless when it has ended."""
        if self._process.poll() is None:
            self._process.send_signal(signal.SIGKILL)
            self._process.wait()


def _kernel_parameters(target, options, join_socket):
    agent_path = options.agent
    if '"' in agent_path or "\n" in agent_path:
        raise Failure(f"a guest cannot be told of this path: {agent_path!r}")
    words = [f"console={target.console} quiet loglevel=4 panic=-1 random.trust_cpu=on",
             target.parameters, _UNGUARDED,
             f'handset_agent="{agent_path}"',
             f"handset_host_tmp={int(options.host_tmp)}",
             f"handset_out_export={int(options.out is not None)}",
             f"handset_join={int(join_socket is not None)}"]
    line = " ".join(words)
    if len(line.encode()) > _LONGEST_COMMAND_LINE:
        raise Failure(f"the build directory's path is too long for a guest: {agent_path}")
    return line


def _export(tag, path, access):
    """A 9p export of the host's directory `path`. A comma in a QEMU option is doubled."""
    escaped = path.replace(",", ",,")
    return ["-fsdev", f"local,id={tag},path={escaped},security_model=none,{access},multidevs=remap",
            "-device", f"virtio-9p-pci,fsdev={tag},mount_tag={tag}"]
