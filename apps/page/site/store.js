// The pages in this browser. Each finished stroke is stored at once under a key of its own, [page, order], and each
// tab has a page to itself: strokes of two tabs never meet, and nothing is ever written over. The page's number stands
// in the address, so that a tab comes back to its own.

const DATABASE = 'qelt-pencil', VERSION = 1, STROKES = 'strokes';
const PATIENCE = 4000;  // milliseconds for a database to open
const RETRY = 15_000;  // milliseconds before what could not be written is tried again

const all = (page) => IDBKeyRange.bound([page], [page, []]);

/** @template T @param {IDBRequest<T>} request @returns {Promise<T>} */
const answered = (request) => new Promise((resolve, reject) => {
  request.onsuccess = () => resolve(request.result);
  request.onerror = () => reject(request.error);
});

function openDatabase() {
  return new Promise((resolve, reject) => {
    const request = indexedDB.open(DATABASE, VERSION);
    let late = false;
    const timer = setTimeout(() => { late = true; reject(new Error('it does not answer')); }, PATIENCE);
    request.onupgradeneeded = () => request.result.createObjectStore(STROKES);
    request.onerror = () => { clearTimeout(timer); reject(request.error); };
    request.onsuccess = () => {
      clearTimeout(timer);
      if (late) return request.result.close();
      resolve(request.result);
    };
  });
}

const lockOf = (page) => `${DATABASE}-${page}`;

/**
 * Keeps the page for this tab until it is closed, however that happens; false when another tab has it, and still has
 * it after `patience` milliseconds.
 */
async function keepPage(page, patience = 0) {
  // Without locks two tabs may show one page. Their strokes still have keys of their own, and are both there next time.
  if (!navigator.locks) return true;
  const ask = (options) => new Promise((resolve) => {
    navigator.locks.request(lockOf(page), options, (lock) => {
      resolve(lock !== null);
      return lock && new Promise(() => {});
    }).catch((error) => resolve(error?.name !== 'AbortError'));
  });
  if (await ask({ifAvailable: true})) return true;
  if (patience === 0) return false;
  const waiting = new AbortController();
  setTimeout(() => waiting.abort(), patience);
  return ask({signal: waiting.signal});
}

/** Every page that has strokes, the last drawn on first. */
async function pagesIn(database) {
  const store = database.transaction(STROKES).objectStore(STROKES);
  const pages = [];
  await new Promise((resolve, reject) => {
    const request = store.openKeyCursor(null, 'prev');
    request.onerror = () => reject(request.error);
    request.onsuccess = () => {
      const cursor = request.result;
      if (!cursor) return resolve(undefined);
      const [page, order] = /** @type {number[]} */ (cursor.key);
      pages.push({page, last: order, count: answered(store.count(all(page)))});
      cursor.continue([page]);  // no key of a page is so low: the next page follows
    };
  });
  for (const page of pages) page.count = await page.count;
  return pages.sort((one, other) => other.last - one.last);
}

export class Store {
  #database = null;
  #record;
  #tell;
  /** @type {Map<number, number[]>} keys by the engine's ids */
  #keys = new Map();
  /** What is not known to be written yet, by the key's text: bytes, or null for what is to go. */
  #wanted = new Map();
  #fails = false;
  #timer = 0;
  #order = 0;
  page = 1;

  /**
   * @param {(id: number) => Uint8Array} record gives a stroke's bytes
   * @param {(message: string, isBad: boolean) => void} tell
   */
  constructor(record, tell) {
    this.#record = record;
    this.#tell = tell;
  }

  /**
   * Opens the page that is wanted, or else the one last drawn on that no other tab has, or else an empty one. Answers
   * with its strokes, the lowest first. Where there is no storage it says so, and answers with none.
   * @param {number | 'new' | null} wanted
   * @returns {Promise<{key: number[], bytes: Uint8Array}[]>}
   */
  async open(wanted) {
    try {
      const database = await openDatabase();
      this.#database = database;
      database.onversionchange = () => {
        database.close();
        this.#database = null;
        this.#tell('A newer version of this page was opened in another tab. What you draw here from now on is kept in this tab only: reload it.', true);
      };
      database.onclose = () => { this.#database = null; this.#refused('it was closed'); };
      const pages = await pagesIn(database);
      const free = async () => {
        if (typeof wanted === 'number') {
          // A tab that is just reloading may need a moment to let go of its page.
          if (await keepPage(wanted, 700)) return wanted;
          this.#tell(`Page ${wanted} is open in another tab; this is a new page.`, false);
        }
        if (wanted === null) {
          for (const {page} of pages) if (await keepPage(page)) return page;
        }
        let next = Math.max(0, ...pages.map(({page}) => page)) + 1;
        while (!(await keepPage(next))) ++next;
        return next;
      };
      this.page = await free();
      const store = database.transaction(STROKES).objectStore(STROKES);
      const [keys, values] = await Promise.all([answered(store.getAllKeys(all(this.page))), answered(store.getAll(all(this.page)))]);
      this.#order = keys.reduce((highest, [, order]) => (order > highest ? order : highest), 0);
      return keys.map((key, i) => ({key, bytes: values[i]}));
    } catch (error) {
      const known = this.#database;
      this.#database = null;
      known?.close();
      if (error?.name === 'VersionError') {
        this.#tell('The pages in this browser are from a newer version, and are left as they are. What you draw now is kept in this tab only: save it as a file.', true);
      } else {
        this.#refused(error?.message ?? String(error));
      }
      return [];
    }
  }

  #refused(why) {
    this.#tell(`This browser stores nothing here (${why}). What you draw is kept in this tab only: save it as a file.`, true);
  }

  /** A stroke that came from the store. */
  know(id, key) { this.#keys.set(id, key); }

  /** Stores what a step changed. @param {{shown: number[], hidden: number[]} | null} change */
  apply(change) {
    if (!change) return;
    const entries = [];
    for (const id of change.hidden) {
      if (this.#keys.has(id)) entries.push({key: this.#keys.get(id), bytes: null});
    }
    for (const id of change.shown) {
      if (!this.#keys.has(id)) this.#keys.set(id, this.#nextKey());
      entries.push({key: this.#keys.get(id), bytes: this.#record(id)});
    }
    this.#write(entries);
  }

  // By the clock, so that tabs without locks do not meet either, but never twice the same.
  #nextKey() {
    this.#order = Math.max(Date.now() + Math.random(), this.#order + 1 / 1024);
    return [this.page, this.#order];
  }

  #write(entries) {
    if (!this.#database || entries.length === 0) return;
    for (const entry of entries) this.#wanted.set(String(entry.key), entry);
    const failed = (error) => {
      if (!this.#fails) {
        this.#tell(`${error?.name === 'QuotaExceededError' ? 'The storage of this browser is full.'
          : `This browser could not store the stroke (${error?.message ?? 'it does not say why'}).`
        } What you draw now is kept in this tab only: save it as a file.`, true);
      }
      this.#fails = true;
      clearTimeout(this.#timer);
      this.#timer = setTimeout(() => this.#write([...this.#wanted.values()]), RETRY);
    };
    let transaction = null;
    try {
      transaction = this.#database.transaction(STROKES, 'readwrite');
      const store = transaction.objectStore(STROKES);
      transaction.onabort = () => failed(transaction.error);
      transaction.oncomplete = () => {
        for (const entry of entries) {
          // What came since then is still on its way.
          if (this.#wanted.get(String(entry.key)) === entry) this.#wanted.delete(String(entry.key));
        }
        if (this.#fails && this.#wanted.size === 0) {
          this.#fails = false;
          this.#tell('Everything is stored again.', false);
        }
      };
      for (const {key, bytes} of entries) bytes ? store.put(bytes, key) : store.delete(key);
      transaction.commit?.();
    } catch (error) {
      // All of it or nothing; what became of the part is not asked any more.
      if (transaction) {
        transaction.oncomplete = transaction.onabort = null;
        try {
          transaction.abort();
        } catch {
          // It is over already.
        }
      }
      failed(error);
    }
  }

  /** Whether closing the tab would lose something. */
  get owes() { return this.#fails || (!this.#database && this.#keys.size > 0); }

  /** Every page with strokes, the last drawn on first, and whether another tab has it. */
  async pages() {
    if (!this.#database) return [];
    const [pages, locks] = await Promise.all([pagesIn(this.#database), navigator.locks?.query()]);
    const held = new Set(locks?.held?.map(({name}) => name));
    return pages.map((one) => ({...one, taken: one.page !== this.page && held.has(lockOf(one.page))}));
  }
}
