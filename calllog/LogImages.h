#pragma once
// The small images of the call log, drawn in code so they scale with nothing and ship with
// nothing: 0 incoming call, 1 outgoing call, 2 message on the answering machine (16×16 each).

#include <QList>
#include <QPixmap>

namespace orvanta::logimages {

enum Image { Incoming = 0, Outgoing = 1, AnsweringMachine = 2 };

[[nodiscard]] QPixmap image(Image which);
// The three in the order above: the list's EAImages.
[[nodiscard]] QList<QPixmap> eaImages();

} // namespace orvanta::logimages
