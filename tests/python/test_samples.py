"""The shipped sample files convert as binary files, not through the text fallback."""
import os
import re

import Dexmor

EXAMPLES = os.path.join(os.environ["DEXMOR_SOURCE_DIR"], "examples")


def test_sample_library_converts_every_material():
    xml = Dexmor.getZelmatXml(os.path.join(EXAMPLES, "sample.zelmat"))
    # One <Assets> block per material, each closed.
    assert xml.count("<Assets>\n") == 20
    assert xml.count("</Assets>\n") == 20
    assert '<Asset layout="defkvmat" renderer="kavor" type="material" url="/Verre d\u00e9poli" >' in xml
    for layout in ("TwoSidedMatLayout", "SkpTwoSidedMatLayout", "AngleBlendMatLayout", "ToonMatLayout"):
        assert f'layout="{layout}"' in xml
    for brdf in ("BRDFDiffuse", "BRDFRefraction", "BRDFReflection", "BRDFLight"):
        assert f'name="{brdf}"' in xml


def test_sample_options_convert_to_the_settings_sections():
    xml = Dexmor.getZeloptXml(os.path.join(EXAMPLES, "sample.zelopt"))
    assert xml.startswith("<Assets>\n")
    assert xml.endswith("</Assets>\n")
    sections = re.findall(r'<kavorplugin name="(\w+)" type="settings">', xml)
    assert len(sections) == 21
    assert sections[0] == "SettingsImageSampler"
    assert sections[-1] == "CameraPhysical"
    assert "<entry>ZDepth</entry>" in xml
    assert 'url="/SettingsEnvironment/bg_texture"' in xml
