"""The wrapped form of the asset document and its schema (schema/dexmor-assets.rng).

Every document the tests know is valid against the schema: the golden documents,
both samples, every corpus file that reads as binary, a library of hostile names.
In the same documents every plugin reference names an asset of its document, or
is a reference the check's lint reports. The schema refuses a document of the
wrong shape, and the guide's recipes work as printed."""
import json
import os
import pathlib
import re
import shutil
import subprocess
import xml.etree.ElementTree as ET

import pytest

import Dexmor

CLI = os.path.abspath(os.environ["DEXMOR_CLI"]) if "DEXMOR_CLI" in os.environ else "dexmor"
MAKE_SEEDS = os.environ.get("DEXMOR_MAKE_SEEDS")
SOURCE_DIR = pathlib.Path(os.environ.get("DEXMOR_SOURCE_DIR", pathlib.Path(__file__).resolve().parents[2]))
SCHEMA = SOURCE_DIR / "schema" / "dexmor-assets.rng"
EXAMPLES = SOURCE_DIR / "examples"
XMLLINT = shutil.which("xmllint")  # libxml2-utils, in tools/dev's list
DECLARATION = '<?xml version="1.0" encoding="UTF-8"?>\n'
# The writer's own calls with names and labels no file gives (a "<" in a
# parameter name): a test of the writer, not a document.
NOT_DOCUMENTS = {"xml_writer_calls.xml"}


def dexmor(*args, **kwargs):
    kwargs.setdefault("stdout", subprocess.PIPE)
    kwargs.setdefault("stderr", subprocess.PIPE)
    return subprocess.run([CLI, *map(str, args)], timeout=300, **kwargs)


def xmllint(*args):
    assert XMLLINT, "xmllint (libxml2-utils) is needed to check documents against the schema"
    return subprocess.run([XMLLINT, *map(str, args)], capture_output=True, text=True, errors="replace", timeout=300)


def assert_valid(paths):
    """One xmllint run over every file: each must be well-formed and valid."""
    assert paths
    run = xmllint("--noout", "--relaxng", SCHEMA, *paths)
    assert run.returncode == 0, run.stderr[-6000:]


def unnamed_references(root):
    """The plugin references of a document that name none of its assets (an asset
    is named by its url, or by its url, "/" and its plugin name)."""
    targets = set()
    for asset in root.iter("Asset"):
        targets.add(asset.get("url"))
        targets.update(asset.get("url") + "/" + plugin.get("name") for plugin in asset.iter("kavorplugin"))
    references = [value.text or "" for p in root.iter("parameter") if p.get("type") == "plugin"
                  for value in p.findall("value")]
    references += [entry.text or "" for p in root.iter("parameter") if p.get("listType") == "plugin"
                   for entry in p.iter("entry")]
    return [r for r in references if r not in targets]


def lint_references(warnings):
    """The references the lint reports as naming no asset, as the wrapped form
    writes them (the lint shows a control character as an escape, the wrapped
    form as U+FFFD)."""
    found = []
    for warning in warnings:
        match = re.search(r': the reference "(.*)" names no asset of the document$', warning, re.S)
        if match:
            found.append(re.sub(r"\\x[0-9a-f]{2}|[\ufffe\uffff]", "\ufffd", match.group(1)))
    return found


def check_json(kind, paths):
    """The check's report of each file, by path."""
    run = dexmor("check", "--json", "--kind", kind, *paths)
    return {report["path"]: report for report in map(json.loads, run.stdout.decode().splitlines())}


def wrapped(path, kind):
    return Dexmor.convert(path, kind=kind, wrap=True)


def golden_as_document(text):
    """A golden document, or the fragment of one a test compares, in the root."""
    if text.startswith("<Assets>\n<Assets>"):
        return f'<AssetDocument kind="zelopt">\n{text}</AssetDocument>\n'
    if text.startswith("<Assets>"):
        return f'<AssetDocument kind="zelmat">\n{text}</AssetDocument>\n'
    if text.startswith("<parameter"):
        return ('<AssetDocument kind="zelopt"><Assets><Assets>'
                '<Asset layout="" renderer="kavor" type="settings" url="/Golden">'
                '<plugin><kavorplugin name="Golden" type="settings"><parameters>\n'
                f'{text}</parameters></kavorplugin></plugin></Asset></Assets></Assets></AssetDocument>\n')
    return f'<AssetDocument kind="zelmat"><Assets>\n{text}</Assets></AssetDocument>\n'


def test_every_golden_document_is_valid(tmp_path):
    goldens = sorted((SOURCE_DIR / "tests" / "golden").glob("*.xml"))
    paths = []
    for golden in goldens:
        if golden.name in NOT_DOCUMENTS:
            continue
        path = tmp_path / golden.name
        path.write_text(golden_as_document(golden.read_text(encoding="utf-8")), encoding="utf-8")
        paths.append(path)
    assert len(paths) == len(goldens) - len(NOT_DOCUMENTS)
    assert_valid(paths)


@pytest.mark.parametrize("name, kind", [("sample.zelmat", "zelmat"), ("sample.zelopt", "zelopt")])
def test_the_samples_wrapped_are_the_plain_documents_in_the_root(tmp_path, name, kind):
    sample = EXAMPLES / name
    run = dexmor("xml", "--wrap", sample)
    assert run.returncode == 0, run.stderr
    text = run.stdout.decode()
    plain = Dexmor.convert(sample)
    assert plain == (Dexmor.getZelmatXml if kind == "zelmat" else Dexmor.getZeloptXml)(str(sample))
    assert text == f'{DECLARATION}<AssetDocument kind="{kind}">\n{plain}</AssetDocument>\n'
    assert Dexmor.convertBytes(sample.read_bytes(), kind, wrap=True) == text == wrapped(sample, kind)
    # Written to a path or a regular file, without holding the document.
    Dexmor.convert(sample, kind=kind, wrap=True, out=tmp_path / "out.xml")
    with open(tmp_path / "stdout.xml", "wb") as stdout:
        assert dexmor("xml", "--wrap", sample, stdout=stdout, stderr=subprocess.PIPE).returncode == 0
    for written in ("out.xml", "stdout.xml"):
        assert (tmp_path / written).read_text(encoding="utf-8") == text
    (tmp_path / "doc.xml").write_text(text, encoding="utf-8")
    assert_valid([tmp_path / "doc.xml"])
    root = ET.fromstring(text.encode())
    assert lint_references(check_json(kind, [sample])[str(sample)]["warnings"]) == unnamed_references(root) == []


def test_the_plain_library_document_has_several_roots():
    with pytest.raises(ET.ParseError, match="junk after document element"):
        ET.fromstring(Dexmor.convert(EXAMPLES / "sample.zelmat"))


def corpus_files():
    folders = [SOURCE_DIR / "fuzz" / "regressions", *sorted((SOURCE_DIR / "fuzz" / "corpus").iterdir())]
    return sorted(path for folder in folders for path in folder.rglob("*") if path.is_file())


@pytest.mark.parametrize("kind", ["zelmat", "zelopt"])
def test_every_corpus_file_that_reads_as_binary_is_valid_wrapped(tmp_path, kind):
    readable = [path for path in corpus_files()
                if Dexmor.convertBytesWithDiagnosis(path.read_bytes(), kind, max_output=0)[1] is None]
    assert len(readable) >= (50 if kind == "zelmat" else 10)
    reports = check_json(kind, readable)
    paths = []
    for i, path in enumerate(readable):
        text = wrapped(path, kind)
        root = ET.fromstring(text.encode())
        assert sorted(unnamed_references(root)) == sorted(lint_references(reports[str(path)]["warnings"])), path
        paths.append(tmp_path / f"{i}.xml")
        paths[-1].write_text(text, encoding="utf-8")
    assert_valid(paths)


@pytest.fixture(scope="module")
def hostile_names(tmp_path_factory):
    if not MAKE_SEEDS:
        pytest.skip("needs make_seeds (DEXMOR_MAKE_SEEDS)")
    path = tmp_path_factory.mktemp("names") / "names.zelmat"
    subprocess.run([MAKE_SEEDS, "--hostile-names", str(path)], check=True)
    return path


def test_hostile_names_give_a_valid_document_whose_references_resolve(hostile_names, tmp_path):
    plain = Dexmor.convert(hostile_names)
    assert "\x01" in plain  # the plain form keeps control characters as they are
    text = wrapped(hostile_names, "zelmat")
    (tmp_path / "names.xml").write_text(text, encoding="utf-8")
    assert_valid([tmp_path / "names.xml"])
    root = ET.fromstring(text.encode())
    urls = {asset.get("url") for asset in root.iter("Asset")}
    # Markup, line breaks and characters beyond the Basic Multilingual Plane come
    # through as they were; what XML cannot carry is U+FFFD.
    for name in ['a&b<c>"d\'e', "]]>", "Tab\tLine\nFeed\rReturn", "Face\U0001F600", "Ctl\ufffd\ufffd\ufffd",
                 "Not\ufffd", "Del\x7f\x85", "&amp;"]:
        assert "/" + name in urls, name
    files = [p.find("value").text for p in root.iter("parameter") if p.get("name") == "file"]
    assert "C:\\maps\\Tab\tLine\nFeed\rReturn.png" in files and "C:\\maps\\Ctl\ufffd\ufffd\ufffd.png" in files
    warnings = check_json("zelmat", [hostile_names])[str(hostile_names)]["warnings"]
    assert unnamed_references(root) == lint_references(warnings) == ["/Set\ufffd"]
    # The lint names each parameter whose text the wrapped form changes.
    assert any('the parameter "file" of the asset "/Ctl\\x01\\x02\\x1f/' in w for w in warnings)


def test_text_passed_through_is_escaped_in_one_element(tmp_path):
    text = Dexmor.convertBytes(b'<Assets a="1">\x01 & \r\n</Assets>', "zelmat", wrap=True)
    root = ET.fromstring(text.encode())
    assert (root.tag, root.get("kind"), [child.tag for child in root]) == ("AssetDocument", "zelmat", ["passedThrough"])
    assert root[0].text == '<Assets a="1">\ufffd & \r\n</Assets>'
    (tmp_path / "text.xml").write_text(text, encoding="utf-8")
    assert_valid([tmp_path / "text.xml"])
    with pytest.raises(Dexmor.ReadError):
        Dexmor.convertBytes(b"<Assets/>", "zelopt", wrap=True, strict=True)


# A document the writer could not have written, each from the wrapped sample by
# one change: the schema must refuse it.
WRONG_SHAPES = {
    "misspelled element": ("<parameters>", "<parameter_list>", "</parameters>", "</parameter_list>"),
    "missing attribute": (' renderer="kavor"', ""),
    "plugin of another type": ('<kavorplugin name="BRDFDiffuse" type="BRDF">',
                               '<kavorplugin name="BRDFDiffuse" type="texture">'),
    "float in C's form": ("<value>0.01</value>", "<value>1e-2</value>"),
    "bool of another word": ("<value>1</value>", "<value>true</value>"),
    "color without blue": ("<b>", "<a>", "</b>", "</a>"),
    "reference not a url": ("<entry>/", "<entry>"),
    "list of another type": ('listType="plugin"', 'listType="float"'),
    "unknown kind": ('kind="zelmat"', 'kind="zelmap"'),
}


@pytest.mark.parametrize("shape", WRONG_SHAPES)
def test_the_schema_refuses_a_document_of_the_wrong_shape(tmp_path, shape):
    text = wrapped(EXAMPLES / "sample.zelmat", "zelmat")
    if shape == "float in C's form":
        text = wrapped(EXAMPLES / "sample.zelopt", "zelopt")
    changes = WRONG_SHAPES[shape]
    for old, new in zip(changes[::2], changes[1::2]):
        assert old in text
        text = text.replace(old, new, 1)
    (tmp_path / "wrong.xml").write_text(text, encoding="utf-8")
    ET.fromstring(text.encode())  # still well-formed: the schema is what refuses it
    run = xmllint("--noout", "--relaxng", SCHEMA, tmp_path / "wrong.xml")
    assert run.returncode != 0 and "fails to validate" in run.stderr


def guide_recipes():
    """The shell and Python recipes of the user guide, in the order written."""
    guide = (SOURCE_DIR / "docs" / "user-guide.md").read_text(encoding="utf-8")
    return re.findall(r"```(sh|python)\n(.*?)```", guide, re.S)


def test_the_guide_recipes_work_as_printed(tmp_path):
    for name in ("sample.zelmat", "sample.zelopt"):
        shutil.copy(EXAMPLES / name, tmp_path)
    bin_dir = pathlib.Path(CLI).parent
    env = dict(os.environ, PATH=f"{bin_dir}{os.pathsep}{os.environ['PATH']}")
    textures = sorted({p.find("value").text for p in ET.fromstring(wrapped(EXAMPLES / "sample.zelmat", "zelmat"))
                       .iter("parameter") if p.get("name") == "file"})
    assert textures
    ran = set()
    for language, recipe in guide_recipes():
        if "--wrap" not in recipe and "wrap=True" not in recipe:
            continue
        if language == "sh":
            run = subprocess.run(["sh", "-c", recipe], cwd=tmp_path, env=env, capture_output=True, text=True,
                                 timeout=120)
        else:
            run = subprocess.run(["/usr/bin/python3", "-c", recipe], cwd=tmp_path, env=env, capture_output=True,
                                 text=True, timeout=120)
        assert run.returncode == 0, (recipe, run.stderr)
        if "file" in recipe:
            assert sorted(set(run.stdout.split("\n")) - {""}) == textures, recipe
            ran.add(language)
    assert ran == {"sh", "python"}
