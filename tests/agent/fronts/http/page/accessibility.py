# SPDX-License-Identifier: BSD-2-Clause
"""What anyone who cannot see a page, or its colours, needs of it."""

# Roles whose nodes people act on, or which stand for a picture: they have names.
NAMED = {"link", "button", "textbox", "searchbox", "checkbox", "combobox", "grid", "gridcell", "img", "meter",
         "columnheader", "heading", "navigation", "list", "region"}
# Lists without a name, in which each entry says what it is.
NAMELESS_LISTS = {"list"}
ONCE = ("main", "banner", "navigation", "contentinfo")

# The texts whose contrast is too low: [text, its colour, the ground's, the contrast].
CONTRAST = """(() => {
    const parse = (text) => {
        const [red, green, blue, opacity = 1] = text.match(/[\\d.]+/g).map(Number);
        return { channels: [red, green, blue], opacity };
    };
    const brightness = (channels) => {
        const [red, green, blue] = channels.map((value) => {
            const part = value / 255;
            return part <= 0.04045 ? part / 12.92 : ((part + 0.055) / 1.055) ** 2.4;
        });
        return 0.2126 * red + 0.7152 * green + 0.0722 * blue;
    };
    const groundOf = (element) => {
        for (let one = element; one; one = one.parentElement) {
            const ground = parse(getComputedStyle(one).backgroundColor);
            if (ground.opacity === 1) return ground.channels;
            if (ground.opacity > 0) return null; // not decided here
        }
        return [255, 255, 255];
    };
    const faults = [];
    let checked = 0;
    const walker = document.createTreeWalker(document.body, NodeFilter.SHOW_TEXT);
    while (walker.nextNode()) {
        const text = walker.currentNode.textContent.trim();
        const element = walker.currentNode.parentElement;
        if (text === "" || !element.checkVisibility({ checkVisibilityCSS: true })) continue;
        if (["OPTION", "NOSCRIPT", "SCRIPT"].includes(element.tagName)) continue;
        const style = getComputedStyle(element);
        const ground = groundOf(element);
        const colour = parse(style.color);
        if (ground === null || colour.opacity < 1) { faults.push([text, style.color, "see-through", 0]); continue; }
        const [low, high] = [brightness(colour.channels), brightness(ground)].sort((a, b) => a - b);
        const contrast = (high + 0.05) / (low + 0.05);
        ++checked;
        if (contrast < 4.5) faults.push([text, style.color, String(ground), contrast]);
    }
    return { faults, checked };
})()"""

# States that only a colour would tell apart, headings that skip a level, and names given twice.
STRUCTURE = """(() => {
    const faults = [];
    const seen = (element) => element.checkVisibility({ checkVisibilityCSS: true });
    for (const state of document.querySelectorAll(".state, .severity"))
        if (seen(state) && !state.closest(".board-none") && !/[a-z]/i.test(state.textContent))
            faults.push(`a state without a word: ${state.outerHTML}`);
    let level = 0;
    for (const heading of document.querySelectorAll("h1, h2, h3, h4")) {
        if (!seen(heading)) continue;
        const own = Number(heading.tagName[1]);
        if (own > level + 1) faults.push(`heading "${heading.textContent}" skips a level`);
        level = own;
    }
    const identities = [...document.querySelectorAll("[id]")].map((element) => element.id);
    for (const id of new Set(identities))
        if (identities.filter((one) => one === id).length > 1) faults.push(`the id ${id} is there twice`);
    for (const attribute of ["aria-labelledby", "aria-describedby"])
        for (const element of document.querySelectorAll(`[${attribute}]`))
            for (const id of element.getAttribute(attribute).split(" "))
                if (!document.getElementById(id)) faults.push(`${attribute} names ${id}, which is not there`);
    for (const grid of document.querySelectorAll("[role=grid]"))
        if (seen(grid) && document.querySelectorAll(`#${grid.id} [tabindex="0"]`).length + (grid.tabIndex === 0) !== 1)
            faults.push(`the grid ${grid.id} has not one place for the focus`);
    if (!document.documentElement.lang) faults.push("the page has no language");
    return faults;
})()"""


def faults(tab):
    """Everything that is wrong with what a tab shows now, in words."""
    found = list(tab.run(STRUCTURE))
    contrast = tab.run(CONTRAST)
    if contrast["checked"] < 10:
        found.append(f"only {contrast['checked']} texts were found to check")
    found += [f"contrast {value:.2f} of {text!r}: {colour} on {ground}"
              for text, colour, ground, value in contrast["faults"]]
    nodes = tab.accessibility()
    for role, name, properties in nodes:
        needs = role in NAMED or properties.get("focusable") and role not in ("RootWebArea", "generic")
        if needs and not name and role not in NAMELESS_LISTS and role != "main":
            found.append(f"a {role} has no name")
    for role in ONCE:
        number = sum(one == role for one, _, _ in nodes)
        if number != 1:
            found.append(f"there are {number} landmarks of the kind {role}")
    return found
