#!/bin/bash
# usage: settings_kept_test.sh BUILD-FOLDER
#
# Installing the default settings once more keeps those that the host has, and adds those that it lacks.
set -euo pipefail
host=$(mktemp -d)
trap 'rm -rf "$host"' EXIT
install_settings() { DESTDIR=$host cmake --install "$1" --prefix /usr --component configuration >/dev/null; }
settings=$host/etc/quenix/velmor

install_settings "$1"
echo 'remote-authentication-store = "Active Directory"' >"$settings/authentication.conf"
rm "$settings/provider.conf"
install_settings "$1"

grep -qx 'remote-authentication-store = "Active Directory"' "$settings/authentication.conf" ||
  { echo "the active store was changed"; exit 1; }
grep -qx 'provider = "samba"' "$settings/provider.conf" || { echo "provider.conf is missing"; exit 1; }
