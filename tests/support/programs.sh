# For scripts that start programs: needs the directory `scratch` and the array `pids`.

fail() # text
{
    echo "$1" >&2
    head -50 "$scratch"/*.log >&2
    exit 1
}

# Starts a program in the background and waits until it prints the text.
start() # name text-that-it-prints command...
{
    local log=$scratch/$1.log text=$2 deadline=$((SECONDS + 20))
    shift 2
    : >"$log"
    "$@" >>"$log" 2>&1 &
    pids+=($!)
    until grep --quiet "$text" "$log"; do
        ((SECONDS < deadline)) && kill -0 "${pids[-1]}" 2>/dev/null || fail "not ready: $*"
        sleep 0.02
    done
}
