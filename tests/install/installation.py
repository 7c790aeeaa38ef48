# SPDX-License-Identifier: Apache-2.0
"""Where the build is, and what an installation consists of."""

import os
import pathlib
import subprocess

PROJECT = pathlib.Path(__file__).resolve().parent.parent.parent
BUILD = pathlib.Path(os.environ["QVX_BUILD"])
SERVICE = "android.hardware.vibrator-service.quorvan"

# Below the prefix, with their modes. The directory of libraries has the machine's name in it on some
# prefixes; LIBRARIES stands for it.
FILES = {
    "bin/vibctl": 0o755,
    "LIBRARIES/qvx-vibrator/libbinder_ndk.so": 0o644,
    "lib/modprobe.d/qvx-vibrator.conf": 0o644,
    "lib/modules-load.d/qvx-vibrator.conf": 0o644,
    "lib/systemd/system/qvx-servicemanager.service": 0o644,
    "lib/systemd/system/qvx-vibrator-watchdog.service": 0o644,
    "lib/systemd/system/qvx-vibrator-watchdog.timer": 0o644,
    "lib/systemd/system/qvx-vibrator.service": 0o644,
    "lib/sysusers.d/qvx-vibrator.conf": 0o644,
    "lib/udev/rules.d/60-qvx-vibrator.rules": 0o644,
    "libexec/qvx-vibrator/android.hardware.vibrator-service.quorvan": 0o755,
    "libexec/qvx-vibrator/servicemanager": 0o755,
    "share/bash-completion/completions/vibctl": 0o644,
    "share/doc/qvx-vibrator/bring-up.md": 0o644,
    "share/doc/qvx-vibrator/changelog.gz": 0o644,
    "share/doc/qvx-vibrator/copyright": 0o644,
    "share/doc/qvx-vibrator/interfaces.md": 0o644,
    "share/man/man1/vibctl.1.gz": 0o644,
    "share/man/man8/servicemanager.8.gz": 0o644,
    "share/qvx-vibrator/services.rules": 0o644,
    "share/qvx-vibrator/vendor/etc/vintf/manifest/"
    "android.hardware.vibrator-service.quorvan.xml": 0o644,
}


def run(*command, **options):
    """Runs a command that has to succeed; its output."""
    result = subprocess.run([str(word) for word in command], capture_output=True, text=True,
                            **options)
    if result.returncode != 0:
        raise AssertionError(f"{command} ended with {result.returncode}:\n"
                             f"{result.stdout}{result.stderr}")
    return result.stdout


def install(destination, prefix):
    run("cmake", "--install", BUILD, "--prefix", prefix,
        env={**os.environ, "DESTDIR": str(destination)})


def files_below(directory, prefix):
    """Every file below `prefix` in `directory`, with its mode, named as in FILES."""
    root = directory / prefix.lstrip("/")
    found = {}
    for path in root.rglob("*"):
        if path.is_dir():
            continue
        name = str(path.relative_to(root))
        if path.name == "libbinder_ndk.so":
            name = f"LIBRARIES/{path.parent.name}/{path.name}"
        found[name] = path.stat().st_mode & 0o777
    return found
