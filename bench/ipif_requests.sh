#!/bin/bash
# Times whole ipif requests against `ip -o addr show` on a namespace of N live interfaces.
#
#   bench/ipif_requests.sh [INTERFACES [IPIF...]]      (needs root)
#
# INTERFACES defaults to 1000, IPIF to build/cli/ipif. Each IPIF is a command that runs one ipif
# build; give several (say 'env IPIF_PROVIDER_PATH=old old/ipif' and build/cli/ipif) to compare
# builds on the same namespace. The namespace gets INTERFACES/2 veth pairs, each end with an IPv4
# address and up, and is removed at the end. Each request is timed with hyperfine (median wall
# time and mean CPU time), or, without hyperfine, as the mean wall time of a loop of runs.
# IPIF_BENCH_OUT=DIR keeps each build's output of each request there (DIR/<build>.<request>.txt),
# to check that builds answer alike.
set -euo pipefail

count=${1:-1000}
builds=("${@:2}")
((${#builds[@]})) || builds=("$(realpath build/cli/ipif)")
ns=ipifbench$$
out=${IPIF_BENCH_OUT:-}
json=$(mktemp)

ip netns add "$ns"
trap 'ip netns delete "$ns"; rm -f "$json"' EXIT
{
    for ((pair = 0; pair < count / 2; ++pair)); do
        echo "link add b${pair}x type veth peer name b${pair}y"
        for end in x y; do
            k=$((2 * pair)) && [[ $end == y ]] && k=$((k + 1))
            echo "addr add 10.$((k / 256)).$((k % 256)).1/24 dev b${pair}${end}"
            echo "link set b${pair}${end} up"
        done
    done
} | ip netns exec "$ns" ip -batch -
ip netns exec "$ns" ip link set lo up
# Let IPv6 duplicate address detection on the link-local addresses finish: until then the kernel
# keeps announcing changes, which interrupt dumps and force rebuilds.
sleep 3

endpoint="KVRNX_IPProtocolEndpoint.Name=\"b$((count / 4))x\",CreationClassName=\"KVRNX_IPProtocolEndpoint\""
endpoint+=",SystemName=\"$(hostname)\",SystemCreationClassName=\"KVRNX_ComputerSystem\""
names=(ein ei ei-settings gi)
requests=("ein KVRNX_IPProtocolEndpoint" "ei KVRNX_IPProtocolEndpoint" "ei KVRNX_IPElementSettingData"
          "gi '$endpoint'")

# time NAME COMMAND: one line of the table.
time_one() {
    local name=$1 command=$2 start runs median cpu
    # One run first: its output is kept on request, and a slow request is timed fewer times.
    start=$(date +%s%N)
    ip netns exec "$ns" sh -c "$command" > "${out:-/dev/null}${out:+/$name.txt}" 2>&1
    runs=(--warmup 2 --min-runs 20)
    (($(date +%s%N) - start > 2000000000)) && runs=(--runs 3)
    if command -v hyperfine > /dev/null; then
        ip netns exec "$ns" hyperfine -N "${runs[@]}" --export-json "$json" "$command" > /dev/null 2>&1
        field() { sed -n "s/.*\"$1\": *\([0-9.e+-]*\).*/\1/p" "$json" | head -1; }
        median=$(field median)
        cpu=$(awk -v u="$(field user)" -v s="$(field system)" 'BEGIN { print u + s }')
    else
        local n=10 r
        ((${#runs[@]} == 2)) && n=3
        start=$(date +%s%N)
        for ((r = 0; r < n; ++r)); do ip netns exec "$ns" sh -c "$command" > /dev/null 2>&1; done
        median=$(awk -v t="$(($(date +%s%N) - start))" -v n="$n" 'BEGIN { print t / n / 1e9 }')
        cpu=0
    fi
    [[ $name == ip ]] && base=$median
    awk -v n="$name" -v m="$median" -v b="$base" -v c="$count" -v cpu="$cpu" 'BEGIN {
        printf "  %-26s %9.2f ms %6.2fx ip %7.1f us/interface  (cpu %.2f ms)\n", n, m * 1e3, m / b, m * 1e6 / c, cpu * 1e3 }'
}

[[ -n $out ]] && mkdir -p "$out"
echo "$count interfaces ($(ip netns exec "$ns" ip -o addr show | wc -l) addresses)"
time_one ip "ip -o addr show"
for i in "${!requests[@]}"; do
    for b in "${!builds[@]}"; do
        label=${names[$i]}
        ((${#builds[@]} > 1)) && label="$b.$label"
        time_one "$label" "${builds[$b]} ${requests[$i]}"
    done
done
((${#builds[@]} > 1)) && for b in "${!builds[@]}"; do echo "  build $b: ${builds[$b]}"; done
exit 0
