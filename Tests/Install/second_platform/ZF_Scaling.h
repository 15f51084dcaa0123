#ifndef SECOND_ZF_SCALING_H
#define SECOND_ZF_SCALING_H

class ZF_Scaling {
public:
    virtual ~ZF_Scaling() = default;
    double getLsb() { return 1.0; }
    double getOffset() { return 0.0; }
};

#endif
