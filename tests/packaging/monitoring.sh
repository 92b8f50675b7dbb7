#!/usr/bin/env bash
# Runs the alerts' tests, and looks at a fleet as Prometheus does: a real one scrapes a server
# with its metrics, this machine's own, and 200 machines through the exporter, all within one
# interval; then each query of the dashboard has a result there.
# Usage: monitoring.sh PROGRAM MONITORING_DIRECTORY TREE [ANSWERS]
#   ANSWERS  a file for what Prometheus has responded, from which the page's picture is drawn
set -euo pipefail

program=$1
monitoring=$2
tree=$3
answers=${4:-}
directory=$(mktemp -d)
pids=()
# shellcheck disable=SC2317  # called by the trap
cleanup() {
    for pid in "${pids[@]}"; do
        kill "$pid" 2>/dev/null || true
        wait "$pid" 2>/dev/null || true
    done
    rm -rf "$directory"
}
trap cleanup EXIT
fail() {
    echo "FAILED: $*"
    tail -n 20 "$directory"/*.log
    exit 1
}
export ZR_LOG_SINK=none ZR_CONFIG=$directory/platform.conf STATE_DIRECTORY=$directory/state
touch "$directory/platform.conf"

echo "== alerts"
promtool check rules "$monitoring/alerts.yml"
promtool test rules "$monitoring/alerts_test.yml"
# Each alert has a test in which it fires.
while read -r alert; do
    jq -Rse --arg alert "$alert" 'test("alertname: " + $alert + "\n *exp_alerts:\n")' \
        "$monitoring/alerts_test.yml" >/dev/null || fail "no test lets $alert fire"
done < <(sed -n 's/^ *- alert: //p' "$monitoring/alerts.yml")

echo "== the fleet"
cd "$directory"
machines=200
names=$(for ((number = 1; number <= machines; number++)); do printf ',IP:127.0.1.%d' "$number"; done)
openssl req -x509 -newkey ec -pkeyopt ec_paramgen_curve:prime256v1 -nodes -days 2 -subj /CN=test \
    -addext "subjectAltName=IP:127.0.0.1$names" -keyout key.pem -out ca.pem 2>/dev/null
echo secret | "$program" user add --users users scraper >/dev/null
# Leases as of now, all but the one without an end: most are good, and some machines ask, have
# had a lease, or have one of a server that should not serve.
leases() { # leases FILE PROPERTIES: of eth0
    jq --argjson now "$(date +%s)" \
        'walk(if type == "object" and .type == "DHCPLease" and .properties.LeaseExpires < 253402300799
              then .properties += {LeaseObtained: $now, RenewalTime: ($now + 1800),
                                   RebindingTime: ($now + 3150), LeaseExpires: ($now + 3600)}
              else . end)
         | .nodes[0].children[0].children[0].children |= [.[0] | .properties |= (. + '"$2"')]' \
        "$tree" >"$1"
}
leases good.json '{}'
leases asking.json '{ClientState: 2, Address: null, ServerAddress: null, LeaseExpires: null}
    | del(..|nulls)'
# shellcheck disable=SC2016  # jq's own variable
leases ended.json '{LeaseExpires: ($now - 600), LeaseObtained: ($now - 4200)}'
leases rogue.json '{ServerAddress: "192.0.2.66"}'
started() { # started NAME COMMAND...: prints where it listens
    "${@:2}" >"$1.log" 2>&1 &
    pids+=($!)
    until grep -q '^Listening on ' "$1.log" && [[ $1 != *metrics || -n $(sed -n 2p "$1.log") ]]; do
        kill -0 "$!" 2>/dev/null || fail "$1 has not started"
        sleep 0.05
    done
}
# All machines are one server, and all their clients are one.
tls=(--tls-cert ca.pem --tls-key key.pem --users users --max-connections-each 512
    --max-checks-each 512 --max-connection-rate 1000)
declare -A ports
for kind in good asking ended rogue; do
    started $kind-metrics "$program" --tree $kind.json serve --listen 0.0.0.0:0 \
        --metrics 127.0.0.1:0 "${tls[@]}"
    ports[$kind]=$(sed -n 's#^Listening on https://0.0.0.0:\([0-9]*\)/cimom$#\1#p' $kind-metrics.log)
done
direct=$(sed -n 's#^Metrics at https://\(.*\)/metrics$#\1#p' good-metrics.log)
started own-metrics "$program" serve --listen 127.0.0.1:0 --metrics 127.0.0.1:0
own=$(sed -n 's#^Metrics at http://\(.*\)/metrics$#\1#p' own-metrics.log)
targets=()
for ((number = 1; number <= machines; number++)); do
    case $number in
        [1-9] | 10) kind=asking ;;
        1[1-4]) kind=ended ;;
        1[5-9] | 20) kind=rogue ;;
        *) kind=good ;;
    esac
    targets+=("https://127.0.1.$number:${ports[$kind]}")
    echo "machine 127.0.1.$number login scraper password secret"
done >credentials
chmod 600 credentials
printf 'https://127.0.1.*:%s\n' "${ports[@]}" |
    jq -R . | jq -s --arg directory "$directory" \
    '{cacert: ($directory + "/ca.pem"), credentials: ($directory + "/credentials"), targets: .}' \
    >exporter.json
"$program" exporter --check --config exporter.json
started exporter "$program" exporter --config exporter.json --listen 127.0.0.1:0
exporter=$(sed -n 's#^Listening on http://\(.*\)/$#\1#p' exporter.log)

interval=15
cat >servers.yml <<'TEXT'
groups:
  - name: expected-dhcp-servers
    rules:
      - {record: dhcp_expected_server, expr: vector(1), labels: {server: 192.0.2.1}}
      - {record: dhcp_expected_server, expr: vector(1), labels: {server: 198.51.100.1}}
TEXT
{
    cat <<TEXT
global: {scrape_interval: ${interval}s, scrape_timeout: ${interval}s, evaluation_interval: 1s}
rule_files: [$monitoring/alerts.yml, servers.yml]
scrape_configs:
  - job_name: dhcp-clients
    metrics_path: /probe
    static_configs:
      - targets:
TEXT
    printf '          - %s\n' "${targets[@]}"
    cat <<TEXT
    relabel_configs:
      - {source_labels: [__address__], target_label: __param_target}
      - {source_labels: [__param_target], target_label: instance}
      - {target_label: __address__, replacement: '$exporter'}
  - job_name: dhcp-exporter
    scrape_interval: 2s
    scrape_timeout: 2s
    static_configs: [{targets: ['$exporter']}]
  - job_name: dhcp-clients-direct
    scrape_interval: 2s
    scrape_timeout: 2s
    scheme: https
    tls_config: {ca_file: ca.pem}
    basic_auth: {username: scraper, password: secret}
    static_configs: [{targets: ['$direct']}]
  - job_name: dhcp-clients-own
    static_configs: [{targets: ['$own']}]
TEXT
} >prometheus.yml
promtool check config prometheus.yml >/dev/null || fail "the configuration of Prometheus"
free=$(python3 -c 'import socket; s = socket.socket(); s.bind(("127.0.0.1", 0)); print(s.getsockname()[1])')
prometheus --config.file=prometheus.yml --storage.tsdb.path=data --log.level=warn \
    --web.listen-address="127.0.0.1:$free" >prometheus.log 2>&1 &
pids+=($!)
query() { # query EXPRESSION: the result as JSON
    curl --silent --fail-with-body --get --data-urlencode "query=$1" \
        "http://127.0.0.1:$free/api/v1/query"
}
value() { query "$1" 2>/dev/null | jq -r '.data.result[0].value[1] // "0"' 2>/dev/null || echo 0; }
# Prometheus spreads targets over the interval. A rate needs two samples.
patience=$((SECONDS + 120))
rogue='count(ALERTS{alertname="DHCPUnexpectedServer", alertstate="firing", job="dhcp-clients"})'
until [[ $(value 'sum(up)') == $((machines + 3)) && $(value 'sum(probe_success)') == "$machines" &&
    $(value "$rogue") == 6 &&
    $(value 'count(count_over_time(up{job=~"dhcp-exporter|dhcp-clients-direct"}[1h]) >= 2)') == 2 ]]; do
    kill -0 "${pids[-1]}" 2>/dev/null || fail "Prometheus has ended"
    ((SECONDS < patience)) || break
    sleep 0.2
done
expect() { # expect EXPRESSION COMPARISON: it holds
    [[ $(query "$1 $2" | jq '.data.result | length') -gt 0 ]] ||
        fail "not $2: $1: $(value "$1"), probes took up to $(value 'max(probe_duration_seconds)') s"
    echo "ok: $1 $2"
}
expect 'sum(up)' "== $machines + 3"
expect 'sum(probe_success)' "== $machines"
expect 'max(scrape_duration_seconds)' "< $interval"
expect 'cimdhcp_exporter_resident_memory_bytes' '< 64 * 1024 * 1024'
state() { echo "sum(dhcp_client_state{job=\"dhcp-clients\", interface=\"eth0\", state=\"$1\"})"; }
expect "$(state asking)" '== 10'
expect "$(state expired)" '== 4'
expect "$(state bound)" "== $machines - 14"
expect "$rogue" '== 6'
echo "exporter: $(value cimdhcp_exporter_resident_memory_bytes) bytes," \
    "longest probe $(value 'max(probe_duration_seconds)') s"

echo "== the dashboard"
python3 - "$monitoring/dashboard.json" "http://127.0.0.1:$free" "$answers" <<'PYTHON'
import json
import sys
import urllib.parse
import urllib.request

dashboard, prometheus, answers = sys.argv[1:]
board = json.load(open(dashboard))
source = {"type": "prometheus", "uid": "${datasource}"}
failures, kept = [], {}


def ask(expression):
    url = prometheus + "/api/v1/query?" + urllib.parse.urlencode({"query": expression})
    with urllib.request.urlopen(url) as response:
        return json.load(response)["data"]["result"]


def overlap(one, other):
    a, b = one["gridPos"], other["gridPos"]
    return (a["x"] < b["x"] + b["w"] and b["x"] < a["x"] + a["w"]
            and a["y"] < b["y"] + b["h"] and b["y"] < a["y"] + a["h"])


panels = board["panels"]
if len({panel["id"] for panel in panels}) != len(panels):
    failures.append("two panels have one id")
for index, panel in enumerate(panels):
    failures += [f"{panel['title']} lies over {other['title']}"
                 for other in panels[:index] if overlap(panel, other)]
    if panel["type"] == "row":
        continue
    if not (panel["description"] and panel["fieldConfig"]["defaults"]["unit"]):
        failures.append(f"{panel['title']}: no description or unit")
    for target in panel["targets"]:
        if target["datasource"] != source or panel["datasource"] != source:
            failures.append(f"{panel['title']}: another source")
        expression = target["expr"].replace("$job", "dhcp-clients.*").replace("$instance", ".+")
        expression = expression.replace("$__rate_interval", "1m")
        try:
            result = ask(expression)
        except urllib.error.HTTPError as error:
            failures.append(f"{panel['title']}: {error.read().decode()}")
            continue
        kept.setdefault(panel["title"], []).append(result)
        if "$" in expression or not result:
            failures.append(f"{panel['title']}: nothing for {expression}")
for variable in board["templating"]["list"][1:]:
    expression = variable["definition"].removeprefix("label_values(").rsplit(",", 1)[0]
    if not ask(expression.replace("$job", ".*")):
        failures.append(f"variable {variable['name']}: nothing")
if answers:
    json.dump(kept, open(answers, "w"), indent=1)
print(f"{sum(map(len, kept.values()))} queries")
print("\n".join("FAILED: " + each for each in failures))
sys.exit(bool(failures))
PYTHON
