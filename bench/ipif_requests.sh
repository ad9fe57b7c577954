#!/bin/bash
# Times whole ipif requests against `ip -o addr show` on a namespace of N live interfaces.
#
#   bench/ipif_requests.sh [INTERFACES] [IPIF]     (default 1000 and build/cli/ipif; needs root)
#
# Makes a network namespace of its own with INTERFACES/2 veth pairs, each end with an IPv4 address
# and up, times each request with hyperfine (or, without it, the mean of a loop of runs), and
# removes the namespace again. IPIF_BENCH_OUT=DIR keeps each request's output there, to compare
# the results of two builds.
set -euo pipefail

count=${1:-1000}
ipif=$(realpath "${2:-build/cli/ipif}")
ns=ipifbench$$
out=${IPIF_BENCH_OUT:-}

ip netns add "$ns"
json=$(mktemp)
trap 'ip netns delete "$ns"; rm -f "$json"' EXIT
{
    for ((pair = 0; pair < count / 2; ++pair)); do
        echo "link add b${pair}x type veth peer name b${pair}y"
        for side in 0 1; do
            k=$((2 * pair + side)) end=$([[ $side == 0 ]] && echo x || echo y)
            echo "addr add 10.$((k / 256)).$((k % 256)).1/24 dev b${pair}${end}"
            echo "link set b${pair}${end} up"
        done
    done
} | ip netns exec "$ns" ip -batch -
ip netns exec "$ns" ip link set lo up
# Let IPv6 duplicate address detection on the link-local addresses finish: until then the kernel
# keeps announcing changes, which interrupt dumps and force rebuilds.
sleep 3

host=$(hostname)
endpoint="KVRNX_IPProtocolEndpoint.Name=\"b$((count / 4))x\",CreationClassName=\"KVRNX_IPProtocolEndpoint\",SystemName=\"$host\",SystemCreationClassName=\"KVRNX_ComputerSystem\""
names=("ip -o addr show" "ipif ein KVRNX_IPProtocolEndpoint" "ipif ei KVRNX_IPProtocolEndpoint"
       "ipif ei KVRNX_IPElementSettingData" "ipif gi (one endpoint)")
commands=("ip -o addr show" "$ipif ein KVRNX_IPProtocolEndpoint" "$ipif ei KVRNX_IPProtocolEndpoint"
          "$ipif ei KVRNX_IPElementSettingData" "$ipif gi '$endpoint'")

[[ -n $out ]] && mkdir -p "$out"
echo "$count interfaces ($(ip netns exec "$ns" ip -o addr show | wc -l) addresses)"
for i in "${!commands[@]}"; do
    # One run first: its output is kept on request, and a slow request is timed fewer times.
    start=$(date +%s%N)
    ip netns exec "$ns" sh -c "${commands[$i]}" > "${out:-/dev/null}${out:+/$i.txt}"
    runs=(--warmup 2 --min-runs 10)
    (($(date +%s%N) - start > 2000000000)) && runs=(--runs 3)
    if command -v hyperfine > /dev/null; then
        ip netns exec "$ns" hyperfine -N "${runs[@]}" --export-json "$json" "${commands[$i]}" > /dev/null 2>&1
        field() { sed -n "s/.*\"$1\": *\\([0-9.e+-]*\\).*/\\1/p" "$json" | head -1; }
        mean=$(field mean)
        cpu=$(awk -v u="$(field user)" -v s="$(field system)" 'BEGIN { print u + s }')
    else
        n=$((${#runs[@]} == 2 ? 3 : 10))
        start=$(date +%s%N)
        for ((r = 0; r < n; ++r)); do ip netns exec "$ns" sh -c "${commands[$i]}" > /dev/null; done
        mean=$(awk -v t="$(($(date +%s%N) - start))" -v n="$n" 'BEGIN { print t / n / 1e9 }')
        cpu=0
    fi
    [[ $i == 0 ]] && base=$mean
    awk -v n="${names[$i]}" -v m="$mean" -v b="$base" -v c="$count" -v cpu="$cpu" \
        'BEGIN { printf "  %-38s %9.2f ms %6.2fx ip %7.1f us/interface  (cpu %.2f ms)\n", n, m * 1e3, m / b, m * 1e6 / c, cpu * 1e3 }'
done
