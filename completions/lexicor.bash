# What can stand next is what the program says; where it says nothing, a file.
_lexicor() {
  local IFS=$' \t\n' words cur
  read -ra words <<<"${COMP_LINE:0:COMP_POINT}"
  case ${COMP_LINE:0:COMP_POINT} in *[[:blank:]]) words+=('') ;; esac
  mapfile -t COMPREPLY < <("${words[0]}" --complete "${words[@]:1}" 2>/dev/null)
  # Of the word readline replaces what stands behind a break.
  cur=${words[-1]}
  if [[ $cur == *["$COMP_WORDBREAKS"]* ]]; then
    COMPREPLY=("${COMPREPLY[@]#"${cur%"${cur##*["$COMP_WORDBREAKS"]}"}"}")
  fi
}
complete -o default -F _lexicor lexicor lexicor-data lexicor-gencat
