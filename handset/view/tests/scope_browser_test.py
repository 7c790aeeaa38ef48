# SPDX-License-Identifier: Apache-2.0
"""handset/scope as somebody with a browser meets it: a tap and its writes, a broken node, a motor that
is unplugged, a service that dies, a reload, a wrong token. Prints how long a page load, a tap and its
writes took; no test depends on it."""

import os
import shutil
import signal
import subprocess
import tempfile
import unittest
import urllib.error
import urllib.request

from selenium import webdriver
from selenium.webdriver.chrome.service import Service
from selenium.webdriver.common.by import By
from selenium.webdriver.support.ui import Select, WebDriverWait

from view_path import HANDSET

_FLAGS = ("--headless", "--no-sandbox", "--disable-gpu", "--disable-quic", "--no-first-run",
          "--disable-background-networking", "--disable-component-update", "--disable-sync",
          "--window-size=1280,900")
_SECONDS = 120  # for anything: a guest under emulation on a busy machine


class Scope(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.server = subprocess.Popen(
            [HANDSET / "scope", "--build", os.environ["HANDSET_BUILD"]], stdout=subprocess.PIPE,
            text=True)
        cls.addClassCleanup(cls.server.stdout.close)
        cls.addClassCleanup(cls.server.wait)
        cls.addClassCleanup(cls.server.send_signal, signal.SIGTERM)
        cls.address = cls.server.stdout.readline().strip()
        profile = tempfile.mkdtemp(prefix="scope-browser-")
        cls.addClassCleanup(shutil.rmtree, profile, ignore_errors=True)
        options = webdriver.ChromeOptions()
        for flag in (*_FLAGS, f"--user-data-dir={profile}"):
            options.add_argument(flag)
        cls.browser = webdriver.Chrome(service=Service("/usr/bin/chromedriver"), options=options)
        cls.addClassCleanup(cls.browser.quit)
        cls.browser.get(cls.address)
        cls.wait_for("phone", "service registered")

    @classmethod
    def wait_for(cls, name, text):
        WebDriverWait(cls.browser, _SECONDS).until(
            lambda browser: text in browser.find_element(By.ID, name).text,
            f"{text!r} in {name}: {cls.browser.find_element(By.ID, name).text}")

    def press(self, text):
        self.browser.find_element(By.XPATH, f"//button[.='{text}']").click()

    def rows(self, source):
        return self.browser.execute_script(
            "return [...document.querySelectorAll('#lines tr.' + arguments[0])].map("
            "row => row.cells[3].textContent)", source)

    def choose(self, name, value):
        Select(self.browser.find_element(By.ID, name)).select_by_visible_text(value)

    def call_and_read(self, button):
        """Presses a button and returns what the driver was told until the answer."""
        before = len(self.rows("answer"))
        seen = len(self.rows("driver"))
        self.press(button)
        WebDriverWait(self.browser, _SECONDS).until(lambda _: len(self.rows("answer")) > before)
        return self.rows("driver")[seen:]

    def test_shows_the_writes_of_an_effect_that_is_tapped(self):
        writes = self.call_and_read("TICK")
        self.assertEqual(writes, ["intensity ← 10000", "cp_trigger_index ← 50", "state ← 1",
                                  "duration ← 1000", "activate ← 1"])
        self.assertRegex(self.tap(), r"^writes after \d+ to \d+ ms, answer after \d+ ms$")
        self.call_and_read("TICK")  # the first one has found everything cold
        print("tap:", self.tap())

    def tap(self):
        return self.browser.find_element(By.ID, "tap").text

    def bring_up(self, profile):
        self.choose("profile", profile)
        self.wait_for("phone", f"profile {profile}, service registered")
        self.wait_for("findings", "problem" if profile == "none" else "all is well")

    def test_shows_a_motor_that_is_unplugged_and_comes_back(self):
        self.addCleanup(self.bring_up, "leds")
        self.bring_up("ff")
        self.press("Unplug")
        self.wait_for("lines", "motor ← unplug")
        self.call_and_read("On")
        self.assertIn("EX_ILLEGAL_STATE", self.rows("answer")[-1])
        self.press("Plug")
        self.wait_for("lines", "motor ← plug")
        self.call_and_read("On")
        self.assertEqual(self.rows("answer")[-1], "ok")

    def test_shows_a_service_that_is_killed_and_restarted(self):
        self.press("Kill service")
        self.wait_for("last", "phone service kill: done")
        self.press("Restart")
        self.wait_for("last", "phone service restart: phone is up: profile leds, service registered")
        self.wait_for("phone", "service registered")
        self.assertEqual(self.call_and_read("Off"), ["activate ← 0"])
        you = self.browser.find_elements(By.CSS_SELECTOR, "#lines tr.you")
        self.assertEqual([row.text.split("you")[-1].strip() for row in you][-2:],
                         ["phone service kill", "phone service restart"])

    def test_gives_each_line_the_call_that_caused_it(self):
        self.call_and_read("TICK")
        self.call_and_read("Off")
        rows = self.browser.execute_script(
            "return [...document.querySelectorAll('#lines tr')].slice(-40).map(row => "
            "[row.className, row.cells[1].textContent, row.cells[3].textContent, row.title])")
        answers = [row for row in rows if row[0].startswith("answer")][-2:]
        self.assertEqual([row[3] for row in answers], ["std perform TICK STRONG", "std off"])
        (off,) = [row for row in rows if row[1] == answers[1][1] and row[0] == "driver"]
        self.assertEqual(off[2:], ["activate ← 0", "std off"])

    def test_shows_the_drive(self):
        duration = self.browser.find_element(By.ID, "duration")
        duration.clear()
        duration.send_keys("300000")
        self.call_and_read("On")
        self.wait_for("now", "drive 100 %: 300000 ms (timed)")
        self.call_and_read("Off")
        self.wait_for("now", "drive 0 %")

    def test_shows_a_broken_node(self):
        self.choose("node", "duration")
        self.press("Fail once")
        duration = self.browser.find_element(By.ID, "duration")
        duration.clear()
        duration.send_keys("500")
        self.wait_for("last", "phone fault node=/sys/class/leds/vibrator/duration")
        self.assertEqual(self.call_and_read("On"), ["state ← 1", "duration ← 500 (EIO)"])
        bad = self.browser.find_elements(By.CSS_SELECTOR, "#lines tr.driver.bad")
        self.assertIn("std on 500", bad[-1].get_attribute("title"))
        self.assertEqual(self.call_and_read("On")[1], "duration ← 500")

    def test_reloaded_shows_what_it_showed(self):
        self.call_and_read("Off")
        rows = self.rows("driver")
        self.browser.refresh()
        self.wait_for("lines", rows[-1])
        self.assertEqual(self.rows("driver"), rows)
        load = self.browser.execute_script(
            "const t = performance.getEntriesByType('navigation')[0]; return t.duration")
        print(f"load: {load:.0f} ms")

    def test_is_played_by_the_keyboard_alone(self):
        before = len(self.rows("answer"))
        button = self.browser.find_element(By.XPATH, "//button[.='Off']")
        self.browser.execute_script("document.getElementById('duration').focus()")
        for key in ("\ue004", "\ue004", "\ue007"):  # Tab to On, Tab to Off, Enter
            self.browser.switch_to.active_element.send_keys(key)
        self.assertEqual(self.browser.switch_to.active_element, button)
        WebDriverWait(self.browser, _SECONDS).until(lambda _: len(self.rows("answer")) > before)
        self.assertEqual(self.rows("driver")[-1], "activate ← 0")

    def test_lets_nobody_in_without_the_token(self):
        for address in (self.address[:-1] + "~", self.address.split("?")[0],
                        self.address.replace("/?", "/socket?")[:-1] + "~"):
            with self.assertRaises(urllib.error.HTTPError) as refused:
                urllib.request.urlopen(address)
            self.assertEqual(refused.exception.code, 403)
            refused.exception.close()

    def test_with_a_wrong_token_says_what_to_do(self):
        window = self.browser.current_window_handle
        self.browser.switch_to.new_window("tab")
        self.browser.get(self.address[:-1] + "~")
        self.assertIn("Wrong token: open the address that handset/scope printed.",
                      self.browser.find_element(By.TAG_NAME, "body").text)
        self.browser.close()
        self.browser.switch_to.window(window)


if __name__ == "__main__":
    unittest.main()
