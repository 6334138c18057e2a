"""The documents: what they link to and the files that they name are there.

The environment names the tree (TELIX_SOURCE)."""

import glob
import os
import re
import unittest

SOURCE = os.environ['TELIX_SOURCE']
FOLDERS = ('apps', 'bench', 'bridge', 'common', 'desktop', 'docs', 'include', 'npapi', 'src', 'tests', 'tools')
LINK = re.compile(r'\]\(([^()\s]+)\)')
CODE = re.compile(r'`([^`\n]+)`')
# A path of the tree, with the patterns of the shell.
PATH = re.compile(rf'(?:{"|".join(FOLDERS)})(?:/[\w.*-]+)+/?|[A-Z]+\.md|\w+\.sh')


def documents():
    return [path for pattern in ('*.md', 'docs/*.md', 'docs/api/*.md')
            for path in glob.glob(os.path.join(SOURCE, pattern))]


def read(path):
    with open(path, encoding='utf-8') as file:
        return file.read()


def anchors_of(path):
    """The anchors of the headings of a document."""
    return {re.sub(r'[^\w -]', '', heading.lower()).replace(' ', '-')
            for heading in re.findall(r'^#+ (.*)$', read(path), re.MULTILINE)}


class Documents(unittest.TestCase):
    def test_links_lead_to_files_and_headings(self):
        count = 0
        for document in documents():
            for link in LINK.findall(read(document)):
                if '://' in link:
                    continue
                count += 1
                file, _, anchor = link.partition('#')
                path = os.path.join(os.path.dirname(document), file) if file else document
                self.assertTrue(os.path.exists(path), f'{document}: {link}')
                if anchor:
                    self.assertIn(anchor, anchors_of(path), f'{document}: {link}')
        self.assertGreater(count, 30)

    def test_files_that_are_named_are_in_the_tree(self):
        count = 0
        for document in documents():
            for code in CODE.findall(read(document)):
                if PATH.fullmatch(code):
                    count += 1
                    self.assertTrue(glob.glob(os.path.join(SOURCE, code)), f'{document}: {code}')
        self.assertGreater(count, 40)


if __name__ == '__main__':
    unittest.main()
