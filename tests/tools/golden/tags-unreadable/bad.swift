aÿ
