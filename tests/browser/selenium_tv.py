"""The base of the tests of telix-tv under WebKitWebDriver."""

import contextlib
import os

from selenium import webdriver
from selenium.webdriver.common.action_chains import ActionChains
from selenium.webdriver.remote.remote_connection import RemoteConnection
from selenium.webdriver.webkitgtk.options import Options
from selenium.webdriver.webkitgtk.service import Service
from selenium.common.exceptions import WebDriverException

from recordings import Recorded
from telix_tv import PLUGIN, TelixTv
from television import RUN_TIMEOUT

DRIVER = os.environ['TELIX_WEBDRIVER']
# Between the search for a free port and its use another program may take it.
START_ATTEMPTS = 3


def start_driver(environment):
    """Starts WebKitWebDriver on a free port."""
    # The driver would make a folder for the settings of a desktop.
    environment = {**environment, 'GSETTINGS_BACKEND': 'memory'}
    for _ in range(START_ATTEMPTS):
        service = Service(DRIVER, env=environment)
        try:
            service.start()
            return service
        except WebDriverException as error:
            failure = error
    raise failure


def options_of(*arguments):
    """The capabilities that start telix-tv."""
    options = Options()
    options.set_capability('browserName', 'telix-tv')
    options.binary_location = os.environ['TELIX_TV']
    for argument in ('--automation', *arguments):
        options.add_argument(argument)
    return options


def press(session, *keys):
    ActionChains(session).send_keys(*keys).perform()


class DrivenTv(Recorded, TelixTv):
    """Base class: sessions of telix-tv, which end with the test and are recorded."""

    @classmethod
    def setUpClass(cls):
        super().setUpClass()
        RemoteConnection.set_timeout(RUN_TIMEOUT)

    @contextlib.contextmanager
    def driver(self):
        """A running WebKitWebDriver."""
        service = start_driver(self.television.environment)
        try:
            yield service
        finally:
            service.stop()

    def start_session(self, service, *arguments, plugin=PLUGIN, accepts_any_certificate=False):
        options = options_of('--plugin', plugin, '--record', self.new_recording(), *arguments)
        options.accept_insecure_certs = accepts_any_certificate
        return webdriver.Remote(service.service_url, options=options)

    @contextlib.contextmanager
    def session_of(self, service, *arguments, **options):
        session = self.start_session(service, *arguments, **options)
        try:
            yield session
        finally:
            session.quit()

    @contextlib.contextmanager
    def session(self, *arguments, **options):
        """A session with a driver of its own."""
        with self.driver() as service, self.session_of(service, *arguments, **options) as session:
            yield session
