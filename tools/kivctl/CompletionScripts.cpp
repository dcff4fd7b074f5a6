#include "Completion.h"

#include <utility>

namespace
{

constexpr char kBash[] = R"(# Completion of kivctl's command line for bash: asks kivctl for the next words.

_kivctl()
{
    # Bash also breaks words at "=" and ":"; a part that follows without a blank belongs to the word before it.
    local rest=${COMP_LINE:0:COMP_POINT} word prefix line
    local -a words=() lines=()
    for word in "${COMP_WORDS[@]:0:COMP_CWORD}"; do
        if [[ $rest == [[:blank:]]* || ${#words[@]} == 0 ]]; then
            words+=("$word")
        else
            words[-1]+=$word
        fi
        rest=${rest#"${rest%%[![:blank:]]*}"}
        rest=${rest#"$word"}
    done
    if [[ $rest == [[:blank:]]* ]]; then
        words+=("${rest#"${rest%%[![:blank:]]*}"}")
    else
        words[-1]+=$rest
    fi

    local current=${words[-1]}
    mapfile -t lines < <("$1" complete-words "${words[@]:1}" 2>/dev/null)
    COMPREPLY=()
    for line in "${lines[@]}"; do
        if [[ $line == :files ]]; then
            prefix=
            [[ $current == --*=* ]] && prefix=${current%%=*}=
            compopt -o filenames
            while read -r word; do
                COMPREPLY+=("$prefix$word")
            done < <(compgen -f -- "${current#"$prefix"}")
        else
            COMPREPLY+=("${line%%$'\t'*}")
        fi
    done
    [[ ${COMPREPLY[0]-} == *= ]] && compopt -o nospace

    # Bash replaces only the last of its own words.
    prefix=${current%"${current##*[=:]}"}
    if [[ $COMP_WORDBREAKS == *=* && $COMP_WORDBREAKS == *:* ]]; then
        COMPREPLY=("${COMPREPLY[@]#"$prefix"}")
    fi
}

complete -F _kivctl kivctl
)";

constexpr char kZsh[] = R"(#compdef kivctl
# Completion of kivctl's command line for zsh: asks kivctl for the next words.

_kivctl()
{
    local line word
    local -a words_before=("${(@Q)words[2,CURRENT-1]}") candidates=() displays=() open=() open_displays=()
    local files=
    for line in "${(@f)$("${(Q)words[1]}" complete-words "${words_before[@]}" "$PREFIX" 2>/dev/null)}"; do
        word=${line%%$'\t'*}
        if [[ $line == :files ]]; then
            files=yes
        elif [[ $word == *= ]]; then
            open+=("$word")
            open_displays+=("${line/$'\t'/  -- }")
        elif [[ -n $word ]]; then
            candidates+=("$word")
            displays+=("${line/$'\t'/  -- }")
        fi
    done
    ((${#open})) && compadd -l -S '' -d open_displays -a open
    ((${#candidates})) && compadd -l -d displays -a candidates
    if [[ -n $files ]]; then
        compset -P '--*='
        _files
    fi
}

# In a folder of completions this file is the body of the function; when sourced, it defines the function.
if [[ ${funcstack[1]-} == _kivctl ]]; then
    _kivctl "$@"
else
    compdef _kivctl kivctl
fi
)";

constexpr char kFish[] = R"(# Completion of kivctl's command line for fish: asks kivctl for the next words.

function __kivctl_candidates
    set -l before (commandline --tokenize --cut-at-cursor --current-process)
    set -l current (commandline --current-token --cut-at-cursor)
    for line in ($before[1] complete-words $before[2..-1] "$current" 2>/dev/null)
        if test "$line" = :files
            set -l option (string match --regex -- '^--[^=]*=' "$current")
            for file in (__fish_complete_path (string replace -- "$option" '' "$current"))
                echo "$option$file"
            end
        else
            echo $line
        end
    end
end

complete --command kivctl --no-files --arguments '(__kivctl_candidates)'
)";

constexpr std::pair<const char*, const char*> kScripts[] = {{"bash", kBash}, {"zsh", kZsh}, {"fish", kFish}};

} // namespace

std::vector<std::string> CompletionShells()
{
    std::vector<std::string> shells;
    for (const auto& [shell, script] : kScripts)
        shells.emplace_back(shell);
    return shells;
}

std::string CompletionScript(const std::string& shell)
{
    for (const auto& [name, script] : kScripts)
    {
        if (shell == name)
            return script;
    }
    return "";
}
