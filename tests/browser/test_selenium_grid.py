"""The node of Selenium Grid in tools/selenium: its configuration, and the sessions that such nodes relay."""

import concurrent.futures
import json
import os
import tomllib
import unittest

from selenium import webdriver
from selenium.webdriver.common.by import By

from selenium_tv import DrivenTv, options_of, press, start_driver
from telix_tv import PLUGIN

ROOT = os.path.abspath(__file__).rsplit('/tests/', 1)[0]
TELEVISIONS = 4
PAGE = '''<p id="words">none</p><script>
    onkeydown = function (event) {
        localStorage.number = document.cookie = words.textContent = event.keyCode - 48;
    };</script>'''


class Node(DrivenTv):
    @classmethod
    def setUpClass(cls):
        super().setUpClass()
        with open(os.path.join(ROOT, 'tools', 'selenium', 'node.toml'), 'rb') as file:
            cls.node = tomllib.load(file)

    def slots(self):
        """Pairs of the number of slots and what they offer."""
        configs = self.node['relay']['configs']
        return [(int(count), json.loads(offer)) for count, offer in zip(configs[::2], configs[1::2])]

    def test_it_relays_one_session_to_one_driver(self):
        self.assertEqual(set(self.node), {'server', 'node', 'relay'})
        self.assertEqual([count for count, _ in self.slots()], [self.node['node']['max-sessions']])
        self.assertEqual(self.node['node']['max-sessions'], 1)
        self.assertRegex(self.node['relay']['url'], r'^http://127\.0\.0\.1:\d+$')

    def test_four_televisions_at_once(self):
        (_, offer), = self.slots()
        page = 'file://' + self.write(PAGE)
        services = []
        for _ in range(TELEVISIONS):
            services.append(start_driver(self.television.environment))
            self.addCleanup(services[-1].stop)

        def start(service):
            options = options_of('--plugin', PLUGIN, '--record', self.new_recording())
            for name, value in offer.items():
                options.set_capability(name, value)
            session = webdriver.Remote(service.service_url, options=options)
            self.addCleanup(session.quit)
            session.get(page)
            return session

        with concurrent.futures.ThreadPoolExecutor(TELEVISIONS) as starters:
            sessions = list(starters.map(start, services))
        for number, session in enumerate(sessions, 1):
            press(session, str(number))
        for number, session in enumerate(sessions, 1):
            self.assertEqual(session.find_element(By.ID, 'words').text, str(number))
            self.assertEqual(session.execute_script('return localStorage.number'), str(number))


if __name__ == '__main__':
    unittest.main()
