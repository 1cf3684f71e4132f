// Page chrome beside the tables, on every page: a banner of the alerts that are active and,
// when Norvo replays a recorded drive, a player bar to play, pause, change speed and seek, with
// the drive's events marked along it.
'use strict';

(() => {
  const bar = document.querySelector('.bar');

  // --- A link to the timeline from the dashboard (the launch screen has its own) ---
  if (bar && location.pathname === '/dashboard' && !document.querySelector('a[href="/timeline"]')) {
    const links = bar.querySelector('.links') || bar.appendChild(document.createElement('nav'));
    links.className = 'links';
    const timeline = links.appendChild(document.createElement('a'));
    timeline.href = '/timeline';
    timeline.textContent = 'Timeline';
  }

  async function getJson(address) {
    const response = await fetch(address, { cache: 'no-store' });
    if (!response.ok) throw new Error(`${address}: ${response.status}`);
    return response.json();
  }

  // --- The alert banner ---
  let banner = null;
  function showAlerts(active) {
    if (active.length === 0) {
      banner?.remove();
      banner = null;
      return;
    }
    if (!banner) {
      banner = document.createElement('ul');
      banner.className = 'alert-banner';
      banner.setAttribute('role', 'alert');
      if (bar) bar.after(banner);
      else document.body.prepend(banner);
    }
    const texts = active.map((alert) => alert.text);
    if (JSON.stringify([...banner.children].map((item) => item.textContent)) === JSON.stringify(texts)) return;
    banner.replaceChildren(...texts.map((text) => {
      const item = document.createElement('li');
      item.textContent = text;
      return item;
    }));
  }

  // --- The player bar of a replay ---
  const speeds = ['0.5', '1', '2', '4', '10', '60', 'max'];

  function clockText(ms) {
    const seconds = Math.floor(ms / 1000);
    const minutes = Math.floor(seconds / 60);
    const hours = Math.floor(minutes / 60);
    const two = (n) => String(n).padStart(2, '0');
    return hours > 0 ? `${hours}:${two(minutes % 60)}:${two(seconds % 60)}` : `${minutes}:${two(seconds % 60)}`;
  }

  async function control(command) {
    const response = await fetch('/api/replay', {
      method: 'POST',
      headers: { 'Content-Type': 'application/json' },
      body: JSON.stringify(command),
    });
    if (!response.ok) throw new Error(`/api/replay: ${response.status}`);
    return response.json();
  }

  function buildPlayer(state) {
    const player = document.createElement('div');
    player.className = 'player';
    player.setAttribute('role', 'region');
    player.setAttribute('aria-label', 'Replay');

    const toggle = player.appendChild(document.createElement('button'));
    toggle.type = 'button';
    toggle.className = 'play';

    const speed = player.appendChild(document.createElement('select'));
    speed.className = 'speed';
    speed.setAttribute('aria-label', 'Speed');
    for (const value of speeds) {
      const option = speed.appendChild(document.createElement('option'));
      option.value = value;
      option.textContent = value === 'max' ? 'max' : `${value}×`;
    }

    const track = player.appendChild(document.createElement('div'));
    track.className = 'track';
    const markers = track.appendChild(document.createElement('div'));
    markers.className = 'markers';
    const slider = track.appendChild(document.createElement('input'));
    slider.type = 'range';
    slider.className = 'position';
    slider.min = '0';
    slider.step = '100';
    slider.setAttribute('aria-label', 'Position');

    const clock = player.appendChild(document.createElement('span'));
    clock.className = 'clock';

    let current = state;
    let dragging = false;

    function show(next) {
      current = next;
      toggle.textContent = next.playing ? 'Pause' : 'Play';
      toggle.setAttribute('aria-pressed', String(next.playing));
      const speedText = String(next.speed);
      if (speed.value !== speedText && speeds.includes(speedText)) speed.value = speedText;
      slider.max = String(next.duration_ms);
      if (!dragging) slider.value = String(next.position_ms);
      clock.textContent = `${clockText(dragging ? Number(slider.value) : next.position_ms)} / ${clockText(next.duration_ms)}`;
      player.dataset.position = String(next.position_ms);
    }

    async function send(command) {
      try {
        show(await control(command));
      } catch (error) {
        // The next poll shows where the replay stands.
      }
    }

    toggle.addEventListener('click', () => send({ action: current.playing ? 'pause' : 'play' }));
    speed.addEventListener('change', () =>
      send({ action: 'speed', speed: speed.value === 'max' ? 'max' : Number(speed.value) }));
    slider.addEventListener('input', () => {
      dragging = true;
      clock.textContent = `${clockText(Number(slider.value))} / ${clockText(current.duration_ms)}`;
    });
    slider.addEventListener('change', async () => {
      await send({ action: 'seek', position_ms: Number(slider.value) });
      dragging = false;
    });

    getJson('/api/replay/markers').then((answer) => {
      if (current.duration_ms <= 0) return;
      for (const mark of answer.markers) {
        const tick = markers.appendChild(document.createElement('span'));
        tick.className = `marker ${mark.severity}`;
        tick.style.left = `${(100 * mark.position_ms) / current.duration_ms}%`;
        tick.title = mark.text;
      }
    }).catch(() => {});

    show(state);
    document.body.appendChild(player);
    document.body.classList.add('has-player');
    return show;
  }

  // One reading for both, twice a second while the page is visible:
  // {"alerts": [{"text"}...], "replay": the replay's state, or null}.
  let showReplay = null;
  const period = 500;
  norvoPoll(async () => {
    const chrome = await getJson('/api/chrome');
    showAlerts(chrome.alerts);
    if (chrome.replay) {
      if (showReplay) showReplay(chrome.replay);
      else showReplay = buildPlayer(chrome.replay);
    }
  }, period);
})();
