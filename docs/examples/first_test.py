#!/usr/bin/python3
"""A test of the demonstration with Selenium: zaps to another channel and plays a clip.

Usage: first_test.py URL-OF-THE-DEMONSTRATION [SCREENSHOT.png]

Needs Debian's python3-selenium and webkit2gtk-driver. TELIX_TV is the television's program, telix-tv by default."""

import os
import shutil
import sys

from selenium import webdriver
from selenium.webdriver.common.action_chains import ActionChains
from selenium.webdriver.common.by import By
from selenium.webdriver.common.keys import Keys
from selenium.webdriver.support.ui import WebDriverWait
from selenium.webdriver.webkitgtk.options import Options

# The keys of the remote control that are keys of the keyboard in the television.
OK, BACK, RED, GREEN, YELLOW, BLUE = Keys.ENTER, Keys.BACKSPACE, Keys.F1, Keys.F2, Keys.F3, Keys.F4


class Television:
    """telix-tv with a temporary profile; WebKitWebDriver is started with it and ends with it."""

    def __init__(self):
        options = Options()
        options.set_capability('browserName', 'telix-tv')
        options.binary_location = os.environ.get('TELIX_TV') or shutil.which('telix-tv')
        options.add_argument('--automation')
        self.driver = webdriver.WebKitGTK(options=options)

    def __enter__(self):
        return self

    def __exit__(self, *exception):
        self.driver.quit()

    def press(self, *keys):
        """Presses keys of the remote control."""
        ActionChains(self.driver).send_keys(*keys).perform()

    def text(self, element):
        """The text of the element with that id."""
        # Not .text, in which the driver leaves out elements with "overflow: hidden".
        return self.driver.find_element(By.ID, element).get_property('innerText')

    def wait_for_text(self, element, text, seconds=60):
        """Waits until the element with that id contains the text."""
        WebDriverWait(self.driver, seconds).until(lambda _: text in self.text(element), f'{element}: no {text}')

    def channel(self):
        """The name of the current channel."""
        return self.driver.execute_script(
            'return document.querySelector("object[type=\'video/broadcast\']").currentChannel.name')


def main(url, screenshot=None):
    with Television() as television:
        television.driver.get(url)
        television.wait_for_text('banner-name', 'Telix One')
        assert television.channel() == 'Telix One'

        television.press('2')
        television.wait_for_text('banner-name', 'Telix Two')
        assert television.channel() == 'Telix Two'

        television.press(YELLOW)
        television.wait_for_text('media-list', 'Running clock')
        television.press(OK)
        television.wait_for_text('media-state', 'Playing')
        if screenshot:
            television.driver.save_screenshot(screenshot)

        television.press(BACK)
        television.wait_for_text('banner-name', 'Telix Two')
    print('passed')


if __name__ == '__main__':
    if len(sys.argv) not in (2, 3):
        sys.exit(__doc__)
    main(*sys.argv[1:])
