"""Completes the pictures of a site: each says what it shows where it cannot be seen, and
those of many parts have fewer columns in a narrow window, as in the gallery.

    pictures.py FOLDER PICTURES

PICTURES has, for some NAME.png, a NAME-narrow.png.
"""
import pathlib
import re
import shutil
import sys

folder, pictures = map(pathlib.Path, sys.argv[1:])


def completed(image):
    name, caption = image["name"], " ".join(image["caption"].split())
    narrow = pictures / f"{name}-narrow.png"
    picture = f'<img src="{name}.png" alt="{caption}"/>'
    if narrow.is_file():
        shutil.copy(narrow, folder)
        picture = (f'<picture><source media="(max-width: 48rem)" srcset="{narrow.name}"/>'
                   f"{picture}</picture>")
    return picture + image["between"] + image["caption"]


for page in folder.glob("*.html"):
    text = page.read_text(encoding="utf-8")
    page.write_text(re.sub(r'<img src="(?P<name>[^"/]+)\.png" alt=""\s*/>'
                           r'(?P<between>\s*<div class="caption">)(?P<caption>[^<]*)',
                           completed, text), encoding="utf-8")
