# Completion of velmorctl for bash.
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
    *:join:* | *:leave:*) words="-U --password-file --password-fd --proxy" ;;
    3:pam:show | 3:pam:simulate) words="--all $(cd /etc/pam.d 2>/dev/null && compgen -f)" ;;
    *:pam:diff) words="--enable --disable --root" ;;
    *:pam:enable | *:pam:disable | *:pam:restore) words="--dry-run --root" ;;
    *:pam:*) words="--user --directory --answer --root --json up down" ;;
    *:nss:*) words="--root --dry-run --after --list --json" ;;
    *) words="--json --timeout" ;;
  esac
  if [[ ${COMP_WORDS[COMP_CWORD - 1]} == --password-file ]]; then
    mapfile -t COMPREPLY < <(compgen -f -- "$word")
  elif [[ ${COMP_WORDS[COMP_CWORD - 1]} == --root ]]; then
    mapfile -t COMPREPLY < <(compgen -d -- "$word")
  else
    mapfile -t COMPREPLY < <(compgen -W "$words" -- "$word")
  fi
}
complete -F _velmorctl velmorctl
