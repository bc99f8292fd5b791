"""The type stub Dexmor.pyi describes exactly the module's public names, each
with its documentation, and the copy beside the built module is current."""
import ast
import os
import pathlib

import Dexmor

SOURCE = pathlib.Path(os.environ.get("DEXMOR_SOURCE_DIR", pathlib.Path(__file__).parents[2]))
STUB = SOURCE / "module" / "Dexmor.pyi"


def stub_definitions():
    tree = ast.parse(STUB.read_text(encoding="utf-8"), filename=str(STUB))
    return tree, {node.name: node for node in tree.body
                  if isinstance(node, (ast.FunctionDef, ast.ClassDef)) and not node.name.startswith("_")}


def test_stub_names_are_the_module_names():
    _, definitions = stub_definitions()
    public = {name for name in dir(Dexmor) if not name.startswith("_")}
    assert set(definitions) == public


def test_stub_documents_everything_and_types_match():
    tree, definitions = stub_definitions()
    assert ast.get_docstring(tree)
    for name, node in definitions.items():
        assert ast.get_docstring(node), f"{name} has no docstring in the stub"
        assert isinstance(node, ast.ClassDef) == isinstance(getattr(Dexmor, name), type), name


def test_copy_beside_the_module_is_current():
    beside = pathlib.Path(Dexmor.__file__).with_name("Dexmor.pyi")
    assert beside.read_bytes() == STUB.read_bytes()
