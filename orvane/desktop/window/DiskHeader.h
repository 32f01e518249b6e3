// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/window/ElidedLabel.h"
#include "orvane/desktop/window/SelectionSummary.h"

#include <QAbstractButton>
#include <QIcon>
#include <QWidget>

#include <functional>
#include <string>
#include <vector>

namespace orvane::desktop {

/// How full a volume is.
class SpaceBar final : public QWidget {
public:
    explicit SpaceBar(QWidget* parent);

    void show(const pellar::SpaceUse& use, const QString& text);

protected:
    void paintEvent(QPaintEvent* event) override;

private:
    double share_ = 0;
};

/// The volumes of a disk side by side, as wide as they are large; each can be pressed.
class PartitionBar final : public QWidget {
public:
    explicit PartitionBar(QWidget* parent);

    void show(const std::vector<PartitionShare>& partitions);
    void setChosen(std::function<void(const std::string& identifier)> chosen)
    {
        chosen_ = std::move(chosen);
    }

protected:
    void resizeEvent(QResizeEvent* event) override;

private:
    class Part;

    void place();

    std::vector<Part*> parts_;
    std::function<void(const std::string& identifier)> chosen_;
};

/// What is selected, at a glance: its name, what it is, how full, and how it is. Main thread.
class DiskHeader final : public QWidget {
public:
    explicit DiskHeader(QWidget* parent = nullptr);

    void show(const SelectionSummary& summary, const QIcon& icon);
    /// A partition in the bar was pressed.
    void setChosen(std::function<void(const std::string& identifier)> chosen)
    {
        partitions_->setChosen(std::move(chosen));
    }
    /// Where there is little room: the name and the state alone.
    void setCompact(bool isCompact);

protected:
    void changeEvent(QEvent* event) override;

private:
    void adoptFont();
    void adoptRoom();

    QLabel* icon_;
    ElidedLabel* title_;
    QLabel* stateIcon_;
    ElidedLabel* state_;
    ElidedLabel* facts_;
    QWidget* use_;
    SpaceBar* space_;
    QLabel* spaceText_;
    PartitionBar* partitions_;
    QLabel* warning_;
    QIcon diskIcon_;
    SelectionSummary shown_;
    bool isCompact_ = false;
};

}  // namespace orvane::desktop
