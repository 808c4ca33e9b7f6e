# SPDX-License-Identifier: Apache-2.0
# The tables of one program of benchmarks, from the JSON of Google Benchmark. The program announces
# them in its context (bench/comparisons.hpp); a table of all its figures is always there.
#   jq -r --arg show names    -f report.jq FILE               the names of the tables, one a line
#   jq -r --arg show markdown --arg table NAME -f report.jq FILE    one table as Markdown
#   jq -r --arg show bars     --arg table NAME -f report.jq FILE    the same for bars.gnuplot
#   jq -r --arg show origin   --arg machine TEXT -f report.jq FILE  when and where it was measured

# ---- Numbers as text --------------------------------------------------------------------------

# Three significant digits of a number above 0, without an exponent.
def digits:
  . as $x
  | (2 - ($x | log10 | floor)) as $decimals
  | if $decimals <= 0 then $x | round | tostring
    else
      ($x * pow(10; $decimals) | round | tostring) as $all
      | ("0" * ([$decimals + 1 - ($all | length), 0] | max) // "") + $all
      | .[:-$decimals] + "." + .[-$decimals:]
    end;

def step($steps): . as $x | first(($steps[] | select($x >= .[0])), $steps[-1]);
def scaled($steps): step($steps) as [$one, $unit] | (. / $one | digits) + " " + $unit;

def time_units: [[1e9, "s"], [1e6, "ms"], [1e3, "µs"], [1, "ns"]];
def as_time: scaled(time_units);
def as_rate($of): scaled([[1e9, "G\($of)/s"], [1e6, "M\($of)/s"], [1e3, "k\($of)/s"], [1, "\($of)/s"]]);

# ---- Figures ----------------------------------------------------------------------------------

# What Google Benchmark adds to a name.
def bare: gsub("/((min_time|min_warmup_time|iterations|repeats|threads):[^/]*|real_time|process_time|manual_time)"; "");

def nanoseconds: {"ns": 1, "us": 1e3, "ms": 1e6, "s": 1e9}[.time_unit] as $unit
  # By the same clock as the rate.
  | (if .run_name | test("/real_time") then .real_time else .cpu_time end) * $unit;

# {name: {time (ns), items, bytes (a second), median}}; medians, or single runs where there are none.
def figures:
  (.context.rates // "" | split("\n") | map(select(. != "") | split("|")
    | {key: .[0], value: {items: (.[1] | tonumber)}}) | from_entries) as $foreign
  | reduce (.benchmarks[] | select((.error_occurred // false) | not)
            | select(.run_type == "iteration" or .aggregate_name == "median")) as $run ($foreign;
      ($run.run_type == "aggregate") as $median
      | ($run.run_name | bare) as $name
      | if .[$name].median and ($median | not) then .
        else .[$name] = {time: ($run | nanoseconds), items: $run.items_per_second,
                         bytes: $run.bytes_per_second, median: $median}
        end);

def speed: .bytes // .items;
def speed_text: if .bytes then .bytes | as_rate("B") elif .items then .items | as_rate("") else null end;

# ---- Tables: {head, rows, bars: {axis, head, rows}}; a bar that is null is left out ------------

def lines: split("\n") | map(select(. != "") | split("|"));

def goal_text($goal; $met; $at_ceiling):
  "\($goal)" + (if $met then "" elif $at_ceiling then " (at the ceiling)" else " (missed)" end);

# Names without a last part that all of them have.
def trimmed:
  if (map(split("/")[-1]) | unique | length) == 1 and all(.[]; index("/")) then
    map(.[:rindex("/")])
  else . end;

def quotients($figures):
  [lines[]
   | {of: .[0], peers: (.[1] | split(",")), goal: (.[2] | tonumber), ceiling: .[3]}
   | . as {$of, $peers, $goal, $ceiling}
   | $figures[$of] as $own | select($own)
   | [$peers[] | select($figures[.])] | select(length > 0) | max_by($figures[.] | speed) as $peer
   | $figures[$peer] as $other
   | (if $own.bytes and $other.bytes then {own: $own, $other}
      else {own: ($own | del(.bytes)), other: ($other | del(.bytes))} end)
   | ((.own | speed) / (.other | speed)) as $ratio
   | {$of, $peer, $ratio, $goal, rate: (.own | speed_text), peer_rate: (.other | speed_text),
      verdict: (if $goal == 0 then "" else
                  goal_text($goal; $ratio >= $goal;
                    $ceiling != "" and $figures[$ceiling] and
                    ($own | speed) >= ($figures[$ceiling] | speed)) end)}]
  | . as $all
  | length as $rows
  | (map(.of) + map(.peer) | trimmed) as $names
  | (map(.of) | trimmed) as $own_names
  | (map(.of) | unique | length == $rows) as $told_apart
  | (if any(.[]; .goal != 0) then 1 else 0 end) as $goals
  | {head: ["", "Rate", "Fastest peer", "Its rate", "Quotient", "Goal: at least"][:5 + $goals],
     rows: [range($rows) as $i | $all[$i]
            | ["`\($names[$i])`", .rate, "`\($names[$rows + $i])`", .peer_rate, (.ratio | digits), .verdict]
            | .[:5 + $goals]],
     bars: {axis: "quotient of the rates", head: ["quotient", "goal"][:1 + $goals],
            rows: [range($rows) as $i | $all[$i]
                   | [(if $told_apart then $own_names[$i]
                       else "\($names[$i]) over \($names[$rows + $i])" end), .ratio,
                      (if .goal == 0 then null else .goal end)]
                   | .[:2 + $goals]]}};

def times($figures):
  [lines[] | {of: .[0], limit: (.[1] | tonumber)} | . as {$of, $limit}
   | $figures[$of].time as $time | select($time)
   | {cells: ["`\($of)`", ($time | as_time),
              ($limit | step(time_units) as [$one, $unit] | "\(. / $one) \($unit)")
              + if $time < $limit then "" else " (missed)" end],
      bar: [$of, $time / $limit, 1]}]
  | {head: ["", "Median time", "Goal: below"], rows: map(.cells),
     bars: {axis: "time as a share of the goal", head: ["share", "goal"], rows: map(.bar)}};

def in_order: unique | sort_by([(tonumber? // -1), .]);

# A cell has the rate, or the time of what has none. Bars are of one unit: bytes where there are any.
def matrix($figures):
  ([$figures | to_entries[] | select(.value.time)
    | (.key | rindex("/")) as $cut
    | {row: (if $cut then .key[:$cut] else .key end), column: (if $cut then .key[$cut + 1:] else "" end),
       figure: .value}]) as $cells
  | any($cells[]; .figure.bytes) as $bytes
  | def bar: if $bytes then (if .bytes then .bytes * 1e-9 else null end)
             elif .items then .items * 1e-6 else null end;
    def at($row; $column): first($cells[] | select(.row == $row and .column == $column) | .figure) // {};
    ([$cells[].row] | in_order) as $rows
  | ([$cells[].column] | in_order) as $columns
  | ([$cells[] | select(.figure | bar) | .column] | in_order) as $barred
  | {head: ([""] + $columns),
     rows: [$rows[] as $row | ["`\($row)`"] + [$columns[] as $column
       | at($row; $column) | speed_text // (if .time then .time | as_time else "" end)]],
     bars: {axis: (if $bytes then "GB/s" else "millions of values a second" end),
            head: $barred,
            rows: [$rows[] as $row | [$row] + [$barred[] as $column | at($row; $column) | bar]
              | select(any(.[1:][]; . != null))]}};

def tables:
  figures as $figures
  | ([.context | to_entries[] | .key as $key | .value as $value
      | if $key | startswith("quotients: ") then {name: $key[11:], value: ($value | quotients($figures))}
        elif $key | startswith("times: ") then {name: $key[7:], value: ($value | times($figures))}
        else empty end]
     + [{name: "figures", value: matrix($figures)}])
  | map(select(.value.rows | length > 0));

# ---- Texts ------------------------------------------------------------------------------------

def row: "|" + (map(" " + (. // "") + " |") | join(""));

def markdown: (.head | row), ("|" + (.head | map("---|") | join(""))), (.rows[] | row);

def bars:
  .bars
  | (.axis + ([.head[] | "\t" + .] | join(""))),
    (.rows[] | .[0] + ([.[1:][] | "\t" + (. // "nan" | tostring)] | join("")));

def origin($machine):
  "Measured by `\(.context.executable | split("/")[-1])` on \(.context.date[:10]), \($machine), "
  + "\(.context.num_cpus) processors, load \(.context.load_avg[0] * 10 | round / 10) at its start.";

if (.context | type) != "object" or (.benchmarks | type) != "array" then
  error("not the JSON of Google Benchmark")
elif $show == "names" then tables[].name
elif $show == "origin" then origin($machine)
else
  first((tables[] | select(.name == $table) | .value), error("no table \($table)"))
  | if $show == "markdown" then markdown else bars end
end
