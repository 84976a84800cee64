// Runs in the page: the texts that are seen, whose contrast with what is behind them is below 4.5 to 1.
// Texts of controls that cannot be used now are left out.
export function contrastFaults() {
    const context = Object.assign(document.createElement('canvas'), { width: 1, height: 1 }).getContext('2d', { willReadFrequently: true });
    const layers = (colors) => {
        context.clearRect(0, 0, 1, 1);
        for (const color of colors) {
            context.fillStyle = color;
            context.fillRect(0, 0, 1, 1);
        }
        return [...context.getImageData(0, 0, 1, 1).data];
    };
    const luminance = ([red, green, blue]) => [red, green, blue].map((value) => value / 255)
        .map((value) => (value <= 0.04045 ? value / 12.92 : ((value + 0.055) / 1.055) ** 2.4))
        .reduce((sum, value, index) => sum + value * [0.2126, 0.7152, 0.0722][index], 0);
    const ancestors = (element) => (element ? [...ancestors(element.parentElement), element] : []);
    const faults = [];
    let looked = 0;
    const walker = document.createTreeWalker(document.body, NodeFilter.SHOW_TEXT);
    while (walker.nextNode()) {
        const element = walker.currentNode.parentElement;
        const seen = element.checkVisibility({ checkOpacity: true, checkVisibilityCSS: true });
        if (!walker.currentNode.textContent.trim() || !seen || element.closest('.unseen, option, [aria-disabled="true"]')) {
            continue;
        }
        looked += 1;
        const chain = ancestors(element);
        const opacity = chain.reduce((product, each) => product * Number(getComputedStyle(each).opacity), 1);
        const behind = ['Canvas', ...chain.map((each) => getComputedStyle(each).backgroundColor)];
        const text = layers([...behind, getComputedStyle(element).color]);
        const [light, dark] = [luminance(text), luminance(layers(behind))].sort((a, b) => b - a);
        const ratio = (light + 0.05) / (dark + 0.05);
        if (ratio < 4.5 || opacity < 1) {
            faults.push(`${walker.currentNode.textContent.trim()}: ${ratio.toFixed(2)}, opacity ${opacity}`);
        }
    }
    return looked > 10 ? faults : ['hardly any text was seen'];
}
