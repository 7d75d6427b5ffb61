#pragma once

namespace pelliko::server
{

/// The one style sheet of all pages; it is inlined, and allowed by its hash.
inline constexpr const char *pageStyle = R"css(
:root{color-scheme:light dark;--paper:#f4f5f7;--card:#fff;--ink:#1c2430;--soft:#5b6675;--line:#e1e5ea;--accent:#0b63ce;--on-accent:#fff}
@media (prefers-color-scheme:dark){:root{--paper:#12161c;--card:#1b222b;--ink:#e8ecf1;--soft:#9fabb9;--line:#2c3642;--accent:#7fb4ff;--on-accent:#0b1a2e}}
*{box-sizing:border-box}
body{margin:0;background:var(--paper);color:var(--ink);font:17px/1.45 system-ui,-apple-system,"Segoe UI",Roboto,"Noto Sans",sans-serif;-webkit-text-size-adjust:100%}
main{max-width:34rem;margin:0 auto;padding:1.5rem 1rem 2.5rem}
.brand{margin:0 0 1rem;color:var(--soft);font-size:.85rem;letter-spacing:.04em;text-transform:uppercase}
.card{background:var(--card);border:1px solid var(--line);border-radius:14px;padding:1.25rem 1.1rem}
h1{margin:0 0 .35rem;font-size:1.35rem;line-height:1.25;overflow-wrap:anywhere}
p{margin:.25rem 0}
.soft{color:var(--soft);font-size:.95rem}
.button{display:block;margin:1.1rem 0 .4rem;padding:.8rem 1rem;border-radius:10px;background:var(--accent);color:var(--on-accent);font-weight:600;text-align:center;text-decoration:none}
a:focus-visible{outline:3px solid var(--accent);outline-offset:3px}
ul{list-style:none;margin:.9rem 0 0;padding:0}
li{border-top:1px solid var(--line)}
li a{display:flex;gap:.8rem;align-items:baseline;justify-content:space-between;min-height:48px;padding:.75rem .1rem;color:inherit;text-decoration:none}
li a:hover .name{text-decoration:underline}
.name{min-width:0;overflow-wrap:anywhere;color:var(--accent)}
.size{flex:none;color:var(--soft);font-size:.9rem;white-space:nowrap}
)css";

} // namespace pelliko::server
