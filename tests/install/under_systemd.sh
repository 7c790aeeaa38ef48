#!/bin/sh
# SPDX-License-Identifier: Apache-2.0
#
# under_systemd.sh PACKAGE TOOLS BUILD PROFILE, in the guest: installs the Debian package, starts a real
# systemd in process and mount namespaces of its own, over the nodes of a simulated driver, and does to
# the units what befalls them. One line for each thing that went as it should; the first that did not
# ends it. TOOLS has the machine's dpkg, in whose place the guest has busybox's.
set -eu
package=$1
build=$3
profile=$4
tools=$2
export PATH="$tools:$PATH"

ok() { echo "ok: $*"; }
enter() { nsenter -t "$init" -m -p "$@"; }
as_nobody() { enter runuser -u nobody -- "$@"; }
answers() { as_nobody timeout 5 /usr/bin/vibctl std getInterfaceVersion >/dev/null 2>&1; }
pid_of() { enter systemctl show --property=MainPID --value "$1"; }

# await WHAT COMMAND...: asks again and again, for 40 seconds.
await() {
    what=$1
    shift
    end=$(($(date +%s) + 40))
    while [ "$(date +%s)" -lt $end ]; do
        if "$@"; then
            ok "$what"
            return
        fi
        sleep 0.5
    done
    echo "failed: $what" >&2
    enter systemctl --no-pager --full status 'qvx-*' >&2 || true
    exit 1
}

# Only the package's units are to start; the layer over the machine's root is the guest's own. The
# service manager's device is as the kernel makes it.
rm -rf /etc/systemd/system/*.wants /lib/systemd/system/*.wants /lib/systemd/system-generators
chmod 0600 /dev/binder
"$tools/dpkg" --install "$package" >/run/dpkg.log 2>&1 || { cat /run/dpkg.log >&2; exit 1; }
systemctl --quiet enable qvx-servicemanager qvx-vibrator
grep -qx binder_linux /usr/lib/modules-load.d/qvx-vibrator.conf
ok "the package is installed, and has binder loaded"

mkfifo /run/ready
"$build/bin/handset-driver" --profile "$profile" --journal /run/journal --control /run/control \
    --ready-fd 3 3<>/run/ready &
driver=$!
read -r _ </run/ready
# What udev does where there is one.
nsenter --mount=/proc/$driver/ns/mnt -- find /sys/class/leds/vibrator/ -maxdepth 1 -type f \
    -exec chgrp qvx-vibrator {} + -exec chmod g=u {} +

if runuser -u nobody -- /usr/libexec/qvx-vibrator/servicemanager 2>/run/early.log; then
    exit 1
fi
grep -qx "servicemanager: cannot open /dev/binder: Permission denied" /run/early.log
ok "nobody else becomes the manager first"

env container=handset nsenter --mount=/proc/$driver/ns/mnt -- \
    unshare --mount --pid --fork --mount-proc /usr/lib/systemd/systemd --unit=multi-user.target \
    --log-target=null &
# A child that has not become what it is to run yet has its parent's name; the parent is the oldest.
oldest() { pidof "$1" | tr ' ' '\n' | sort -n | head -n 1; }
for _ in $(seq 60); do
    init=$(oldest systemd) && [ -n "$init" ] && [ -S /run/systemd/private ] && break
    sleep 0.5
done
await "every user reaches the service" answers
[ "$(stat -c %a /dev/binder)" = 666 ]
as_nobody /usr/bin/vibctl std on 500
grep -q '"op":"write","node":"/sys/class/leds/vibrator/activate"' /run/journal
enter systemctl is-active --quiet qvx-vibrator-watchdog.timer
ok "the motor runs"

service=$(pid_of qvx-vibrator)
new_service() { [ "$(pid_of qvx-vibrator)" != "$service" ] && answers; }

kill -KILL "$(oldest servicemanager)"
await "a lost manager comes again, and the service registers with it" new_service

service=$(pid_of qvx-vibrator)
enter kill -KILL "$service"
await "a killed service comes again" new_service

service=$(pid_of qvx-vibrator)
enter kill -STOP "$service"
enter systemctl start qvx-vibrator-watchdog.service
await "a service that does not answer is started anew" new_service

service=$(pid_of qvx-vibrator)
enter "$tools/dpkg" --install "$package" >/run/dpkg.log 2>&1 || { cat /run/dpkg.log >&2; exit 1; }
await "an upgrade restarts the units" new_service

if dmesg | grep -i 'binder.*RLIMIT_NICE'; then exit 1; fi
ok "the kernel has nothing to say about priorities"

enter systemctl stop qvx-servicemanager
for unit in qvx-vibrator.service qvx-vibrator-watchdog.timer; do
    if enter systemctl is-active --quiet "$unit"; then exit 1; fi
done
ok "all stop together"
