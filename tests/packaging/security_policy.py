# SPDX-License-Identifier: Apache-2.0
"""The service's SELinux policy, compiled with as much of the platform's as it refers to, and what
the compiled policy grants."""

import pathlib
import re
import subprocess

import setools

import project

PLATFORM = pathlib.Path(__file__).resolve().parent / "platform_policy"


class CompileError(Exception):
    """What m4 or checkpolicy complained about."""


def source(vendor=project.POLICY):
    """One text, its parts joined in the order of the platform's build."""
    parts = [PLATFORM / name for name in ("security_classes", "initial_sids", "access_vectors",
                                          "te_macros", "mls", "attributes", "platform.te")]
    parts += sorted(vendor.glob("*.te"))
    parts += [PLATFORM / "roles_users", PLATFORM / "initial_sid_contexts",
              PLATFORM / "genfs_contexts", vendor / "genfs_contexts"]
    return "".join(map(project.text, parts))


def compile_text(text, directory):
    """The compiled policy, whose file is kept in `directory`."""
    directory = pathlib.Path(directory)
    expanded, compiled = directory / "policy.conf", directory / "policy"
    expanded.write_text(_run(["m4", "--synclines", "-"], text), encoding="utf-8")
    _run(["checkpolicy", "-M", "-c", "30", "-o", str(compiled), str(expanded)])
    return setools.SELinuxPolicy(str(compiled))


def _run(command, text=""):
    done = subprocess.run(command, input=text, capture_output=True, text=True, check=False)
    if done.returncode != 0:
        raise CompileError(done.stderr)
    return done.stdout


def rules(policy, domain, indirect=False):
    """The allow rules with this source, as {(target, class): permissions}; with `indirect` also
    those of the attributes that the domain has."""
    found = {}
    query = setools.TERuleQuery(policy, ruletype=["allow"], source=domain,
                                source_indirect=indirect)
    for rule in query.results():
        key = (str(rule.target), str(rule.tclass))
        found[key] = found.get(key, set()) | {str(each) for each in rule.perms}
    return found


def ioctl_rules(policy, domain):
    """The allowed ioctl requests, as {(target, class): numbers}."""
    query = setools.TERuleQuery(policy, ruletype=["allowxperm"], source=domain)
    return {(str(rule.target), str(rule.tclass)): set(rule.perms) for rule in query.results()}


def attributes(policy, name):
    return {str(each) for each in policy.lookup_type(name).attributes()}


def types(policy):
    return {str(each) for each in policy.types()}


def genfs_label(policy, filesystem, path):
    """The type of a file of sysfs or proc: that of the longest path that its own begins with."""
    fitting = [each for each in policy.genfscons()
               if str(each.fs) == filesystem and path.startswith(str(each.path))]
    return str(max(fitting, key=lambda each: len(str(each.path))).context.type_)


def read_contexts(path):
    """The lines of a file_contexts or service_contexts file, as (name or pattern, type)."""
    lines = []
    for line in project.text(path).splitlines():
        words = line.split("#")[0].split()
        if not words:
            continue
        label = re.fullmatch(r"u:object_r:(\w+):s0", words[-1])
        if len(words) != 2 or not label:
            raise ValueError(f"{path}: \"{line}\" is not NAME LABEL")
        lines.append((words[0], label[1]))
    return lines


def file_label(path):
    """The type of a file on a disk or in /dev; the last pattern that fits decides."""
    fitting = [label for directory in (PLATFORM, project.POLICY)
               for pattern, label in read_contexts(directory / "file_contexts")
               if re.fullmatch(pattern, path)]
    return fitting[-1] if fitting else None
