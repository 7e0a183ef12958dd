#!/usr/bin/env python3
"""Checks that the links between the Markdown files given lead somewhere: to a file, and to a heading in it."""
import os
import re
import sys

LINK = re.compile(r'\[[^\]]*\]\(([^)\s]+)\)')


def prose(path):
    """The text without its code, in which brackets mean something else."""
    with open(path, encoding='utf-8') as file:
        text = re.sub(r'^```.*?^```$', '', file.read(), flags=re.M | re.S)
    return re.sub(r'`[^`\n]*`', 'code', re.sub(r'^    .*$', '', text, flags=re.M))


def anchors(path):
    """The names by which the headings of a file can be reached."""
    with open(path, encoding='utf-8') as file:
        headings = re.findall(r'^#+ (.*)$', file.read(), flags=re.M)
    return {re.sub(r'[^\w\- ]', '', heading).strip().lower().replace(' ', '-') for heading in headings}


def problem(page, target):
    if re.match(r'https?:|mailto:', target):
        return None  # the world outside is not looked at
    path, _, anchor = target.partition('#')
    file = os.path.normpath(os.path.join(os.path.dirname(page), path)) if path else page
    if not os.path.exists(file):
        return 'no such file'
    if anchor and anchor not in anchors(file):
        return 'no such heading'
    return None


broken = 0
for page in sys.argv[1:]:
    for target in LINK.findall(prose(page)):
        trouble = problem(page, target)
        if trouble:
            print('%s: %s: %s' % (page, target, trouble))
            broken += 1
sys.exit(1 if broken else 0)
