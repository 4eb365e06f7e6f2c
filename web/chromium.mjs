// Debian's chromium, headless, for the browser test and the editor's timing: a throwaway
// profile, nothing fetched in the background. close() ends the browser and removes the profile.
import { mkdtempSync, rmSync } from 'node:fs';
import { tmpdir } from 'node:os';
import { join } from 'node:path';
import puppeteer from 'puppeteer-core';

export async function launchChromium() {
  const profile = mkdtempSync(join(tmpdir(), 'photofx-chromium-'));
  const browser = await puppeteer.launch({
    executablePath: '/usr/bin/chromium',
    headless: true,
    userDataDir: profile,
    args: ['--no-sandbox', '--disable-gpu', '--disable-background-networking',
      '--disable-component-update', '--disable-sync', '--no-first-run'],
  });
  browser.closeAndClean = async () => {
    await browser.close();
    rmSync(profile, { recursive: true, force: true });
  };
  return browser;
}
