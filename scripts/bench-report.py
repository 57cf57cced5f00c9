#!/usr/bin/env python3
"""Prints each benchmark figure beside its floor, with the ratio and the target it meets or
misses, and writes the Google Benchmark JSON files it reads as one, with that table added
(as "figures").

Usage: bench-report.py OUTPUT.json INPUT.json...
Exits 0 whatever the figures are: a missed target is news, not a broken build."""
import json
import re
import sys

# (figure, measured benchmark, floor benchmarks summed, kind, target)
# kind "time": ratio = measured / floor, lower is better; "rate": ratio = floor / measured
# time, i.e. measured throughput over the floor's, higher is better.
FIGURES = [
    ("framing, 1 KiB bodies", "Framing_vexil/1024", ["Framing_floor/1024"], "rate", None),
    ("framing, 64 KiB bodies", "Framing_vexil/65536", ["Framing_floor/65536"], "rate", None),
    ("framing, 16 MiB bodies", "Framing_vexil/16777216", ["Framing_floor/16777216"], "rate", (">=", 0.5)),
    ("hover round trip", "RoundTrip_hover_vexil", ["RoundTrip_hover_floor"], "time", ("<=", 1.1)),
    ("hover through the connection", "RoundTrip_hover_connection", ["RoundTrip_hover_floor"], "time", ("<=", 1.1)),
    ("1 MiB completion round trip", "RoundTrip_completion_vexil", ["RoundTrip_completion_floor"], "time",
     ("<=", 4.0)),
    ("1 MiB completion, connection", "RoundTrip_completion_connection", ["RoundTrip_completion_floor"], "time",
     ("<=", 4.0)),
    ("1 MiB completion into the model", "Json_completion_vexil", ["Json_completion_floor"], "time", ("<=", 1.2)),
    ("  and each item's JSON kept", "Json_completion_items_json", ["Json_completion_floor"], "time", None),
    ("writing InitializeParams", "Json_initialize_vexil", ["Json_initialize_floor"], "time", None),
]

# The watcher's figures come from counters of one benchmark that measures both sides:
# (figure, benchmark, measured counter, floor counter, kind, target, unit). The figure may
# name other counters of the benchmark in braces.
WATCHER = [
    ("{burst:.0f}-file burst delivered", "BM_CreationBurst", "monitor_events_per_s", "floor_events_per_s", "rate",
     (">=", 0.8), "ev/s"),
    ("rename to its callback", "BM_RenameLatency", "monitor_latency_us", "floor_latency_us", "time", None, "us"),
    ("watch start-up, {directories:.0f} dirs", "BM_StartupOverTree", "monitor_ms", "floor_ms", "time", ("<=", 1.5),
     "ms"),
]

# The JavaScript client (bench/js) against vexil's connection and the bare floor, all three
# asking the same fake server answering from the same result files: (figure, request,
# measured side, reference side, target), the sides named as in SIDES.
JAVASCRIPT = [
    ("1 MiB completion, vexil / JS", "completion", "vexil", "js", ("<=", 0.5)),
    ("1 MiB completion, JS / floor", "completion", "js", "floor", None),
    ("hover, vexil / floor", "hover", "vexil", "floor", ("<=", 1.2)),
    ("hover, vexil / JS", "hover", "vexil", "js", None),
]
SIDES = {"vexil": "RoundTrip_%s_connection", "js": "RoundTrip_%s_js", "floor": "RoundTrip_%s_floor"}

# (figure, benchmark, counter, limit or None, unit)
MEMORY = [
    ("flood while idle: peak growth", "Memory_abusive_server", "peak_growth_MiB", 128, "MiB"),
    ("flood while idle: growth after it", "Memory_abusive_server", "idle_growth_MiB", 128, "MiB"),
    ("next request answered (1 = yes)", "Memory_abusive_server", "next_reply_ok", None, ""),
    ("next request's reply time", "Memory_abusive_server", "next_reply_ms", None, "ms"),
    ("command output flood: peak growth", "Memory_command_output", "peak_growth_MiB", 16, "MiB"),
    ("command output lines traced", "Memory_command_output", "lines_traced", None, ""),
]

UNIT_SECONDS = {"ns": 1e-9, "us": 1e-6, "ms": 1e-3, "s": 1.0}


def base_name(run_name):
    """The benchmark's name without the decorations Google Benchmark adds."""
    return re.sub(r"/(repeats:\d+|real_time|manual_time|iterations:\d+)", "", run_name)


def medians(benchmarks):
    """Median real time in seconds of every benchmark run with repetitions."""
    found = {}
    for entry in benchmarks:
        if entry.get("run_type") == "aggregate" and entry.get("aggregate_name") == "median":
            found[base_name(entry["run_name"])] = entry["real_time"] * UNIT_SECONDS[entry["time_unit"]]
    return found


def counters(benchmarks):
    """Every counter of the single-run benchmarks, by benchmark name."""
    found = {}
    for entry in benchmarks:
        if entry.get("run_type") == "iteration":
            found.setdefault(base_name(entry["run_name"]), {}).update(entry)
    return found


def meets(ratio, target):
    comparison, bound = target
    return ratio >= bound if comparison == ">=" else ratio <= bound


def ratio_rows(times):
    rows = []
    for figure, measured, floors, kind, target in FIGURES:
        if measured not in times or any(f not in times for f in floors):
            rows.append({"figure": figure, "missing": True})
            continue
        floor = sum(times[f] for f in floors)
        ratio = floor / times[measured] if kind == "rate" else times[measured] / floor
        rows.append({"figure": figure, "measured_s": times[measured], "floor_s": floor, "kind": kind,
                     "ratio": ratio, "target": "%s %.1f" % target if target else None,
                     "met": meets(ratio, target) if target else None})
    return rows


def title(figure, run):
    """The figure's name with the counters it names filled in, or N for those missing."""
    return re.sub(r"\{(\w+)(:[^}]*)?\}", lambda m: format(run[m.group(1)], (m.group(2) or ":")[1:])
                  if m.group(1) in run else "N", figure)


def watcher_rows(runs):
    rows = []
    for figure, benchmark, measured, floor, kind, target, unit in WATCHER:
        run = runs.get(benchmark, {})
        if measured not in run or floor not in run:
            rows.append({"figure": title(figure, run), "missing": True})
            continue
        ratio = run[measured] / run[floor]
        rows.append({"figure": title(figure, run), "measured": run[measured], "floor": run[floor], "unit": unit,
                     "kind": kind, "ratio": ratio, "target": "%s %.1f" % target if target else None,
                     "met": meets(ratio, target) if target else None})
    return rows


def memory_rows(runs):
    rows = []
    for figure, benchmark, counter, limit, unit in MEMORY:
        value = runs.get(benchmark, {}).get(counter)
        rows.append({"figure": figure, "value": value, "unit": unit, "limit": limit,
                     "met": None if limit is None or value is None else value < limit})
    return rows


def javascript_client(benchmarks, times):
    """What the JavaScript client ran on; why it was skipped, when some figure of it is missing;
    and why some of its runs failed, when its figures were measured all the same."""
    client, failures = None, {}
    names = {SIDES["js"] % request for _, request, _, _, _ in JAVASCRIPT}
    for entry in benchmarks:
        name = base_name(entry.get("run_name", entry["name"]))
        if name not in names:
            continue
        if entry.get("error_occurred"):
            failures.setdefault(name, entry.get("error_message") or "the JavaScript client failed")
        client = client or entry.get("label")
    skipped = next((failure for name, failure in failures.items() if name not in times), None)
    failed = next((failure for name, failure in failures.items() if name in times), None)
    return client, skipped, failed


def javascript_rows(times, skipped):
    """The comparison's rows; those that need a figure of the client it was skipped for are left out."""
    rows = []
    for figure, request, measured, reference, target in JAVASCRIPT:
        sides = {side: times.get(name % request) for side, name in SIDES.items()}
        if skipped and "js" in (measured, reference) and sides["js"] is None:
            continue
        if sides[measured] is None or sides[reference] is None:
            rows.append({"figure": figure, "missing": True})
            continue
        ratio = sides[measured] / sides[reference]
        rows.append({"figure": figure, "vexil_s": sides["vexil"], "js_s": sides["js"], "floor_s": sides["floor"],
                     "ratio": ratio, "target": "%s %.1f" % target if target else None,
                     "met": meets(ratio, target) if target else None})
    return rows


def verdict(met):
    return "-" if met is None else ("met" if met else "MISSED")


def show_time(row):
    if row["kind"] == "rate":
        return "%9.3f ms" % (row["measured_s"] * 1e3), "%9.3f ms" % (row["floor_s"] * 1e3)
    return "%9.1f us" % (row["measured_s"] * 1e6), "%9.1f us" % (row["floor_s"] * 1e6)


def microseconds(seconds):
    return "-" if seconds is None else "%.1f us" % (seconds * 1e6)


def print_javascript(client, skipped, failed, rows):
    print("\nJavaScript client (%s, JSON.parse), on the same fake server and result files"
          % (client or "vscode-jsonrpc"))
    if skipped:
        print("JavaScript client comparison skipped: %s" % skipped)
    if failed:
        print("JavaScript client failed in some runs, left out of its medians: %s" % failed)
    header = ("figure (median)", "vexil", "JS client", "floor", "ratio", "target", "")
    print("%-34s %12s %12s %12s %7s %9s %7s" % header)
    for row in rows:
        if row.get("missing"):
            print("%-34s %s" % (row["figure"], "not measured"))
            continue
        print("%-34s %12s %12s %12s %7.2f %9s %7s" % (row["figure"], microseconds(row["vexil_s"]),
                                                      microseconds(row["js_s"]), microseconds(row["floor_s"]),
                                                      row["ratio"], row["target"] or "-", verdict(row["met"])))
    print("(vexil: through the connection; floor: the bare round trip, framed by hand and never parsed)")


def print_table(ratios, watcher, memory):
    print("\n%-34s %12s %12s %7s %9s %7s" % ("figure (median)", "vexil", "floor", "ratio", "target", ""))
    for row in ratios:
        if row.get("missing"):
            print("%-34s %s" % (row["figure"], "not measured"))
            continue
        measured, floor = show_time(row)
        print("%-34s %12s %12s %7.2f %9s %7s" % (row["figure"], measured, floor, row["ratio"],
                                                 row["target"] or "-", verdict(row["met"])))
    for row in watcher:
        if row.get("missing"):
            print("%-34s %s" % (row["figure"], "not measured"))
            continue
        print("%-34s %12s %12s %7.2f %9s %7s" % (row["figure"], "%.1f %s" % (row["measured"], row["unit"]),
                                                 "%.1f %s" % (row["floor"], row["unit"]), row["ratio"],
                                                 row["target"] or "-", verdict(row["met"])))
    print("(framing and burst ratios are throughput over the floor's; the others are time over the floor's)")
    for row in memory:
        value = "not measured" if row["value"] is None else "%.1f %s" % (row["value"], row["unit"])
        limit = "< %d %s" % (row["limit"], row["unit"]) if row["limit"] else "-"
        print("%-34s %12s %12s %7s %9s %7s" % (row["figure"], value, "", "", limit, verdict(row["met"])))


def merged(paths):
    """The first file's context with the benchmarks of all of them."""
    results = None
    for path in paths:
        with open(path) as handle:
            loaded = json.load(handle)
        if results is None:
            results = loaded
        else:
            results["benchmarks"] += loaded["benchmarks"]
    return results


def main(path, inputs):
    results = merged(inputs)
    times = medians(results["benchmarks"])
    ratios = ratio_rows(times)
    runs = counters(results["benchmarks"])
    watcher = watcher_rows(runs)
    memory = memory_rows(runs)
    client, skipped, failed = javascript_client(results["benchmarks"], times)
    javascript = javascript_rows(times, skipped)
    print_table(ratios, watcher, memory)
    print_javascript(client, skipped, failed, javascript)
    results["figures"] = {"ratios": ratios, "watcher": watcher, "memory": memory,
                          "javascript": {"client": client, "skipped": skipped, "failed": failed,
                                         "rows": javascript}}
    with open(path, "w") as handle:
        json.dump(results, handle, indent=2)


if __name__ == "__main__":
    main(sys.argv[1], sys.argv[2:])
