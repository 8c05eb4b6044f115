"""What can be called, told from the interface tables."""

import re

import pytest


def test_list_names_every_facet_with_a_line_for_each_method(zelt):
    text = zelt("list")
    facets = re.findall(r"^(\w+): \S", text, re.M)
    assert facets == ["Basic", "Conversions", "Transforms", "Statistics", "Math", "Complex", "Filters", "Geometric",
                      "Noise", "Miscellaneous", "Morphology", "FlatFielding", "Fourier"]
    methods = re.findall(r"^  (\w+)\.(\w+) +\S", text, re.M)
    assert {facet for facet, _ in methods} <= set(facets) and len(methods) == len(set(methods))
    assert ("Statistics", "SubsampleFactor") in methods
    one = zelt("list", "statistics")
    assert one in text and one.startswith("Statistics: ")


def test_every_listed_method_has_help(zelt):
    names = re.findall(r"^  (\w+\.\w+) ", zelt("list"), re.M)
    for facet in {name.split(".")[0] for name in names}:
        overview = zelt("help", facet)
        for name in names:
            assert not name.startswith(facet + ".") or re.search(rf"^{re.escape(name)}(\(|$)", overview, re.M), name
    for name in names[::9]:
        assert zelt("help", name.lower()).startswith(name)


def test_help_tells_the_type_rules(zelt):
    assert "Integers of up to 32 bits are combined in 32 bits" in " ".join(zelt("help", "Basic.Add").split())
    assert "RGB and BGR by channel" in " ".join(zelt("help", "Filters.Convolve").split())


def test_help_tells_arguments_defaults_and_values(zelt):
    text = " ".join(zelt("help", "Statistics.FindLocalMaxima").split())
    assert "FindLocalMaxima(pIImage, [nMaxima], [radius], [peakSelectionNeighborhoodSize], [pIRect], [orderSpec]) -> IPeaks" in text
    assert "radius double, optional, default 1 " in text
    assert "pIRect IRectangle, optional, default none; left,top,right,bottom" in text
    assert "orderSpec ZELT_FindLocalMaxima_Ordering, optional, default ZELT_FindLocalMaxima_Ordering_None" in text
    assert "ZELT_FindLocalMaxima_Ordering_Scanline = 2" in text
    assert "set it for a call with --set SubsampleFactor=VALUE" in zelt("help", "Statistics.SubsampleFactor")


def test_misspelt_names_come_with_near_ones(zelt):
    cases = {
        ("help", "Statistic"): "there is no facet 'Statistic': did you mean Statistics?",
        ("help", "Statistics.Maen"): "Statistics has no method 'Maen': did you mean Mean?",
        ("call", "Statistics.Histogrm", "x"): "Statistics has no method 'Histogrm': did you mean Histogram",
        ("list", "xyzzy"): "there is no facet 'xyzzy'",
        ("lst",): "there is no command 'lst': did you mean list?",
        ("call",): "call needs Facet.Method",
        ("call", "Statistics"): "'Statistics' is not Facet.Method",
        ("copy", "x.tif"): "--output is required",
        ("stats", "x.tif", "--bits", "7"): "--bits",
        (): "A subcommand is required",
    }
    for arguments, message in cases.items():
        assert message in zelt(*arguments, status=2), arguments


@pytest.mark.parametrize("arguments", [("--help",), ("help",), ("call", "--help"), ("help", "stats")])
def test_help_has_examples(zelt, arguments):
    assert re.search(r"Examples?:\n  zelt ", zelt(*arguments))


def test_version(zelt):
    assert re.fullmatch(r"zelt \d+\.\d+\.\d+\n", zelt("--version"))
