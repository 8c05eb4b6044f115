// How the page looks.
#pragma once

namespace cli {

inline constexpr char report_style[] = R"(
:root { color-scheme: light dark; --page: #f6f7f9; --card: #ffffff; --ink: #1b2330; --soft: #5d6878; --line: #dfe3ea;
  --before: #d9730d; --after: #1769d2; --truth: #12845a; --bad: #b3261e; }
@media (prefers-color-scheme: dark) {
  :root { --page: #12161d; --card: #1b212b; --ink: #e8ecf2; --soft: #9aa6b8; --line: #313a48;
    --before: #f5a04c; --after: #6cb0ff; --truth: #5ad19f; --bad: #ff8a80; } }
* { box-sizing: border-box; }
body { margin: 0; background: var(--page); color: var(--ink); font: 16px/1.5 system-ui, sans-serif; }
main { max-width: 1120px; margin: 0 auto; padding: 2rem 1rem 3rem; }
h1 { font-size: 1.7rem; line-height: 1.2; margin: 0 0 .3rem; overflow-wrap: anywhere; }
h2 { font-size: 1.15rem; margin: 2.2rem 0 .8rem; overflow-wrap: anywhere; }
p { margin: .4rem 0; max-width: 46rem; }
.soft, figcaption, footer { color: var(--soft); font-size: .9rem; }
.tiles { display: grid; gap: .8rem; margin: 1.4rem 0; grid-template-columns: repeat(auto-fit, minmax(min(100%, 15rem), 1fr)); }
.tile, figure, .table { background: var(--card); border: 1px solid var(--line); border-radius: 10px; }
.tile { padding: .9rem 1rem; }
.tile b { display: block; font-weight: 600; font-size: .9rem; }
.tile span { display: block; font-size: 1.5rem; font-variant-numeric: tabular-nums; white-space: nowrap; }
.tile .was { display: inline; color: var(--before); }
.tile .is { display: inline; color: var(--after); font-weight: 600; }
.pictures { display: grid; gap: .8rem; grid-template-columns: repeat(auto-fit, minmax(min(100%, 20rem), 1fr)); }
.charts { display: grid; gap: .8rem; margin-top: .8rem; grid-template-columns: repeat(auto-fit, minmax(min(100%, 28rem), 1fr)); }
figure { margin: 0; overflow: hidden; }
figure img { display: block; width: 100%; height: auto; background: #000; }
figure svg { display: block; width: 100%; height: auto; padding: .6rem .4rem .2rem; }
figcaption { padding: .5rem .8rem .6rem; overflow-wrap: anywhere; }
figcaption b { color: var(--ink); }
svg text { fill: var(--soft); font: 12px system-ui, sans-serif; }
.grid { stroke: var(--line); stroke-width: 1; }
.line { fill: none; stroke-width: 1.5; stroke-linejoin: round; }
.line.before, .area.before { stroke: var(--before); }
.line.after, .area.after { stroke: var(--after); }
.line.truth, .area.truth { stroke: var(--truth); }
.area { stroke-width: 1.2; fill-opacity: .18; }
.area.before { fill: var(--before); }
.area.after { fill: var(--after); }
.area.truth { fill: none; }
.line.truth { stroke-width: 3; stroke-opacity: .6; }
.table { overflow-x: auto; }
table { border-collapse: collapse; width: 100%; font-variant-numeric: tabular-nums; font-size: .92rem; }
th, td { padding: .4rem .8rem; text-align: right; white-space: nowrap; }
th:nth-child(-n+2), td:nth-child(-n+2) { text-align: left; }
thead th { color: var(--soft); font-weight: 600; border-bottom: 1px solid var(--line); }
tbody tr:nth-child(odd) td { border-top: 1px solid var(--line); }
tbody tr:first-child td { border-top: 0; }
.failed { color: var(--bad); }
footer { margin-top: 2.5rem; }
@media print { body { background: #fff; } figure, .tile { break-inside: avoid; } }
)";

} // namespace cli
