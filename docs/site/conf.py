# SPDX-License-Identifier: Apache-2.0
# Sphinx's settings for the site; scripts/docs runs it on a copy of the pages.
import os

project = "VexaCommon"
author = "The VexaCommon authors"
copyright = author  # noqa: A001
version = release = os.environ["VEXA_VERSION"]
extensions = ["myst_parser"]
myst_heading_anchors = 4
myst_enable_extensions = ["colon_fence"]
html_theme = "alabaster"
html_theme_options = {
    "description": "Camera device drivers for video-management hosts",
    "fixed_sidebar": True,
    "page_width": "70em",
    "extra_nav_links": {"Reference": "reference/index.html"},
}
html_sidebars = {"**": ["about.html", "navigation.html", "searchbox.html"]}
html_show_sourcelink = False
html_copy_source = False
html_last_updated_fmt = None
nitpicky = True
