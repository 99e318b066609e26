#!/usr/bin/env python3
"""End-to-end test of ape-studio in headless Chromium driven by Selenium.

Starts ape-studio on a copy of the fountain scene in a temporary folder (so that saves land
there), opens the printed address and works the page as a user would: the viewport moves, a
higher birth rate raises the live-particle plot, an envelope key changes the picture, scrubbing is
deterministic, undo brings the picture back, a saved file opens again, and a bad value is refused
beside its field. Every wait is bounded.

Usage: studio_e2e_test.py --studio PATH/ape-studio --scene scenes/fountain.json
"""
import argparse
import json
import os
import re
import shutil
import subprocess
import sys
import tempfile
import time
import unittest

from selenium import webdriver
from selenium.webdriver.chrome.options import Options
from selenium.webdriver.chrome.service import Service
from selenium.webdriver.common.by import By
from selenium.common.exceptions import StaleElementReferenceException
from selenium.webdriver.common.keys import Keys
from selenium.webdriver.support.ui import WebDriverWait

ARGS = None
WAIT_SECONDS = 60  # an upper bound only: on a loaded machine or under the sanitizers it is slow

# A hash of the viewport's pixels, the frames drawn, the frame label, and how many colours a sample
# of the pixels holds: enough to tell pictures apart and to see that something is drawn.
CANVAS_DIGEST = """
const canvas = document.getElementById('viewport');
const data = canvas.getContext('2d').getImageData(0, 0, canvas.width, canvas.height).data;
let hash = 0;
const colours = new Set();
for (let i = 0; i < data.length; i += 4) {
  hash = (hash * 31 + data[i] * 7 + data[i + 1] * 3 + data[i + 2]) | 0;
  if (i % 388 === 0) colours.add((data[i] << 16) | (data[i + 1] << 8) | data[i + 2]);
}
return [hash, window.studio.frames, document.getElementById('frame-label').textContent,
        colours.size];
"""


class StudioPage(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.folder = tempfile.mkdtemp(prefix='ape-studio-e2e-')
        cls.scene = os.path.join(cls.folder, 'fountain.json')
        shutil.copy(ARGS.scene, cls.scene)
        cls.server = subprocess.Popen(
            [ARGS.studio, cls.scene, '--port', '0'], stdout=subprocess.PIPE,
            stderr=subprocess.STDOUT, text=True)
        cls.address = None
        deadline = time.monotonic() + WAIT_SECONDS
        while time.monotonic() < deadline and cls.address is None:
            line = cls.server.stdout.readline()
            if not line:
                break
            match = re.search(r'(http://\S+)', line)
            if match:
                cls.address = match.group(1)
        if cls.address is None:
            cls.server.kill()
            raise RuntimeError('ape-studio printed no address')
        options = Options()
        for argument in ('--headless=new', '--no-sandbox', '--disable-gpu',
                         '--disable-dev-shm-usage', '--window-size=1600,1200',
                         '--user-data-dir=' + os.path.join(cls.folder, 'profile')):
            options.add_argument(argument)
        options.binary_location = shutil.which('chromium') or '/usr/bin/chromium'
        service = Service(shutil.which('chromedriver') or '/usr/bin/chromedriver')
        cls.browser = webdriver.Chrome(service=service, options=options)
        cls.browser.set_script_timeout(WAIT_SECONDS)
        cls.browser.get(cls.address)
        cls.wait_for(lambda b: b.execute_script('return window.studio && window.studio.frames') > 3)

    @classmethod
    def tearDownClass(cls):
        cls.browser.quit()
        cls.server.terminate()
        try:
            cls.server.wait(timeout=WAIT_SECONDS)
        finally:
            if cls.server.poll() is None:
                cls.server.kill()
        shutil.rmtree(cls.folder, ignore_errors=True)

    @classmethod
    def wait_for(cls, condition, what='condition'):
        # The inspector is drawn afresh after each change: an element may go between two looks.
        return WebDriverWait(cls.browser, WAIT_SECONDS, poll_frequency=0.1,
                             ignored_exceptions=[StaleElementReferenceException]).until(condition, what)

    def digest(self):
        return self.browser.execute_script(CANVAS_DIGEST)

    def frames_drawn(self):
        return self.browser.execute_script('return window.studio.frames')

    def link_row(self, name):
        return self.wait_for(lambda b: b.find_element(
            By.CSS_SELECTOR, '#inspector .field[data-link="%s"]' % name), name)

    def set_number(self, input_element, value):
        input_element.clear()
        input_element.send_keys(str(value))
        input_element.send_keys(Keys.TAB)  # the change event sends the edit

    def state(self):
        return self.browser.execute_script('return window.studio.state')

    def pause(self):
        if self.state()['playing']:
            self.browser.find_element(By.ID, 'play').click()
        self.wait_for(lambda b: not b.execute_script('return window.studio.state.playing'))
        # The last frame sent before the pause has been drawn once the picture stops changing.
        self.wait_for(lambda b: self._settled(), 'picture settles')

    def _settled(self):
        first = self.digest()
        time.sleep(0.3)  # a browser test polls: two looks a moment apart
        return self.digest() == first

    def play(self):
        if not self.state()['playing']:
            self.browser.find_element(By.ID, 'play').click()
        self.wait_for(lambda b: b.execute_script('return window.studio.state.playing'))

    def seek(self, frame):
        self.browser.execute_script(
            "const s = document.getElementById('scrub'); s.value = arguments[0];"
            "s.dispatchEvent(new Event('change'));", frame)
        self.wait_for(lambda b: b.find_element(By.ID, 'frame-label').text.startswith('%d /' % frame),
                      'frame %d shown' % frame)
        self.wait_for(lambda b: self._settled(), 'picture settles')

    def test_1_viewport_moves_and_shows_particles(self):
        self.play()
        first = self.digest()
        self.wait_for(lambda b: self.frames_drawn() > first[1] + 5)
        second = self.digest()
        self.assertNotEqual(first[0], second[0],
                            'the picture does not change between frames: %s %s' % (first, second))
        # The floor, the background and the sparks: many colours, not a blank picture.
        self.assertGreater(second[3], 20, 'the viewport is blank')
        stats = self.browser.execute_script('return window.studio.lastStats')
        self.assertGreater(stats['live'], 0)

    def test_2_births_per_second_raises_the_live_plot(self):
        self.play()
        live = "const d = Chart.getChart('plot-live').data.datasets[0].data; return d.length ? Math.max(...d.slice(-20)) : 0;"
        self.wait_for(lambda b: b.execute_script('return window.studio.history.length') > 30)
        before = max(s['live'] for s in self.browser.execute_script('return window.studio.history'))
        row = self.link_row('Births Per Second')
        self.set_number(row.find_element(By.CSS_SELECTOR, 'input[type=number]'), 4000)
        self.wait_for(lambda b: b.execute_script(live) > before * 1.5,
                      'live particles rise above %d' % (before * 1.5))

    def test_3_envelope_key_changes_the_picture_and_undo_restores_it(self):
        self.pause()
        self.seek(40)
        before = self.digest()
        undo_depth = self.state()['undo']
        row = self.link_row('Green Color Envelope')
        self.set_number(row.find_element(By.CSS_SELECTOR, 'input[data-key="0"][data-axis="y"]'), 0)
        self.wait_for(lambda b: self.state()['undo'] == undo_depth + 1, 'the edit is taken')
        self.wait_for(lambda b: self.digest()[0] != before[0], 'the picture changes')
        self.assertTrue(self.digest()[2].startswith('40 /'))
        self.browser.find_element(By.ID, 'undo').click()
        self.wait_for(lambda b: self.state()['undo'] == undo_depth, 'the undo is taken')
        self.wait_for(lambda b: self.digest()[0] == before[0], 'the picture is as before the edit')

    def test_4_scrubbing_is_deterministic(self):
        self.pause()
        self.seek(30)
        at_30 = self.digest()[0]
        self.seek(75)
        self.assertNotEqual(self.digest()[0], at_30)
        self.seek(30)
        self.assertEqual(self.digest()[0], at_30, 'frame 30 differs when scrubbed to again')

    def test_5_refused_edit_shows_beside_the_field(self):
        undo_depth = self.state()['undo']
        row = self.link_row('ParticleCount')
        self.set_number(row.find_element(By.CSS_SELECTOR, 'input[type=number]'), -5)
        message = self.wait_for(lambda b: row.find_element(By.CSS_SELECTOR, '.message').text or None,
                                'a message beside ParticleCount')
        self.assertIn('ParticleCount', message)
        self.assertEqual(self.state()['undo'], undo_depth, 'a refused edit entered the history')

    def test_6_save_and_open_the_saved_file(self):
        row = self.link_row('Lifespan_Max')
        self.set_number(row.find_element(By.CSS_SELECTOR, 'input[type=number]'), 2.25)
        self.wait_for(lambda b: '2.25' in json.dumps(b.execute_script(
            "return fetch('/api/document', {headers: {'X-Studio-Token': document.querySelector("
            "'meta[name=studio-token]').content}}).then(r => r.json())")))
        name = self.browser.find_element(By.ID, 'save-name')
        name.clear()
        name.send_keys('saved_scene.json')
        self.browser.find_element(By.ID, 'save').click()
        self.wait_for(lambda b: 'saved' in b.find_element(By.ID, 'file-message').text)
        with open(os.path.join(self.folder, 'saved_scene.json')) as saved:
            links = json.load(saved)['channels']['sparks']['links']
        self.assertEqual(links['Lifespan_Max'], 2.25)
        self.browser.find_element(By.ID, 'open').click()
        self.wait_for(lambda b: b.execute_script('return window.studio.state.scene') == 'saved_scene.json')
        self.wait_for(lambda b: self.link_row('Lifespan_Max').find_element(
            By.CSS_SELECTOR, 'input[type=number]').get_attribute('value') == '2.25',
            'the opened file shows its Lifespan_Max')
        frames = self.frames_drawn()
        self.play()
        self.wait_for(lambda b: self.frames_drawn() > frames + 3, 'the opened scene plays')


def main():
    global ARGS
    parser = argparse.ArgumentParser()
    parser.add_argument('--studio', required=True)
    parser.add_argument('--scene', required=True)
    ARGS, rest = parser.parse_known_args()
    unittest.main(argv=[sys.argv[0]] + rest, verbosity=2)


if __name__ == '__main__':
    main()
