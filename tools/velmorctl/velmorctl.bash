# Completion of velmorctl for bash.

# The options of a command.
_velmorctl_options() {
  case "$1 $2" in
    join\ *) echo "-U --user --password-file --password-fd --proxy --container --skip-hostname-check" ;;
    leave\ *) echo "-U --user --password-file --password-fd" ;;
    status\ * | trust\ * | "dc show" | "smartcard list") echo "--json --timeout" ;;
    "dc prefer" | "smartcard set") echo "--none" ;;
    "store use" | "provider use" | "cam forget") ;;
    "cam trust") echo "--sha256 --yes" ;;
    store\ * | provider\ * | cam\ * | "option get") echo "--json" ;;
    "option set") echo "--text" ;;
    "nss show" | "nss check" | "pam check" | "pam backups") echo "--json --root" ;;
    "nss diff") echo "--root" ;;
    "nss add") echo "--after --dry-run --root" ;;
    "nss restore") echo "--list --json --dry-run --root" ;;
    "pam show") echo "--all --json --root" ;;
    "pam simulate") echo "--user --directory --answer --json --root" ;;
    "pam diff") echo "--enable --disable --root" ;;
    nss\ * | pam\ *) echo "--dry-run --root" ;;
  esac
}

_velmorctl() {
  local word=${COMP_WORDS[COMP_CWORD]} words=
  case ${COMP_CWORD}:${COMP_WORDS[1]}:${COMP_WORDS[2]} in
    1:*) words="status join leave trust store provider dc smartcard cam option nss pam" ;;
    2:trust:*) words="show list" ;;
    2:store:* | 2:provider:*) words="list show use" ;;
    2:dc:*) words="show prefer" ;;
    2:smartcard:*) words="list set" ;;
    2:cam:*) words="discover trust show forget test" ;;
    2:option:*) words="get set" ;;
    2:pam:*) words="show check simulate diff enable disable backups restore" ;;
    2:nss:*) words="show check diff add remove restore" ;;
    3:nss:show | 3:nss:add | 3:nss:remove)
      words="passwd group shadow gshadow hosts networks netgroup initgroups services protocols rpc ethers aliases"
      ;;
    3:store:use) words="None Active\ Directory" ;;
    3:pam:show | 3:pam:simulate) words=$(cd /etc/pam.d 2>/dev/null && compgen -f) ;;
  esac
  words+=" $(_velmorctl_options "${COMP_WORDS[1]}" "${COMP_WORDS[2]}")"
  case ${COMP_WORDS[COMP_CWORD - 1]} in
    --password-file) mapfile -t COMPREPLY < <(compgen -f -- "$word") ;;
    --root) mapfile -t COMPREPLY < <(compgen -d -- "$word") ;;
    --directory) mapfile -t COMPREPLY < <(compgen -W "up down" -- "$word") ;;
    *) mapfile -t COMPREPLY < <(compgen -W "$words" -- "$word") ;;
  esac
}
complete -F _velmorctl velmorctl
