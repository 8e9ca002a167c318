// Small pictures of numbers: how a rate went, and where a value stands between its limits.

import {draw} from "./dom.js";

const width = 160;
const height = 26;

/** A line through `values`, the newest at the right end of room for `most`; the highest is the top. */
export function plotOf(values, most, label) {
  const top = Math.max(...values, 0) || 1;
  const step = width / (most - 1);
  const left = width - (values.length - 1) * step;
  const points = values.map((value, at) => `${(left + at * step).toFixed(1)},${(height - 2 - value / top * (height - 4)).toFixed(1)}`);
  const line = points.length > 1 ? [
    draw("polygon", {class: "under", points: `${left.toFixed(1)},${height} ${points.join(" ")} ${width},${height}`}),
    draw("polyline", {class: "rate", points: points.join(" ")}),
  ] : null;
  return draw("svg", {class: "plot", viewBox: `0 0 ${width} ${height}`, width, height, role: "img", "aria-label": label,
    preserveAspectRatio: "none"}, draw("line", {class: "floor", x1: 0, y1: height - 1, x2: width, y2: height - 1}), line);
}

/** A bar as long as the value, with a mark at each limit that is known. */
export function barOf(measure) {
  const limits = [measure.lowAlarm, measure.lowWarning, measure.highWarning, measure.highAlarm]
    .filter((limit) => typeof limit === "number");
  const known = [...limits, measure.value];
  const low = Math.min(0, ...known);
  const high = Math.max(...known, low + Number.EPSILON) * 1.08;
  const at = (value) => Math.max(0, Math.min(width, (value - low) / (high - low || 1) * width));
  const mark = (limit, style) => typeof limit === "number"
    ? draw("line", {class: style, x1: at(limit), x2: at(limit), y1: 0, y2: 14}) : null;
  const label = `${measure.label}: ${measure.value} ${measure.unit}, ${measure.state}`;
  return draw("svg", {class: "bar " + measure.state, viewBox: `0 0 ${width} 14`, width, height: 14, role: "img", "aria-label": label},
    draw("rect", {class: "room", x: 0, y: 3, width, height: 8, rx: 4}),
    draw("rect", {class: "value", x: 0, y: 3, width: at(measure.value), height: 8, rx: 4}),
    mark(measure.lowAlarm, "alarm"), mark(measure.lowWarning, "warn"),
    mark(measure.highWarning, "warn"), mark(measure.highAlarm, "alarm"));
}
