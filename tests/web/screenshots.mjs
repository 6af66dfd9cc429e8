// SPDX-License-Identifier: Apache-2.0
// screenshots.mjs: the page as docs/web.md shows it, at three widths, light and dark.
import { join } from 'node:path';

import { pageFile, startBrowser } from './browser.mjs';
import { root } from './native.mjs';

const browser = await startBrowser();
for (const [width, height] of [[1440, 1090], [768, 1024], [360, 800]]) {
    for (const colorScheme of ['light', 'dark']) {
        const page = await browser.newPage({ viewport: { width, height }, colorScheme });
        await page.goto(pageFile);
        await page.getByText(/% of the pixels differ/).waitFor();
        if (width === 1440 && colorScheme === 'dark') {
            // Into the panels of fine detail.
            await page.locator('[data-engine=quarter] canvas').focus();
            await page.locator('#zoom-one').click();
            await page.locator('[data-engine=quarter] canvas').focus();
            for (const key of ['+', '+', ...Array(10).fill('ArrowDown'), 'ArrowLeft', 'ArrowLeft']) {
                await page.keyboard.press(key);
            }
        }
        await page.waitForTimeout(300);
        const path = join(root, `docs/web-${width}-${colorScheme}.jpg`);
        await page.screenshot({ path, type: 'jpeg', quality: 70, fullPage: width === 1440 });
        await page.close();
    }
}
await browser.close();
