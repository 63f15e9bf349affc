# Completion of fileindexctl for bash.
#
# Commands, options and the values they take are read from the tool's own help, so that they are
# never out of date; names of shares and folders come from it with a zero byte after each, so that
# they may hold anything.

# The entries of one section of a help text: "--share SHARE", "pause". SECTION [COMMAND...]
_fileindexctl_entries() {
    local section=$1
    shift
    "${COMP_WORDS[0]}" "$@" --help 2>/dev/null |
        sed -n "/^$section:\$/,/^\$/ { s/^  \([^ ].*\)/\1/; T; s/  .*//; p }"
}

# What readline shows as \ or ' or " before a letter is no part of the name.
_fileindexctl_unquoted() { # WORD
    local word=$1 plain=
    word=${word#[\'\"]}
    while [[ $word == *\\?* ]]; do
        plain+=${word%%\\*}
        word=${word#*\\}
        plain+=${word:0:1}
        word=${word:1}
    done
    printf '%s' "$plain$word"
}

# Adds those of the words on standard input that begin with $cur; each ends in a zero byte.
_fileindexctl_add() { # [PREFIX]
    local word
    while IFS= read -r -d '' word; do
        [[ ${1-}$word != "$cur"* ]] || COMPREPLY+=("${1-}$word")
    done
}

_fileindexctl_shares() { # [PREFIX]
    _fileindexctl_add "${1-}" < <("${COMP_WORDS[0]}" share list --null 2>/dev/null)
}

_fileindexctl_folders() {
    _fileindexctl_add < <("${COMP_WORDS[0]}" list --null 2>/dev/null)
}

# The help names them in a sentence.
_fileindexctl_checks() {
    _fileindexctl_add < <("${COMP_WORDS[0]}" doctor --help 2>/dev/null | tr '\n' ' ' |
        sed -n 's/.* checks are \([a-z, ]*\);.*/\1/p' | tr -s ', ' '\n' | grep -vx and | tr '\n' '\0')
}

# A name that is shown with escapes cannot be completed.
_fileindexctl_marks() {
    _fileindexctl_add < <("${COMP_WORDS[0]}" marks list 2>/dev/null |
        sed -n '/\\/d; s/ *\(not \)\{0,1\}done$//p' | tr '\n' '\0')
}

_fileindexctl_files() { # -f for all files, -d for directories
    local file
    while IFS= read -r file; do
        COMPREPLY+=("$file")
    done < <(compgen "$1" -- "$cur")
}

# What an option or an argument takes: "SHARE", "PATH...", "yes|no".
_fileindexctl_values() { # KIND COMMAND...
    case $1,${2-} in
    SHARE,* | OLD,* | NEW,*) _fileindexctl_shares ;;
    PATH*,add) _fileindexctl_shares / && _fileindexctl_files -d ;;
    PATH*,query)
        [[ " ${COMP_WORDS[*]} " == *" --share "* ]] && _fileindexctl_shares && return
        _fileindexctl_folders
        _fileindexctl_files -f
        ;;
    PATH*,*) _fileindexctl_folders ;;
    CHECK*) _fileindexctl_checks ;;
    MARK,*) _fileindexctl_marks ;;
    *'|'*) _fileindexctl_add < <(tr '|' '\0' <<<"$1" | tr -d '\n' && printf '\0') ;;
    esac
}

_fileindexctl() {
    local cur=${COMP_WORDS[COMP_CWORD]} option=${COMP_WORDS[COMP_CWORD - 1]} attached=no
    COMPREPLY=()
    # "--option=value" is three words to readline.
    if [[ $cur == = ]]; then
        cur='' attached=yes
    elif [[ $option == = && $COMP_CWORD -gt 2 ]]; then
        option=${COMP_WORDS[COMP_CWORD - 2]} attached=yes
    fi
    cur=$(_fileindexctl_unquoted "$cur")

    local chosen=() word entry
    for word in "${COMP_WORDS[@]:1:COMP_CWORD-1}"; do
        [[ $word != -* ]] || continue
        _fileindexctl_entries Commands "${chosen[@]}" | grep -qxF -- "$word" || break
        chosen+=("$word")
    done

    local names=() name kind
    while IFS= read -r entry; do
        name=${entry%%[ \[]*}
        kind=${entry#"$name"}
        [[ -n $kind || $attached == no ]] || continue
        # A value in brackets is never a word of its own.
        if [[ ,$name, == *",$option,"* && -n $kind && ($attached == yes || $kind != '['*) ]]; then
            kind=${kind#[ \[]}
            kind=${kind#=}
            compopt -o filenames 2>/dev/null
            _fileindexctl_values "${kind%]}" "${chosen[@]}"
            return
        fi
        names+=("${name//,/$'\n'}")
    done < <(_fileindexctl_entries Options "${chosen[@]}")

    if [[ $cur == -* ]]; then
        mapfile -t COMPREPLY < <(compgen -W "${names[*]}" -- "$cur")
        return
    fi
    mapfile -t COMPREPLY < <(compgen -W "$(_fileindexctl_entries Commands "${chosen[@]}")" -- "$cur")
    [[ ${#COMPREPLY[@]} -eq 0 ]] || return
    entry=$(_fileindexctl_entries Arguments "${chosen[@]}")
    [[ -z $entry ]] || {
        compopt -o filenames 2>/dev/null
        _fileindexctl_values "${entry%%$'\n'*}" "${chosen[@]}"
    }
}

complete -F _fileindexctl fileindexctl
