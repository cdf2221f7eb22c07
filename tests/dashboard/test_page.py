"""The page in a real headless Chromium: names, switches, hex fields, pulse trains, LEDs with
their activity, the waveform and its download, which a waveform viewer's converter reads."""

import os
import shutil
import subprocess
import time

import pytest
from selenium import webdriver
from selenium.common.exceptions import StaleElementReferenceException
from selenium.webdriver.chrome.service import Service
from selenium.webdriver.common.by import By
from selenium.webdriver.support.ui import Select, WebDriverWait

from conftest import TOOL

CHROMIUM = "/usr/bin/chromium"
DRIVER = "/usr/bin/chromedriver"


@pytest.fixture
def browser(tmp_path):
    # No skip: without the browser (scripts/setup.sh installs it) this test fails.
    assert os.path.exists(CHROMIUM) and os.path.exists(DRIVER), "chromium or its driver missing"
    options = webdriver.ChromeOptions()
    options.binary_location = CHROMIUM
    for argument in ("--headless=new", "--no-sandbox", "--disable-gpu", "--window-size=1400,1300",
                     "--disable-dev-shm-usage"):
        options.add_argument(argument)
    options.add_experimental_option("prefs", {"download.default_directory": str(tmp_path),
                                              "download.prompt_for_download": False})
    driver = webdriver.Chrome(service=Service(DRIVER), options=options)
    try:
        driver.execute_cdp_cmd("Browser.setDownloadBehavior",
                               {"behavior": "allow", "downloadPath": str(tmp_path)})
        yield driver
    finally:
        driver.quit()


def until(driver, condition, what, timeout=10):
    return WebDriverWait(driver, timeout, poll_frequency=0.02,
                         ignored_exceptions=[StaleElementReferenceException]).until(
        lambda d: condition(d), message=what)


def seen(driver, name, value):
    """Whether some read the page received showed input `name` at `value`."""
    return driver.execute_script(
        "return state.samples.some(s => s.inputs.some(i => i.name === arguments[0] && "
        "i.value === arguments[1]))", name, value)


def define(driver, name, port, bits):
    driver.find_element(By.ID, "define-name").clear()
    driver.find_element(By.ID, "define-name").send_keys(name)
    Select(driver.find_element(By.ID, "define-port")).select_by_visible_text(port)
    driver.find_element(By.ID, "define-bits").clear()
    driver.find_element(By.ID, "define-bits").send_keys(bits)
    driver.find_element(By.ID, "define-submit").click()
    until(driver, lambda d: d.find_elements(By.CSS_SELECTOR, f'[data-undefine="{name}"]'),
          f"{name} in the list of names")


def flashes(driver, name, direction):
    node = driver.find_element(By.CSS_SELECTOR, f'[data-input="{name}"] .act.{direction}')
    return int(node.get_attribute("data-flashes") or 0)


def samples(driver):
    return int(driver.find_element(By.ID, "waveform").get_attribute("data-samples"))


def test_the_page_drives_and_shows_the_loopback(dashboard, browser, tmp_path):
    browser.get(dashboard.url)
    until(browser, lambda d: Select(d.find_element(By.ID, "core-select"))
          .first_selected_option.text == "0:1:0", "the first MOX core goes live")
    for name, port, bits in [("leds", "async_out", "0-7"), ("leds_in", "async_in", "0-7"),
                             ("sw", "async_out", "8"), ("sw_in", "async_in", "8"),
                             ("strobe", "sync_out", "0"), ("strobe_in", "sync_in", "0")]:
        define(browser, name, port, bits)

    # A hex field drives the bus; the looped-back input shows it.
    field = browser.find_element(By.CSS_SELECTOR, 'input[data-output="leds"]')
    field.send_keys("A5")
    browser.find_element(By.CSS_SELECTOR, '[data-write="leds"]').click()
    until(browser, lambda d: d.find_element(By.CSS_SELECTOR, '[data-input="leds_in"] .value')
          .text == "A5", "leds_in shows A5")

    # A switch lights the looped-back LED, and its rise flashes up.
    led = '[data-input="sw_in"] .led'
    assert "on" not in browser.find_element(By.CSS_SELECTOR, led).get_attribute("class")
    before = flashes(browser, "sw_in", "up")
    browser.find_element(By.CSS_SELECTOR, 'input[data-output="sw"]').click()
    until(browser, lambda d: "on" in d.find_element(By.CSS_SELECTOR, led).get_attribute("class"),
          "the sw_in LED lights")
    assert flashes(browser, "sw_in", "up") > before

    # A pulse train high in steps 0 to 3: the synchronous input rises and falls again.
    up, down = flashes(browser, "strobe_in", "up"), flashes(browser, "strobe_in", "down")
    for step in range(4):
        browser.find_element(By.CSS_SELECTOR, f'[data-train="strobe"] [data-step="{step}"]').click()
    browser.find_element(By.CSS_SELECTOR, '[data-train-write="strobe"]').click()
    until(browser, lambda d: flashes(d, "strobe_in", "down") > down, "strobe_in falls again")
    assert flashes(browser, "strobe_in", "up") > up and seen(browser, "strobe_in", "1")

    # The waveform grows, stops while paused, and its download reads in a viewer's converter.
    grown = samples(browser)
    until(browser, lambda d: samples(d) > grown + 5, "the waveform grows")
    browser.find_element(By.ID, "pause").click()
    until(browser, lambda d: d.find_element(By.ID, "pause").text == "Resume", "paused")
    paused = samples(browser)
    time.sleep(0.3)
    assert samples(browser) == paused
    browser.save_screenshot("dashboard.png")  # in the test's build folder; docs/ keeps a copy
    browser.find_element(By.ID, "download-vcd").click()
    vcd = tmp_path / "zinmox-0_1_0.vcd"
    until(browser, lambda d: vcd.exists() and vcd.stat().st_size > 0, "the VCD download")
    text = vcd.read_text()
    assert "$var wire 8 " in text and " leds_in_activity_up $end" in text
    assert "b10100101 " in text  # leds_in at A5
    assert subprocess.run(["vcd2fst", str(vcd), str(tmp_path / "page.fst")]).returncode == 0


def test_watch_writes_a_dump_that_a_viewer_reads(tmp_path):
    vcd = tmp_path / "watch.vcd"
    subprocess.run([TOOL, "watch", "0:1:0", "--interval", "5", "--count", "20", "--vcd", str(vcd)],
                   check=True, stdout=subprocess.DEVNULL)
    text = vcd.read_text()
    for signal in ("async_in_data", "sync_in_data_sync_activity_down"):
        assert f" {signal} $end" in text
    assert text.count("\n#") >= 19  # the counter inputs change on every read
    assert shutil.which("vcd2fst"), "vcd2fst (gtkwave) missing"
    assert subprocess.run(["vcd2fst", str(vcd), str(tmp_path / "watch.fst")]).returncode == 0
