// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QLabel>
#include <QString>

namespace orvane::desktop {

/// One line of plain text that gives way: what has no room is left out in the middle, and is whole
/// in the tool tip and for those who hear it.
class ElidedLabel final : public QLabel {
public:
    explicit ElidedLabel(QWidget* parent = nullptr);

    void setFullText(const QString& text);
    const QString& fullText() const { return fullText_; }

    QSize minimumSizeHint() const override;
    QSize sizeHint() const override;

protected:
    void resizeEvent(QResizeEvent* event) override;
    void changeEvent(QEvent* event) override;

private:
    void fit();

    QString fullText_;
};

}  // namespace orvane::desktop
