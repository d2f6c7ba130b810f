#include "chart/ChartStyle.h"

namespace vantor::analyze {

const char* const chartStyle = R"(
text { font-family: system-ui, "Segoe UI", Roboto, "DejaVu Sans", sans-serif; font-size: 12px;
    fill: #1f2328; }
text.name { font-family: "DejaVu Sans Mono", Menlo, Consolas, "Liberation Mono", monospace;
    font-size: 11px; }
text.heading { font-size: 19px; font-weight: 600; }
text.tick, text.figure, text.quiet { font-size: 11px; fill: #57606a; }
text.figure { font-variant-numeric: tabular-nums; }
.paper { fill: #ffffff; }
.lane { fill: #eef1f4; }
.grid { stroke: #d0d7de; stroke-width: 1; fill: none; }
.loading { fill: #8c959f; fill-opacity: .18; }
.bar { fill: #0072b2; stroke: #ffffff; stroke-width: .5; }
.bar.thin { stroke-width: .25; }
.names { pointer-events: none; }
text.inside { fill: #ffffff; stroke: #0072b2; stroke-width: 3px; paint-order: stroke; }
text.inside.on-chain { stroke: #b8440a; font-weight: 700; }
.chain .bar { fill: #b8440a; stroke: #5c1f00; stroke-width: 1.2; }
.chain .bar.thin { stroke: #b8440a; stroke-width: .25; }
.more { fill: #0072b2; }
.chain .more { fill: #b8440a; }
.chain text.name, .chain text.figure { font-weight: 700; }
.link { fill: none; stroke: #b8440a; stroke-width: 1.5; }
.worker-wait { fill: url(#worker-wait); stroke: #8a6100; stroke-width: .6; }
.worker-wait-line { stroke: #b97f00; stroke-width: 2; }
.barrier-wait { stroke: #8c959f; stroke-width: 1.5; stroke-dasharray: 1.5 2.5; fill: none; }
.barrier .mark { fill: #7a3b9a; }
.barrier .pole { stroke: #7a3b9a; stroke-width: 1; stroke-opacity: .55; stroke-dasharray: 4 2; }
.barrier .flag { fill: #6b2f8a; }
.barrier.chain .pole { stroke-opacity: 1; stroke-width: 1.6; stroke-dasharray: none; }
.row { fill: #000000; fill-opacity: 0; }
.row.odd { fill-opacity: .03; }
g:hover > .row { fill-opacity: .1; }
g:hover > .bar { fill-opacity: .75; }
g:hover > .pole { stroke-opacity: 1; stroke-width: 2.5; }
@media (prefers-color-scheme: dark) {
text { fill: #e6edf3; }
text.tick, text.figure, text.quiet { fill: #a3adb8; }
.paper { fill: #0f1419; }
.lane { fill: #1b222a; }
.grid { stroke: #303842; }
.bar { fill: #56b4e9; stroke: #0f1419; }
text.inside { fill: #06121a; stroke: #56b4e9; }
text.inside.on-chain { stroke: #ff9d42; }
.chain .bar { fill: #ff9d42; stroke: #ffe0c2; }
.chain .bar.thin { stroke: #ff9d42; }
.more { fill: #56b4e9; }
.chain .more { fill: #ff9d42; }
.link { stroke: #ff9d42; }
.worker-wait { stroke: #f0c05a; }
.worker-wait-line { stroke: #f0c05a; }
.barrier-wait { stroke: #7d8792; }
.barrier .mark { fill: #d9a3f2; }
.barrier .pole { stroke: #d9a3f2; }
.barrier .flag { fill: #e0b3f5; }
.row { fill: #ffffff; }
}
)";

const char* const chartPatterns =
    "<defs><pattern id=\"worker-wait\" width=\"5\" height=\"5\" patternUnits=\"userSpaceOnUse\" "
    "patternTransform=\"rotate(45)\"><line class=\"worker-wait-line\" x1=\"1\" y1=\"0\" x2=\"1\" "
    "y2=\"5\"/></pattern></defs>\n";

const char* const pageStyle = R"(
body { margin: 1.5rem; background: #ffffff; color: #1f2328;
    font-family: system-ui, "Segoe UI", Roboto, "DejaVu Sans", sans-serif; }
figure { margin: 0; overflow-x: auto; }
@media (prefers-color-scheme: dark) { body { background: #0f1419; color: #e6edf3; } }
)";

}  // namespace vantor::analyze
