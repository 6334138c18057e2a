#!/usr/bin/env node
// A test of the demonstration with selenium-webdriver: zaps to another channel and plays a clip.
//
// Usage: first_test.js URL-OF-THE-DEMONSTRATION [SCREENSHOT.png]
//
// Needs selenium-webdriver of the npm registry and Debian's webkit2gtk-driver. TELIX_TV is the television's program,
// /usr/bin/telix-tv by default.
'use strict';

const assert = require('assert');
const fs = require('fs');
const { Builder, By, Key } = require('selenium-webdriver');
const { DriverService } = require('selenium-webdriver/remote');

// The keys of the remote control that are keys of the keyboard in the television.
const [OK, BACK, YELLOW] = [Key.ENTER, Key.BACK_SPACE, Key.F3];
const TIMEOUT = 60000;

// telix-tv with a temporary profile.
function startTelevision(server) {
    return new Builder().usingServer(server).withCapabilities({
        browserName: 'telix-tv',
        'webkitgtk:browserOptions': {
            binary: process.env.TELIX_TV || '/usr/bin/telix-tv',
            args: ['--automation'],
        },
    }).build();
}

function press(driver, ...keys) {
    return driver.actions().sendKeys(...keys).perform();
}

// Waits until the element with that id contains the text.
async function waitForText(driver, id, text) {
    const element = await driver.findElement(By.id(id));
    // Not getText(), in which the driver leaves out elements with "overflow: hidden".
    await driver.wait(async () => (await element.getProperty('innerText')).includes(text), TIMEOUT, `${id}: no ${text}`);
}

function channel(driver) {
    return driver.executeScript(
        'return document.querySelector("object[type=\'video/broadcast\']").currentChannel.name');
}

async function testDemonstration(driver, url, screenshot) {
    await driver.get(url);
    await waitForText(driver, 'banner-name', 'Telix One');
    assert.strictEqual(await channel(driver), 'Telix One');

    await press(driver, '2');
    await waitForText(driver, 'banner-name', 'Telix Two');
    assert.strictEqual(await channel(driver), 'Telix Two');

    await press(driver, YELLOW);
    await waitForText(driver, 'media-list', 'Running clock');
    await press(driver, OK);
    await waitForText(driver, 'media-state', 'Playing');
    if (screenshot) {
        fs.writeFileSync(screenshot, await driver.takeScreenshot(), 'base64');
    }

    await press(driver, BACK);
    await waitForText(driver, 'banner-name', 'Telix Two');
}

async function main(url, screenshot) {
    const service = new DriverService.Builder('/usr/bin/WebKitWebDriver').setLoopback(true).build();
    const server = await service.start();
    try {
        const driver = await startTelevision(server);
        try {
            await testDemonstration(driver, url, screenshot);
        } finally {
            await driver.quit();
        }
    } finally {
        await service.kill();
    }
    console.log('passed');
}

if (process.argv.length < 3 || process.argv.length > 4) {
    console.error('Usage: first_test.js URL-OF-THE-DEMONSTRATION [SCREENSHOT.png]');
    process.exit(1);
}
main(...process.argv.slice(2)).catch((error) => {
    console.error(error);
    process.exit(1);
});
