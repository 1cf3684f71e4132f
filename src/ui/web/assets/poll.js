// Reads a page's data every `period` ms while the page is visible, one reading at a time: a
// hidden tab costs Norvo nothing, and a slow answer is never overtaken by the next question.
// Returns the function that reads at once (after a change of filter, say).
'use strict';

window.norvoPoll = (read, period) => {
  let ticker = null;
  let inFlight = false;

  async function refresh() {
    if (inFlight) return;
    inFlight = true;
    try {
      await read();
    } catch (error) {
      // Norvo may be restarting; the next tick asks again.
    } finally {
      inFlight = false;
    }
  }

  function stop() {
    if (ticker !== null) clearInterval(ticker);
    ticker = null;
  }

  function start() {
    stop();
    if (document.visibilityState === 'visible') ticker = setInterval(refresh, period);
  }

  document.addEventListener('visibilitychange', () => {
    if (document.visibilityState === 'visible') refresh();
    start();
  });
  window.addEventListener('pagehide', stop);
  window.addEventListener('pageshow', (event) => {
    if (event.persisted) {
      refresh();
      start();
    }
  });
  refresh();
  start();
  return refresh;
};
