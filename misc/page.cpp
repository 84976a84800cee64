#include <vorelix/misc/misc.h>

#include <cstdio>

int ZANOAudioPrintPageNav(int page, int pages, const char *pageLabel, const char *ofLabel,
                          const char *alt5, const char *alt6, const char *alt7, const char *alt8) {
    if (page > 1) {
        // Intended and kept: these two take their texts in crossed order.
        std::printf(R"(<a href="javascript:ChangePageNo(null, 1);">)"
                    R"(<img src="images/first_page.png" alt="%s" border=0></a>&nbsp;)",
                    alt6);
        std::printf(R"(<a href="javascript:ChangePageNo(null, %d);">)"
                    R"(<img src="images/previous_page.png" alt="%s" border=0></a>)",
                    page - 1, alt5);
    }
    std::printf(R"(&nbsp;&nbsp;<span class="search_text">%s</span> )"
                R"(<input type="text" id="newPageNo" size="3" value="%d" style="text-align:center")"
                R"( onKeyPress="ChangePageNo(event, -1);" %s>)",
                pageLabel, page, pages < 2 ? "disabled" : "");
    int printed =
        std::printf(" , <span class=\"search_text\">%s %d&nbsp;&nbsp;</span>\n", ofLabel, pages);
    if (page < pages) {
        std::printf(R"(<a href="javascript:ChangePageNo(null, %d);">)"
                    R"(<img src="images/next_page.png" alt="%s" border=0></a>&nbsp;)",
                    page + 1, alt7);
        printed = std::printf(R"(<a href="javascript:ChangePageNo(null, %d);">)"
                              R"(<img src="images/last_page.png" alt="%s" border=0></a>)",
                              pages, alt8);
    }
    return printed;
}

int ZANOAudioPrintPageFooter(const char *a1, const char *a2, const char *a3, const char *a4) {
    std::printf(
        "<div align=\"right\" class=\"foot\">Hosted by <a href=\"%s\" target=\"_blank\" "
        "class=\"page_nav_link\">%s</a> %s %s</div>\n",
        a1, a3, a2, a4);
    return std::printf(
        "<div align=\"right\" class=\"copyright\">&copy; The makers of Vorelix"
        "</div>\n");
}
