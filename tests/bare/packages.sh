# SPDX-License-Identifier: Apache-2.0
# shellcheck shell=bash
# packages.sh FOLDER: for run.sh, inside the bare system. Installs the packages with what they depend on,
# compiles a program, runs the tool, and purges them: then no file differs in name from before.
set -euo pipefail
packages=$1
here=$(dirname "${BASH_SOURCE[0]}")
names=(libovrinresize1 libovrinresize-dev ovrinresize python3-ovrinresize)

files() {
    find / -xdev \( -path /proc -o -path /var/log -o -path /var/cache -o -path /root -o -path /tmp \) -prune -o -print | sort
}

apt-get install -y --no-install-recommends gcc pkg-config man-db >/tmp/apt.log 2>&1
files >/tmp/before
before=$(dpkg-query -W -f='${Package}\n')

apt-get install -y --no-install-recommends "./$packages"/*.deb >>/tmp/apt.log 2>&1
dpkg-query -W "${names[@]}"

# shellcheck disable=SC2046 # a list of flags
gcc "$here/consumer.c" -o /tmp/consumer $(pkg-config --cflags --libs ovrinresize)
/tmp/consumer
# shellcheck disable=SC2046
gcc -static "$here/consumer.c" -o /tmp/consumer $(pkg-config --static --cflags --libs ovrinresize)
/tmp/consumer

ovrinresize --version
printf 'P6 4 2 255\n%s' 'abcdefghijklmnopqrstuvwx' >/tmp/in.ppm
ovrinresize /tmp/in.ppm /tmp/out.ppm --size 2x1
cmp <(head -c 11 /tmp/out.ppm) <(printf 'P6\n2 1\n255\n')
man ovrinresize >/tmp/page
grep -A 1 "^NAME" /tmp/page
python3 -c "
import numpy, ovrinresize
assert ovrinresize.resize(numpy.full((4, 8, 4), 255, numpy.uint8), (4, 2)).tolist() == [[[252] * 4] * 4] * 2"
test -e /usr/share/bash-completion/completions/ovrinresize

# What came with them, and only that, goes with them.
mapfile -t after < <(dpkg-query -W -f='${Package}\n')
mapfile -t new < <(comm -13 <(sort <<<"$before") <(printf '%s\n' "${after[@]}" | sort))
dpkg --purge "${new[@]}" >>/tmp/apt.log 2>&1
files >/tmp/after
diff /tmp/before /tmp/after
echo "installed, used and purged without remains: ${new[*]}"
