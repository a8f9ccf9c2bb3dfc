// SPDX-License-Identifier: BSD-2-Clause
// The agent's answers: polled, kept while they have not changed, and how old they are.

const kPeriod = 1000; // milliseconds from one round of requests to the next
const kHiddenPeriod = 15000; // the same while nobody sees the page
const kPatience = 8000; // for an answer
const kOfAll = new Set([401, 403, 429]); // statuses that do not depend on the address
const kTokenName = "kvloam-token";

/** An answer that is not the wanted one. */
export class Refusal extends Error {
    constructor(status, message) {
        super(message);
        this.status = status;
    }
}

/**
 * An `Agent` is the page's connection to the agent. It asks for the resources that the shown view needs,
 * again and again, keeps the last answer and ETag of each, and calls its listener after each round.
 */
export class Agent {
    /** @param wanted returns the addresses of the resources that are needed now, below /api/v1/ */
    constructor(wanted, changed) {
        this.wanted = wanted;
        this.changed = changed;
        this.answers = new Map(); // address -> {etag, body, error}
        this.failure = null; // what the last round met, when it failed as a whole
        this.needsToken = false;
        this.lastAnswer = null; // performance.now() of the last round that succeeded
        this.lastTime = null; // the same by the browser's clock
        this.clock = null; // the agent's time of day at that time, in milliseconds
        this.timer = null;
        this.running = false;
        this.again = false;
    }

    start() {
        document.addEventListener("visibilitychange", () => document.hidden || this.poll());
        this.poll();
    }

    /** The body of a resource; null when it has not been answered yet, or is not there. */
    body(address) {
        return this.answers.get(address)?.body ?? null;
    }

    /** Why a resource was refused; null when it was not. */
    error(address) {
        return this.answers.get(address)?.error ?? null;
    }

    setToken(token) {
        sessionStorage.setItem(kTokenName, token);
        this.poll();
    }

    /** Seconds since the agent's last answer; null before the first. */
    silence() {
        return this.lastAnswer === null ? null : (performance.now() - this.lastAnswer) / 1000;
    }

    /** The time of day by the agent's clock, also when the browser's is wrong. */
    now() {
        return this.clock === null ? new Date() : new Date(this.clock + this.silence() * 1000);
    }

    /** Seconds since the boards were read; null when that is not known. */
    age() {
        const read = new Date(this.body("health")?.time ?? NaN).getTime();
        return Number.isNaN(read) ? null : Math.max(0, (this.now().getTime() - read) / 1000);
    }

    /** Asks at once, or right after the round that is under way. */
    poll() {
        if (this.running) {
            this.again = true;
            return;
        }
        clearTimeout(this.timer);
        this.round();
    }

    async round() {
        const began = performance.now();
        this.running = true;
        this.again = false;
        const addresses = this.wanted();
        for (const address of this.answers.keys())
            if (!addresses.includes(address)) this.answers.delete(address);
        try {
            const changes = await Promise.all(addresses.map((address) => this.ask(address)));
            this.failure = null;
            this.needsToken = false;
            this.lastAnswer = performance.now();
            this.lastTime = new Date();
            this.changed(changes.includes(true));
        } catch (failure) {
            this.needsToken = failure.status === 401;
            this.failure = failure;
            this.changed(false);
        }
        this.running = false;
        const period = document.hidden ? kHiddenPeriod : kPeriod;
        const pause = this.again ? 0 : Math.max(period / 10, period - (performance.now() - began));
        this.timer = setTimeout(() => this.round(), pause);
    }

    /** Asks for one resource. Returns whether its answer has changed. */
    async ask(address) {
        const kept = this.answers.get(address);
        const { status, etag, date, body } = await this.request(address, kept?.etag);
        if (!Number.isNaN(date)) this.clock = date;
        if (status === 304) return false;
        if (status === 200) {
            this.answers.set(address, { etag, body, error: null });
            return true;
        }
        const message = body?.error?.message ?? `the agent answered with status ${status}`;
        // A thing that is not there concerns itself; a missing token or a fault concerns everything.
        if (status < 400 || status >= 500 || kOfAll.has(status)) throw new Refusal(status, message);
        const isNew = kept?.error !== message;
        this.answers.set(address, { etag: null, body: null, error: message });
        return isNew;
    }

    async request(address, etag) {
        const headers = { Accept: "application/json" };
        if (etag) headers["If-None-Match"] = etag;
        const token = sessionStorage.getItem(kTokenName);
        if (token) headers.Authorization = `Bearer ${token}`;
        const response = await fetch(`/api/v1/${address}`, {
            headers, cache: "no-store", credentials: "same-origin", signal: AbortSignal.timeout(kPatience),
        });
        let body = null;
        if (response.status !== 304) {
            try {
                body = await response.json();
            } catch {
                throw new Refusal(response.status, "the answer is not JSON");
            }
        }
        const date = new Date(response.headers.get("Date") ?? NaN).getTime();
        return { status: response.status, etag: response.headers.get("ETag"), date, body };
    }
}
