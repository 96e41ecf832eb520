# Completes a command line as an interactive zsh does.
#   zsh -f complete.zsh FOLDER OFFERED LINE
# FOLDER has the completion functions. OFFERED gets what is offered, one a line, and a last line END.
zmodload zsh/zpty
zpty shell "FOLDER=${(q)1} OFFERED=${(q)2} zsh -f -i"
zpty -w shell 'PS1=; fpath=($FOLDER $fpath); autoload -Uz compinit; compinit -D -u'
# All that completion functions offer goes through compadd; with these options they only ask it for something.
zpty -w shell 'compadd() {
    local -a offered
    (( ${@[(I)-[OAD]]} )) || builtin compadd -A offered "$@"
    (( $#offered )) && print -rl -- $offered >>$OFFERED
    builtin compadd "$@"
}'
zpty -w shell 'offer() { _main_complete; print END >>$OFFERED }; zle -C offer list-choices offer; bindkey "^I" offer'
zpty -w -n shell "$3"$'\t'
repeat 200; do
    grep -qsx END $2 && break
    sleep 0.05
done
zpty -d shell
