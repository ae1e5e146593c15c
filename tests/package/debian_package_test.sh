#!/bin/bash
# usage: debian_package_test.sh BUILD-FOLDER
#
# Makes the Debian package, and looks at what it tells apt and what it holds.
set -euo pipefail
folder=$(mktemp -d)
trap 'rm -rf "$folder"' EXIT
cpack --config "$1/CPackConfig.cmake" -G DEB -B "$folder" >"$folder/log" 2>&1 || { cat "$folder/log"; exit 1; }
package=$(find "$folder" -maxdepth 1 -name '*.deb')
dpkg-deb --control "$package" "$folder/control"
dpkg-deb --extract "$package" "$folder/content"

status=0
complain() {
  echo "$*" >&2
  status=1
}

# Programs that are run, a module that is loaded, and two of the libraries that are linked to.
depends=$(dpkg-deb --field "$package" Depends)
for needed in winbind samba-common samba-common-bin libsasl2-modules-gssapi-mit samba-libs libwbclient0; do
  grep -qE "(^|, )$needed( |,|$)" <<<"$depends" || complain "it does not depend on $needed: $depends"
done

for pattern in usr/bin/velmorctl usr/libexec/velmor/libsamba.so \
  usr/libexec/velmor/libcam.so usr/libexec/velmor/velmor-samba-helper usr/libexec/velmor/velmor-samba-precheck \
  usr/sbin/velmor-camd usr/lib/systemd/system/velmor-camd.service usr/lib/sysusers.d/velmor-camd.conf \
  usr/share/man/man8/velmorctl.8 usr/include/authentication/authentication.h; do
  compgen -G "$folder/content/$pattern" >/dev/null || complain "it lacks $pattern"
done

# Which folder of libraries it is depends on how the build was configured.
[[ -n $(find "$folder/content/usr/lib" -name libvelmor.so.1) ]] || complain "it lacks libvelmor.so.1"

for script in postinst prerm postrm; do
  [[ -x $folder/control/$script ]] || complain "it lacks $script, or that cannot be run"
done

# What an administrator may have changed must survive an upgrade.
diff <(cd "$folder/content" && find etc -type f -printf '/%p\n' | sort) <(sort "$folder/control/conffiles") ||
  complain "not every file below /etc is one of its settings files"
foreign=$(dpkg-deb --contents "$package" | awk '$2 != "root/root"')
[[ -z $foreign ]] || complain "not everything belongs to root: $foreign"
exit $status
