#pragma once

namespace pelliko::server
{

/// What is behind the card, which browsers also paint their own bars with.
inline constexpr const char *paperInLight = "#f3f5fa";
inline constexpr const char *paperInDark = "#12161f";

/// The one style sheet of all pages; it is inlined, and allowed by its hash. Colours and forms are
/// those of the application. Sizes go by the reader's own size of text, but for the discs of the
/// icons. The see-through borders show where the reader's colours replace all of ours.
inline constexpr const char *pageStyle = R"css(
:root{color-scheme:light dark;--paper:#f3f5fa;--card:#fff;--ink:#1b1f2a;--soft:#545c6b;--line:#e3e7ef;--accent:#2f5bea;--pressed:#2245bb;--on-accent:#fff;--tint:#e6ebf7;--on-tint:#1f2f66}
@media (prefers-color-scheme:dark){:root{--paper:#12161f;--card:#1d2230;--ink:#eef1f8;--soft:#b3bccd;--line:#3a4254;--accent:#94abff;--pressed:#7f98f2;--on-accent:#0d1a44;--tint:#363f56;--on-tint:#e1e8ff}}
*{box-sizing:border-box}
html{-webkit-text-size-adjust:100%;text-size-adjust:100%}
body{margin:0;background:var(--paper);color:var(--ink);font:106.25%/1.5 "Noto Sans",system-ui,-apple-system,"Segoe UI",Roboto,sans-serif;overflow-wrap:anywhere}
main{max-width:36rem;margin:0 auto;padding:1.25rem 1rem 2.5rem}
svg{flex:none;fill:none;stroke:currentColor;stroke-width:2;stroke-linecap:round;stroke-linejoin:round}
:lang(ja){word-break:auto-phrase}
h1{margin:0 0 .4rem;font-size:1.35rem;line-height:1.3;text-wrap:balance}
p{margin:.2rem 0}
.brand{display:flex;gap:.6rem;align-items:center;margin:0 .25rem .9rem;color:var(--soft);font-weight:600}
.brand svg{width:1.75rem;height:1.75rem;stroke:none}
.card{background:var(--card);border:1px solid var(--line);border-radius:24px;padding:1.4rem 1.25rem}
.soft{color:var(--soft);font-size:.95rem}
.disc{display:flex;flex:none;align-items:center;justify-content:center;width:40px;height:40px;border:1px solid transparent;border-radius:20px;background:var(--tint);color:var(--on-tint)}
.disc svg{width:22px;height:22px}
.state{width:56px;height:56px;border-radius:28px;margin-bottom:1rem}
.state svg{width:30px;height:30px}
.text{margin:.9rem 0;padding:.9rem 1rem;border:1px solid var(--line);border-radius:14px;background:var(--paper);white-space:pre-wrap;unicode-bidi:plaintext}
.button{display:flex;gap:.6rem;align-items:center;justify-content:center;min-height:48px;margin:1.2rem 0 .3rem;padding:.7rem 1.2rem;border:2px solid transparent;border-radius:27px;background:var(--accent);color:var(--on-accent);font-weight:600;text-align:center;text-decoration:none}
.button span{min-width:0;text-wrap:balance}
.button bdi{white-space:nowrap}
.button svg{width:22px;height:22px}
.button:hover,.button:active{background:var(--pressed)}
a:focus-visible{outline:3px solid var(--accent);outline-offset:3px}
ul{list-style:none;margin:1rem 0 0;padding:0}
li{border-top:1px solid var(--line)}
li>*{display:flex;gap:.8rem;align-items:center;min-height:56px;padding:.6rem .1rem;border-radius:10px;color:inherit;text-decoration:none}
li a:hover .name,li a:active .name{text-decoration:underline}
.file{flex:1;min-width:0}
.name{display:block;color:var(--accent);font-weight:500;line-height:1.35}
.kind,.size{color:var(--soft);font-size:.9rem}
.kind::after{content:" \b7  "}
.lost .name{color:var(--soft)}
.lost .disc{border-color:var(--line);background:none;color:var(--soft)}
.get{display:flex;color:var(--accent)}
.get svg{width:22px;height:22px}
@media (max-width:22.5rem){main{padding:1rem 10px 2rem}.card{padding:1.2rem 16px}.button{gap:10px;padding:.7rem 12px}li>*{gap:12px}}
@media (prefers-reduced-motion:no-preference){.button{transition:background-color .15s}}
@media (forced-colors:active){.button{border-color:LinkText}.disc{border-color:CanvasText}}
@media print{:root{color-scheme:light;--paper:#fff;--card:#fff;--ink:#000;--soft:#333;--line:#888;--accent:#000;--tint:#fff;--on-tint:#000}main{max-width:none;padding:0}.card{border:0;padding:0}.button,.get{display:none}li{break-inside:avoid}}
)css";

} // namespace pelliko::server
