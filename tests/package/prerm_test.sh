#!/bin/bash
# usage: prerm_test.sh PRERM VELMORCTL PROVIDER, in a sandbox
#
# Removing the package takes out what velmorctl has put into the files of the system, and nothing else; an upgrade
# takes out nothing. Files that cannot be changed are told of, and keep no package from going.
set -euo pipefail
prerm=$1
host=/run/host
mkdir -p /run/stand-ins /run/script "$host"/{etc/pam.d,etc/quenix/velmor,usr/share/pam-configs,var/lib/pam}
cp "$3" /usr/libexec/velmor/libctlscript.so
echo 'provider = "ctlscript"' >"$host/etc/quenix/velmor/provider.conf"

# A host whose common-* files pam-auth-update keeps, with a service of its own beside them.
cp /usr/share/pam-configs/unix "$host/usr/share/pam-configs"
cat >/run/debconf.conf <<'SETTINGS'
Config: answers
Templates: templates

Name: answers
Driver: File
Filename: /run/answers.dat

Name: templates
Driver: File
Filename: /run/templates.dat
SETTINGS
DEBIAN_FRONTEND=noninteractive DEBCONF_SYSTEMRC=/run/debconf.conf pam-auth-update --root "$host" --package --force
printf '@include common-%s\n' auth account password session >"$host/etc/pam.d/login"
printf '%s required pam_unix.so\n' auth account >"$host/etc/pam.d/ppp"
printf 'passwd: files\ngroup: files mine\n' >"$host/etc/nsswitch.conf"

# It stands for the installed command, and works on that host.
install -m 755 /dev/stdin /run/stand-ins/velmorctl <<PROGRAM
#!/bin/sh
exec "$2" "\$@" --root $host
PROGRAM
PATH=/run/stand-ins:$PATH

files() { (cd "$host" && find . -path ./var/lib/quenix -prune -o -type f -exec sha256sum {} + | sort); }
fail() { echo "$*" >&2; exit 1; }

before=$(files)
velmorctl pam enable >/dev/null
velmorctl nss add passwd ctlscript >/dev/null
enabled=$(files)
[[ $enabled != "$before" ]] || fail "velmorctl has put in nothing"
grep -q ctlscript "$host/etc/pam.d/common-auth" "$host/etc/pam.d/ppp" || fail "the module is in no policy"

"$prerm" upgrade 2.0
[[ $(files) == "$enabled" ]] || fail "an upgrade changes files"

"$prerm" remove >/run/output
diff <(echo "$before") <(files) || fail "not everything is as it was"

rm -r "$host/etc/pam.d" "$host/etc/nsswitch.conf"
"$prerm" remove >/run/output 2>/run/errors || fail "the package cannot be removed"
grep -q 'stays in /etc/pam.d' /run/errors || fail "nothing is said about the policies"
grep -q 'ctlscript stays in the line of passwd' /run/errors || fail "nothing is said about the name-service switch"
