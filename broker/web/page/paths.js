// The texts of object paths: Class.key="value",key=5, perhaps behind a namespace and a colon.

const keyPattern = /([A-Za-z_]\w*)=("(?:[^"\\]|\\.)*"|[^,]*)(?:,|$)/y;
/** Keys that are the same for all instances of a class on a host. */
export const givenByClass = new Set(["creationclassname", "systemcreationclassname", "systemname"]);

function unquoted(text) {
  if (!text.startsWith('"'))
    return text;
  return text.slice(1, -1).replace(/\\(x[0-9A-Fa-f]{2}|.)/g, (all, c) => c.length === 1 ? c : all);
}

/** {nameSpace, className, keys: [[name, value]]}; what cannot be read has no keys. */
export function parsePath(text) {
  const [, nameSpace = "", className = text, keyText = ""] =
    /^(?:([A-Za-z0-9_/.-]*):)?([A-Za-z_]\w*)(?:\.([^]*))?$/.exec(text) ?? [];
  const keys = [];
  keyPattern.lastIndex = 0;
  for (let found; keyPattern.lastIndex < keyText.length && (found = keyPattern.exec(keyText));)
    keys.push([found[1], unquoted(found[2])]);
  return {nameSpace, className, keys};
}

export function classOf(path) {
  return parsePath(path).className;
}

/** What of a path tells its object from others of its class. */
export function shortName(path) {
  const {className, keys} = parsePath(path);
  const own = keys.filter(([name]) => !givenByClass.has(name.toLowerCase()));
  const names = (own.length ? own : keys).map(([, value]) => /^[\w/.-]*:?\w+\.\w+=/.test(value) ? shortName(value) : value);
  return names.join(", ") || className;
}

/** A class's name as a person says it: "FC port" of TVRHBA_FCPort. */
export function spoken(name) {
  return name.replace(/^[A-Za-z]+_/, "").replace(/([a-z\d])([A-Z])/g, "$1 $2").replace(/([A-Z]+)([A-Z][a-z])/g, "$1 $2")
    .split(" ").map((word, at) => /^[A-Z]{2,}/.test(word) || at === 0 ? word : word.toLowerCase()).join(" ");
}

export function hrefOfObject(path) {
  return "#/object/" + encodeURIComponent(path);
}

/** The class's instances, or those of them that have the text `find` somewhere. */
export function hrefOfClass(name, find = "") {
  return "#/classes/" + encodeURIComponent(name) + (find ? "/" + encodeURIComponent(find) : "");
}

export function hrefOfMethod(className, method, path = "") {
  return "#/methods/" + encodeURIComponent(className) + "/" + encodeURIComponent(method) +
    (path ? "/" + encodeURIComponent(path) : "");
}
