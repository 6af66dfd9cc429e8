// SPDX-License-Identifier: Apache-2.0
// Panes that show pictures of one size, all of them the same part of it.

const LARGEST_ZOOM = 64;
const KEY_STEP = 40; // canvas pixels
const LARGE = 2e6; // picture pixels

/** The part of the picture that panes show: `zoom` canvas pixels for each of its own. */
export class View {
    constructor(changed) {
        this.panes = [];
        this.changed = changed;
        this.size = { width: 1, height: 1 };
        this.centre = { x: 0.5, y: 0.5 }; // as a share of the size
        this.zoom = 1;
        this.isFitted = true;
    }

    addPane(canvas) {
        const pane = new Pane(canvas, this);
        this.panes.push(pane);
        return pane;
    }

    setSize(width, height) {
        this.size = { width, height };
        if (this.isFitted) this.fit();
    }

    fit() {
        const { width, height } = this.panes[0].canvas;
        const zoom = Math.min(width / this.size.width, height / this.size.height);
        this.zoom = zoom > 1 ? Math.floor(zoom) : zoom;
        this.centre = { x: 0.5, y: 0.5 };
        this.isFitted = true;
        this.draw();
    }

    /** Keeps the picture's point at (x, y) of the canvas where it is. */
    zoomTo(zoom, x, y) {
        const { width, height } = this.panes[0].canvas;
        const before = this.zoom;
        this.zoom = Math.min(LARGEST_ZOOM, Math.max(Math.min(this.smallest(), before), zoom));
        const shift = 1 / before - 1 / this.zoom;
        this.isFitted = false;
        this.centre.x += ((x - width / 2) * shift) / this.size.width;
        this.centre.y += ((y - height / 2) * shift) / this.size.height;
        this.draw();
    }

    zoomBy(factor, x, y) {
        const { width, height } = this.panes[0].canvas;
        this.zoomTo(this.zoom * factor, x ?? width / 2, y ?? height / 2);
    }

    moveBy(x, y) {
        this.centre.x -= x / (this.zoom * this.size.width);
        this.centre.y -= y / (this.zoom * this.size.height);
        this.isFitted = false;
        this.draw();
    }

    smallest() {
        const { width, height } = this.panes[0].canvas;
        return Math.min(1, width / this.size.width, height / this.size.height);
    }

    /** Whole pictures stay in the middle, others cover the pane. */
    limitCentre() {
        const { width, height } = this.panes[0].canvas;
        const limited = (centre, side, room) => {
            const share = room / (2 * this.zoom * side);
            return share >= 0.5 ? 0.5 : Math.min(1 - share, Math.max(share, centre));
        };
        this.centre.x = limited(this.centre.x, this.size.width, width);
        this.centre.y = limited(this.centre.y, this.size.height, height);
    }

    draw() {
        this.limitCentre();
        this.changed();
        if (this.frame) return;
        this.frame = requestAnimationFrame(() => {
            this.frame = 0;
            for (const pane of this.panes) pane.draw();
        });
    }
}

class Pane {
    constructor(canvas, view) {
        this.canvas = canvas;
        this.view = view;
        this.bitmap = null;
        this.context = canvas.getContext('2d');
        this.pointers = new Map();
        this.listen();
        new ResizeObserver(() => this.resize()).observe(canvas);
        this.resize();
    }

    show(bitmap) {
        this.bitmap?.close();
        this.bitmap = bitmap;
        this.view.draw();
    }

    resize() {
        const ratio = window.devicePixelRatio || 1;
        const { width, height } = this.canvas.getBoundingClientRect();
        this.canvas.width = Math.max(1, Math.round(width * ratio));
        this.canvas.height = Math.max(1, Math.round(height * ratio));
        if (this.view.panes[0] === this && this.view.isFitted) this.view.fit();
        else if (this.view.panes.length > 0) this.view.draw();
    }

    draw() {
        const { context, canvas, bitmap, view } = this;
        context.clearRect(0, 0, canvas.width, canvas.height);
        if (!bitmap) return;
        // Pixels stay sharp; where there are more than the pane has, it shows averages: cheap ones of
        // large pictures, which would keep the page busy.
        context.imageSmoothingEnabled = view.zoom < 1;
        context.imageSmoothingQuality = bitmap.width * bitmap.height > LARGE ? 'low' : 'high';
        const x = Math.round(canvas.width / 2 - view.centre.x * view.size.width * view.zoom);
        const y = Math.round(canvas.height / 2 - view.centre.y * view.size.height * view.zoom);
        const width = view.size.width * view.zoom;
        const height = view.size.height * view.zoom;
        context.drawImage(bitmap, x, y, width, height);
    }

    // ---- Pointers, wheel, keys ----

    listen() {
        const { canvas } = this;
        canvas.addEventListener('pointerdown', (event) => {
            canvas.setPointerCapture(event.pointerId);
            this.pointers.set(event.pointerId, this.at(event));
        });
        for (const type of ['pointerup', 'pointercancel']) {
            canvas.addEventListener(type, (event) => this.pointers.delete(event.pointerId));
        }
        canvas.addEventListener('pointermove', (event) => this.move(event));
        canvas.addEventListener(
            'wheel',
            (event) => {
                event.preventDefault();
                const { x, y } = this.at(event);
                this.view.zoomBy(2 ** (-event.deltaY / 240), x, y);
            },
            { passive: false },
        );
        canvas.addEventListener('keydown', (event) => this.press(event));
    }

    at(event) {
        const box = this.canvas.getBoundingClientRect();
        const ratio = this.canvas.width / box.width;
        return { x: (event.clientX - box.left) * ratio, y: (event.clientY - box.top) * ratio };
    }

    move(event) {
        const before = this.pointers.get(event.pointerId);
        if (!before) return;
        const now = this.at(event);
        if (this.pointers.size === 1) {
            this.view.moveBy(now.x - before.x, now.y - before.y);
        } else {
            const [id] = [...this.pointers.keys()].filter((key) => key !== event.pointerId);
            const other = this.pointers.get(id);
            const spread = (point) => Math.hypot(point.x - other.x, point.y - other.y) || 1;
            this.view.zoomBy(spread(now) / spread(before), other.x, other.y);
        }
        this.pointers.set(event.pointerId, now);
    }

    press(event) {
        if (event.ctrlKey || event.altKey || event.metaKey) return;
        const actions = {
            ArrowLeft: () => this.view.moveBy(KEY_STEP, 0),
            ArrowRight: () => this.view.moveBy(-KEY_STEP, 0),
            ArrowUp: () => this.view.moveBy(0, KEY_STEP),
            ArrowDown: () => this.view.moveBy(0, -KEY_STEP),
            '+': () => this.view.zoomBy(2),
            '=': () => this.view.zoomBy(2),
            '-': () => this.view.zoomBy(0.5),
            0: () => this.view.fit(),
            1: () => this.view.zoomBy(1 / this.view.zoom),
        };
        const action = actions[event.key];
        if (!action) return;
        event.preventDefault();
        action();
    }
}
