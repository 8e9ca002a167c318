// The JSON interface of this port, and who asks it. Name and password are in the memory of this page alone.

/** What the port answers in place of a result. */
export class Refused extends Error {
  constructor(http, error) {
    super(error.text || "the port answered " + http);
    this.http = http;
    this.kind = error.kind || "internal";
    this.status = error.status || "";
  }
}

let authorization = null;
const stranger = {user: null, mayChange: false, token: null, whyNot: "", version: "", simulated: false};
export const session = {...stranger};

function headersOf(body) {
  const headers = {};
  if (authorization)
    headers.Authorization = authorization;
  if (body !== undefined) {
    headers["Content-Type"] = "application/json";
    headers["X-Tavrin-Token"] = session.token || "";
  }
  return headers;
}

// Integers of 64 bits stay whole where the browser tells how they were written.
function reviveNumber(key, value, context) {
  const isRounded = typeof value === "number" && Number.isInteger(value) && !Number.isSafeInteger(value);
  return isRounded && /^-?\d+$/.test(context?.source ?? "") ? BigInt(context.source) : value;
}

/** JSON with integers of any size. */
export function jsonText(value) {
  if (typeof value === "bigint")
    return value.toString();
  if (Array.isArray(value))
    return "[" + value.map(jsonText).join(",") + "]";
  if (value && typeof value === "object")
    return "{" + Object.entries(value).map(([name, member]) => JSON.stringify(name) + ":" + jsonText(member)).join(",") + "}";
  return JSON.stringify(value ?? null);
}

/** What a text of JSON says; null where it is none. */
export function parse(text) {
  try {
    return JSON.parse(text, reviveNumber);
  } catch {
    return null;
  }
}

async function answerTo(path, body, signal) {
  let response, text;
  try {
    response = await fetch(path, {method: body === undefined ? "GET" : "POST", headers: headersOf(body), signal,
      body: body === undefined ? undefined : jsonText(body), credentials: "omit", cache: "no-store"});
    text = await response.text();
  } catch (error) {
    if (error.name === "AbortError")
      throw error;
    throw new Refused(0, {kind: "unready", text: "the port does not answer"});
  }
  const answer = parse(text);
  if (!response.ok || answer === null)
    throw new Refused(response.status, answer?.error ?? {});
  return answer;
}

/** Asks /api/`path` with the members of `query` that are not empty. */
export function ask(path, query = {}, signal = undefined) {
  const given = Object.entries(query).filter(([, value]) => value !== "" && value !== null && value !== undefined);
  const search = new URLSearchParams(given).toString();
  return answerTo("/api/" + path + (search ? "?" + search : ""), undefined, signal);
}

/** Calls a method. A token that is older than the port's process is asked for anew, once. */
export async function call(path, method, parameters) {
  const body = {path, method, in: parameters};
  try {
    return await answerTo("/api/call", body);
  } catch (error) {
    const old = session.token;
    if (!(error instanceof Refused) || error.http !== 403 || !old)
      throw error;
    await renewSession();
    if (session.token === old || !session.token)
      throw error;
    return answerTo("/api/call", body);
  }
}

/** Asks who this page is to the port; `session` is changed in place and an event told to the document. */
export async function renewSession() {
  try {
    Object.assign(session, await ask("session"));
  } catch (error) {
    Object.assign(session, stranger, {whyNot: error.message});
    throw error;
  } finally {
    document.dispatchEvent(new Event("session"));
  }
}

/** Who cannot log in stays who he was. */
export async function logIn(user, password) {
  const bytes = new TextEncoder().encode(user + ":" + password);
  const before = {authorization, session: {...session}};
  authorization = "Basic " + btoa(String.fromCharCode(...bytes));
  try {
    await renewSession();
    if (!session.user)
      throw new Refused(0, {kind: "refused", text: session.whyNot});
  } catch (error) {
    authorization = before.authorization;
    Object.assign(session, before.session);
    document.dispatchEvent(new Event("session"));
    throw error;
  }
}

export async function logOut() {
  authorization = null;
  await renewSession();
}
